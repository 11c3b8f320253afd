#include "QuorixPreferences/FolderTable.h"

#include "QuorixPreferences/IHostPaths.h"

#include <set>

namespace {

struct VRow
{
    int Feature;
    int DefaultFolder;
    const char* DisplayName;
    const char* Key;
};

// Deliberate: the two folders of props have one display name, by which users know both.
constexpr VRow rows[] = {
    {1, HostFolder::Subjects, "Subjects", "FolderSubjects"},
    {1, HostFolder::SubjectCalTemplates, "Model Templates", "FolderSubjectCalTemplates"},
    {1, HostFolder::Skins, "Skins", "FolderSkins"},
    {2, HostFolder::Props, "Props", "FolderProps"},
    {2, HostFolder::PropMeshes, "Props", "FolderPropMeshes"},
    {3, HostFolder::Clusters, "Labeling Clusters", "FolderClusters"},
    {4, HostFolder::Objects, "Objects", "FolderObjects"},
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
