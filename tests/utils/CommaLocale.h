#pragma once

#include <unistd.h>

#include <clocale>
#include <cstdlib>
#include <filesystem>
#include <string>

/// Gives the process a C locale with a decimal comma for its own lifetime, as a user's desktop
/// may. It is compiled on the spot where the machine has none installed.
class VCommaLocale
{
public:
    VCommaLocale()
        : previous(std::setlocale(LC_ALL, nullptr)),
          folder(std::filesystem::temp_directory_path() /
                 ("quorix-locale-" + std::to_string(getpid())))
    {
        if (!IsSet("de_DE.UTF-8")) {
            std::filesystem::create_directories(folder);
            const std::string command = "localedef -i de_DE -f UTF-8 '" +
                                        (folder / "de_DE.UTF-8").string() + "' 2>/dev/null";
            (void)!std::system(command.c_str()); // its failure shows in the next line
            setenv("LOCPATH", folder.c_str(), 1);
            (void)IsSet("de_DE.UTF-8");
        }
    }

    ~VCommaLocale()
    {
        std::setlocale(LC_ALL, previous.c_str());
        unsetenv("LOCPATH");
        std::error_code ignored; // a folder left behind in the temporary folder harms nobody
        std::filesystem::remove_all(folder, ignored);
    }

    VCommaLocale(const VCommaLocale&) = delete;
    VCommaLocale& operator=(const VCommaLocale&) = delete;

    /// Tells whether the locale is in force; a machine without the sources of locales has none.
    bool IsInForce() const { return std::string(std::localeconv()->decimal_point) == ","; }

private:
    bool IsSet(const char* name) const { return std::setlocale(LC_ALL, name) != nullptr; }

    const std::string previous;
    const std::filesystem::path folder;
};
