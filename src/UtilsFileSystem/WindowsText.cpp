#include "UtilsFileSystem/WindowsText.h"

#include <algorithm>

namespace UtilsFileSystem {

namespace {

constexpr char suffix[] = "64Bit";

bool IsSeparator(char character)
{
    return character == '\\' || character == '/';
}

struct VWindowsRow
{
    unsigned Major;
    unsigned Minor;
    const char* Workstation;
    const char* Server;
};

// Later versions report themselves as the last row or as one that is not here; the name goes into
// logs only.
constexpr VWindowsRow windowsRows[] = {
    {5, 0, "Windows 2000", "Windows 2000"},
    {5, 1, "Windows XP", "Windows XP"},
    {5, 2, "Windows Server 2003", "Windows Server 2003"},
    {6, 0, "Windows Vista", "Windows Server 2008"},
    {6, 1, "Windows 7", "Windows Server 2008 R2"},
    {6, 2, "Windows 8", "Windows Server 2012"},
};

} // namespace

bool IsRelativePath(const std::string& text)
{
    if (text.size() < 2) {
        return true;
    }
    if (IsSeparator(text[0])) {
        return text[1] != '?' && !IsSeparator(text[1]);
    }
    return text.size() < 3 || text[1] != ':' || !IsSeparator(text[2]);
}

std::string MakeLongPathText(const std::string& text)
{
    if (IsRelativePath(text)) {
        return text;
    }
    std::string path = text;
    std::replace(path.begin(), path.end(), '/', '\\');
    if (path.compare(0, 2, R"(\\)") == 0) {
        return R"(\\?\UNC)" + path.substr(1); // the backslash that is left is the separator
    }
    return R"(\\?\)" + path;
}

std::string GetWindowsName(const VWindowsVersion* version)
{
    if (version == nullptr) {
        return std::string("Pre-Windows 2000 ") + suffix;
    }
    const char* name = "Unknown Windows Version";
    for (const VWindowsRow& row : windowsRows) {
        if (row.Major == version->Major && row.Minor == version->Minor) {
            name = version->Workstation ? row.Workstation : row.Server;
        }
    }
    return std::string(name) + " " + suffix;
}

} // namespace UtilsFileSystem
