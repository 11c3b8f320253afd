#pragma once

#include <string>
#include <vector>

class IHostPaths;

/// A folder that the user may set.
struct VFolderRow
{
    std::string DisplayName; ///< for messages
    std::string Key;         ///< under "Preferences", "User"
    std::string Default;     ///< a path
};

/// Returns the rows of the features that the host has, in a fixed order.
std::vector<VFolderRow> MakeFolderTable(IHostPaths& hostPaths);
