#pragma once

#include <cstdlib>
#include <filesystem>
#include <string>

#include <unistd.h>

namespace veltrane::tools
{

// The plug-in reads and writes the user's preferences (window size, MIDI bindings)
// when an instance opens and closes. The tools run instances of their own, so they
// point HOME and the XDG user folders at a private temporary folder for their whole
// run and leave the user's files alone.
class PrivateHome
{
public:
    PrivateHome()
    {
        std::string pattern = (std::filesystem::temp_directory_path() / "veltrane-tool-XXXXXX").string();

        if (::mkdtemp (pattern.data()) == nullptr)
            return;

        folder = pattern;
        ::setenv ("HOME", folder.c_str(), 1);
        ::setenv ("XDG_CONFIG_HOME", (folder + "/.config").c_str(), 1);
        ::setenv ("XDG_DATA_HOME", (folder + "/.local/share").c_str(), 1);
        ::setenv ("XDG_CACHE_HOME", (folder + "/.cache").c_str(), 1);
    }

    ~PrivateHome()
    {
        std::error_code ignored;
        if (! folder.empty())
            std::filesystem::remove_all (folder, ignored);
    }

    PrivateHome (const PrivateHome&) = delete;
    PrivateHome& operator= (const PrivateHome&) = delete;

private:
    std::string folder;
};

} // namespace veltrane::tools
