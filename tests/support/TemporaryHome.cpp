#include "TemporaryHome.h"

#include <cstdlib>
#include <filesystem>
#include <stdexcept>

namespace veltrane::test
{

namespace
{
    std::string makeFolder()
    {
        std::string pattern = (std::filesystem::temp_directory_path() / "veltrane-test-home-XXXXXX").string();

        if (::mkdtemp (pattern.data()) == nullptr)
            throw std::runtime_error ("cannot create a temporary home folder");

        return pattern;
    }

    void pointUserFoldersAt (const std::string& folder)
    {
        ::setenv ("HOME", folder.c_str(), 1);
        ::setenv ("XDG_CONFIG_HOME", (folder + "/.config").c_str(), 1);
        ::setenv ("XDG_DATA_HOME", (folder + "/.local/share").c_str(), 1);
        ::setenv ("XDG_CACHE_HOME", (folder + "/.cache").c_str(), 1);
    }
}

TemporaryHome::TemporaryHome()
    : folder (makeFolder())
{
    if (const auto* home = std::getenv ("HOME"))
        previousHome = home;

    pointUserFoldersAt (folder);
}

TemporaryHome::~TemporaryHome()
{
    std::error_code ignored;
    std::filesystem::remove_all (folder, ignored);
    pointUserFoldersAt (previousHome);
}

void isolateHomeForProcess()
{
    static const std::string folder = makeFolder();
    pointUserFoldersAt (folder);
}

} // namespace veltrane::test
