#pragma once

#include "QuorixPreferences/IHostPaths.h"

#include <string>

namespace QuorixHost {

/// The host's numbered folders, below one folder of its own, and its features.
///
/// Threads: [gui].
class VHostFolders : public IHostPaths
{
public:
    /// Makes the folder and the numbered ones in it.
    ///
    /// Throws std::runtime_error where they cannot be made or written to.
    explicit VHostFolders(const std::string& folder);

    /// Returns "" for a number that has no folder here.
    std::string GetFolder(int number) override;

    /// Returns all of the features whose folders are kept among the preferences.
    std::set<int> GetFeatures() override;

private:
    const std::string parent;
};

/// Returns where the files of a host lie to which no folder is given: with the user's other data,
/// or nowhere ("") for a user without a home.
std::string DefaultDataFolder();

} // namespace QuorixHost
