#pragma once

#include <string>

namespace veltrane::test
{

// Points HOME and the XDG user folders at a fresh empty folder for its lifetime,
// so presets and preferences written by the code under test land there.
class TemporaryHome
{
public:
    TemporaryHome();
    ~TemporaryHome();

    const std::string& path() const noexcept { return folder; }

    TemporaryHome (const TemporaryHome&) = delete;
    TemporaryHome& operator= (const TemporaryHome&) = delete;

private:
    std::string folder;
    std::string previousHome;
};

// Makes the process-wide HOME a temporary folder; called once before any test.
void isolateHomeForProcess();

} // namespace veltrane::test
