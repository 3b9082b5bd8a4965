#pragma once

#include "../../tools/common/PrivateHome.h"

namespace veltrane::test
{
// A fresh empty HOME for the lifetime of a test: what the code under test writes lands there.
using TemporaryHome = tools::PrivateHome;
}
