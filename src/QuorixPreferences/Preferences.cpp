#include "QuorixPreferences/Preferences.h"

#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataStoreFileIO.h"
#include "QuorixDataStore/DataStorePersistence.h"
#include "QuorixDataStore/DataVerifyReader.h"
#include "QuorixDataStore/DataVerifyWriter.h"
#include "QuorixPreferences/ConfigurationDocument.h"
#include "QuorixPreferences/FolderTable.h"
#include "QuorixPreferences/IHostPaths.h"
#include "QuorixPreferences/LegacyAltToSelect.h"
#include "QuorixPreferences/PreferenceFolders.h"
#include "QuorixPreferences/WellKnownPaths.h"
#include "UtilsFileSystem/FileSystem.h"
#include "UtilsFileSystem/ReplaceFile.h"
#include "utils/LogStatement.h"

#include <optional>
#include <vector>

namespace {

const char* const systemFile = "System.Prefs";
const char* const userFile = "User.Prefs";

/// Loads a preference file if it is there.
///
/// @return whether it was read, whatever was wrong in it
bool LoadFile(IDataStore& store, const std::string& folder, const char* name,
              VConfigurationDocument& document)
{
    if (folder.empty()) {
        return false;
    }
    const boost::filesystem::path path = boost::filesystem::path(folder) / name;
    if (!UtilsFileSystem::FileExists(path)) {
        return false;
    }
    KVR_LOG("Config", 4, "Loading preferences %1%", path.string());
    if (!document.Read(path, GreatestPreferenceFile)) {
        KVR_LOG("Config", 2, "Error loading preferences %1%, failed parsing xml file contents.",
                path.string());
        return false;
    }
    VDataVerifyWriter writer(store);
    // Its messages are logged, and what could be read is good all the same.
    static_cast<void>(DataStoreFileIO::ReadConfiguration(document.Get(), writer));
    return true;
}

void CheckSharedDataFolder(IDataStore& store, const std::string& otherwise)
{
    const std::string folder = GetSystemFolder(store, PreferenceKey::SharedDataFolder);
    if (!UtilsFileSystem::FolderExists(folder)) {
        KVR_LOG("Preferences", 2, "Shared data root folder '%1%' not accessible.", folder);
        KVR_LOG("Preferences", 2, "Using default folder for Shared data: '%1%'.", otherwise);
        SetSystemFolder(store, PreferenceKey::SharedDataFolder, otherwise);
    }
}

void CheckUserDataFolder(IDataStore& store, const std::string& otherwise)
{
    const std::string folder = GetSystemFolder(store, PreferenceKey::UserDataFolder);
    if (!UtilsFileSystem::FolderExists(folder)) {
        KVR_LOG("Preferences", 2, "User data root folder '%1%' not accessible.", folder);
        KVR_LOG("Preferences", 2, "Using default folder for User data: '%1%'.", otherwise);
        SetSystemFolder(store, PreferenceKey::UserDataFolder, otherwise);
    }
}

void CheckCaptureFolder(IDataStore& store, IHostPaths& hostPaths)
{
    const std::string folder = GetCaptureFolder(store);
    if (!folder.empty()) {
        UtilsFileSystem::EnsureFolder(folder);
    }
    if (!UtilsFileSystem::FolderExists(folder)) {
        KVR_LOG("Preferences", 2, "Capture folder '%1%' not accessible.", folder);
        const std::string otherwise = hostPaths.GetFolder(HostFolder::Capture);
        KVR_LOG("Preferences", 2, "Using default folder: '%1%'.", otherwise);
        SetCaptureFolder(store, otherwise);
    }
}

void CheckUserFolder(IDataStore& store, const VFolderRow& row)
{
    const std::string folder = GetUserFolder(store, row.Key);
    if (!UtilsFileSystem::FolderExists(folder)) {
        KVR_LOG("Preferences", 2, "%1% folder '%2%' not accessible.", row.DisplayName, folder);
        KVR_LOG("Preferences", 2, "Using default folder for %1%: '%2%'.", row.DisplayName,
                row.Default);
        SetUserFolder(store, row.Key, row.Default);
    }
}

void LoadSystemPreferences(IDataStore& store, IHostPaths& hostPaths)
{
    const std::string sharedData = hostPaths.GetFolder(HostFolder::SharedData);
    const std::string userData = hostPaths.GetFolder(HostFolder::UserData);
    SetSystemFolder(store, PreferenceKey::SharedDataFolder, sharedData);
    SetSystemFolder(store, PreferenceKey::UserDataFolder, userData);
    SetCaptureFolder(store, hostPaths.GetFolder(HostFolder::Capture));

    VConfigurationDocument document;
    if (!LoadFile(store, hostPaths.GetFolder(HostFolder::SystemPreferences), systemFile,
                  document)) {
        return; // the defaults stand unchecked
    }
    CheckSharedDataFolder(store, sharedData);
    CheckUserDataFolder(store, userData);
    CheckCaptureFolder(store, hostPaths);
}

void LoadUserPreferences(IDataStore& store, IHostPaths& hostPaths)
{
    const std::vector<VFolderRow> table = MakeFolderTable(hostPaths);
    for (const VFolderRow& row : table) {
        SetUserFolder(store, row.Key, row.Default);
    }
    SetBool(store, PreferenceKey::AltToSelect, true);

    VConfigurationDocument document;
    if (!LoadFile(store, hostPaths.GetFolder(HostFolder::UserPreferences), userFile, document)) {
        return; // the defaults stand unchecked
    }
    if (const std::optional<bool> legacy = FindLegacyAltToSelect(document.Get())) {
        SetBool(store, PreferenceKey::AltToSelect, *legacy);
    }
    for (const VFolderRow& row : table) {
        CheckUserFolder(store, row);
    }
}

/// Writes a sub-tree of the store, and nothing else of it, to a preference file.
void SaveFile(IDataStore& store, const VDataPath& content, const std::string& folder,
              const char* name)
{
    if (folder.empty()) {
        return;
    }
    VDataStore scratch;
    {
        const VDataVerifyReader reader(store);
        VDataVerifyWriter writer(scratch);
        // What could not be copied is logged, and the rest is worth a file.
        static_cast<void>(DataStorePersistence::CopyValues(VDataPath(content, "*"), reader, writer,
                                                           EDataCopyOptions::SkipReadOnly |
                                                               EDataCopyOptions::CopyAll));
    }
    rapidxml::xml_document<char> document;
    {
        const VDataVerifyReader reader(scratch);
        static_cast<void>(DataStoreFileIO::WriteConfiguration(reader, document)); // likewise
    }
    const std::string text = PrintDocument(document);
    if (text.size() > GreatestPreferenceFile) {
        return; // it would not be read again, and the old file is worth more than none
    }
    // A file that cannot be written stays as it was; nobody is told.
    static_cast<void>(UtilsFileSystem::ReplaceFile(boost::filesystem::path(folder) / name, text));
}

} // namespace

void LoadPreferences(IDataStore& store, IHostPaths& hostPaths)
{
    LoadSystemPreferences(store, hostPaths);
    LoadUserPreferences(store, hostPaths);
}

void SavePreferences(IDataStore& store, IHostPaths& hostPaths)
{
    SaveFile(store, WellKnownPaths::SystemPreferences(),
             hostPaths.GetFolder(HostFolder::SystemPreferences), systemFile);
    SaveFile(store, WellKnownPaths::UserPreferences(),
             hostPaths.GetFolder(HostFolder::UserPreferences), userFile);
}
