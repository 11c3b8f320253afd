#pragma once

#include <set>
#include <string>

/// Where the host keeps its files on this machine, and what it can do. Supplied by the host.
class IHostPaths
{
public:
    virtual ~IHostPaths() = default;

    /// Returns the path of a numbered folder, empty if it has no place on this machine.
    virtual std::string GetFolder(int number) = 0;

    /// Returns the numbers of the features that this host has.
    virtual std::set<int> GetFeatures() = 0;
};

/// The numbers of the host's folders.
namespace HostFolder {

constexpr int UserData = 6;
constexpr int SharedData = 11;
constexpr int Capture = 14;
constexpr int Subjects = 15;
constexpr int Props = 16;
constexpr int PropMeshes = 17;
constexpr int Objects = 18;
constexpr int SubjectCalTemplates = 19;
constexpr int Skins = 20;
constexpr int Clusters = 21;
constexpr int SystemPreferences = 26; ///< the folder of System.Prefs
constexpr int UserPreferences = 27;   ///< the folder of User.Prefs

} // namespace HostFolder
