#include "QuorixPreferences/FolderTable.h"

#include "QuorixPreferences/IHostPaths.h"

#include <set>

namespace {

struct VRow
{
    int Feature;
    const char* DisplayName;
    const char* Key;
    int DefaultFolder;
};

// Deliberate: the two folders of props have one display name, by which users know both.
constexpr VRow rows[] = {
    {1, "Subjects", "FolderSubjects", HostFolder::Subjects},
    {1, "Model Templates", "FolderSubjectCalTemplates", HostFolder::SubjectCalTemplates},
    {1, "Skins", "FolderSkins", HostFolder::Skins},
    {2, "Props", "FolderProps", HostFolder::Props},
    {2, "Props", "FolderPropMeshes", HostFolder::PropMeshes},
    {3, "Labeling Clusters", "FolderClusters", HostFolder::Clusters},
    {4, "Objects", "FolderObjects", HostFolder::Objects},
};

} // namespace

std::vector<VFolderRow> MakeFolderTable(IHostPaths& hostPaths)
{
    const std::set<int> features = hostPaths.GetFeatures();
    std::vector<VFolderRow> table;
    for (const VRow& row : rows) {
        if (features.count(row.Feature) != 0) {
            table.push_back({row.DisplayName, row.Key, hostPaths.GetFolder(row.DefaultFolder)});
        }
    }
    return table;
}
