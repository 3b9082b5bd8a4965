#pragma once

#include <array>
#include <cstdlib>
#include <filesystem>
#include <optional>
#include <string>

#include <unistd.h>

namespace veltrane::tools
{

// Points HOME and the XDG user folders at a fresh temporary folder for its lifetime,
// then puts them back and removes the folder. The plug-in reads and writes the
// user's preferences and presets when an instance opens and closes; the tools and
// tests run instances of their own and must leave the user's files alone.
class PrivateHome
{
public:
    PrivateHome()
    {
        std::string pattern = (std::filesystem::temp_directory_path() / "veltrane-home-XXXXXX").string();

        if (::mkdtemp (pattern.data()) == nullptr)
            return;

        folder = pattern;

        for (size_t i = 0; i < variables.size(); ++i)
        {
            if (const auto* value = std::getenv (variables[i].name))
                previous[i] = value;

            ::setenv (variables[i].name, (folder + variables[i].below).c_str(), 1);
        }
    }

    ~PrivateHome()
    {
        if (folder.empty())
            return;

        for (size_t i = 0; i < variables.size(); ++i)
        {
            if (previous[i])
                ::setenv (variables[i].name, previous[i]->c_str(), 1);
            else
                ::unsetenv (variables[i].name);
        }

        std::error_code ignored;
        std::filesystem::remove_all (folder, ignored);
    }

    const std::string& path() const noexcept { return folder; }

    PrivateHome (const PrivateHome&) = delete;
    PrivateHome& operator= (const PrivateHome&) = delete;

private:
    struct Variable
    {
        const char* name;
        const char* below;   // the folder the variable names, below the private home
    };

    static constexpr std::array<Variable, 4> variables { { { "HOME", "" },
                                                           { "XDG_CONFIG_HOME", "/.config" },
                                                           { "XDG_DATA_HOME", "/.local/share" },
                                                           { "XDG_CACHE_HOME", "/.cache" } } };

    std::string folder;
    std::array<std::optional<std::string>, 4> previous;
};

} // namespace veltrane::tools
