#pragma once

#include "../../tools/common/PrivateHome.h"

namespace veltrane::test
{

// A fresh empty HOME for the lifetime of a test, so presets and preferences
// written by the code under test land there.
using TemporaryHome = tools::PrivateHome;

// Makes the process-wide HOME a temporary folder; called once before any test.
inline void isolateHomeForProcess()
{
    static const TemporaryHome home;
}

} // namespace veltrane::test
