#include "HostFolders.h"

#include <cstdlib>
#include <filesystem>
#include <stdexcept>
#include <unistd.h>

namespace QuorixHost {
namespace {

struct VNumberedFolder
{
    int number;
    const char* name;
};

constexpr VNumberedFolder numberedFolders[] = {
    {HostFolder::UserData, "UserData"},
    {HostFolder::SharedData, "SharedData"},
    {HostFolder::Capture, "Capture"},
    {HostFolder::Subjects, "Subjects"},
    {HostFolder::Props, "Props"},
    {HostFolder::PropMeshes, "PropMeshes"},
    {HostFolder::Objects, "Objects"},
    {HostFolder::SubjectCalTemplates, "SubjectCalTemplates"},
    {HostFolder::Skins, "Skins"},
    {HostFolder::Clusters, "Clusters"},
    {HostFolder::SystemPreferences, "System"},
    {HostFolder::UserPreferences, "User"},
};

/// Throws std::runtime_error where the folder cannot be made or written to.
void MakeFolder(const std::filesystem::path& folder)
{
    std::error_code error;
    std::filesystem::create_directories(folder, error);
    if (error || !std::filesystem::is_directory(folder, error) ||
        access(folder.c_str(), W_OK | X_OK) != 0) {
        throw std::runtime_error("the data folder " + folder.string() +
                                 " cannot be made or written to");
    }
}

/// Returns an absolute path from the environment, or "": a relative one is to be ignored.
std::string AbsolutePathFrom(const char* variable)
{
    const char* const value = std::getenv(variable);
    return value != nullptr && value[0] == '/' ? value : std::string();
}

} // namespace

VHostFolders::VHostFolders(const std::string& folder)
    : parent(std::filesystem::absolute(folder).string())
{
    MakeFolder(parent);
    for (const VNumberedFolder& numbered : numberedFolders) {
        MakeFolder(VHostFolders::GetFolder(numbered.number));
    }
}

std::string VHostFolders::GetFolder(int number)
{
    for (const VNumberedFolder& numbered : numberedFolders) {
        if (numbered.number == number) {
            return (std::filesystem::path(parent) / numbered.name).string();
        }
    }
    return std::string();
}

std::set<int> VHostFolders::GetFeatures()
{
    return {1, 2, 3, 4};
}

std::string DefaultDataFolder()
{
    const std::string data = AbsolutePathFrom("XDG_DATA_HOME");
    if (!data.empty()) {
        return data + "/quorix";
    }
    const std::string home = AbsolutePathFrom("HOME");
    return home.empty() ? std::string() : home + "/.local/share/quorix";
}

} // namespace QuorixHost
