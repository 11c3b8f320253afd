#include "QuorixPreferences/PreferenceFolders.h"

#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataWriter.h"
#include "QuorixPreferences/WellKnownPaths.h"
#include "io/Values.h"

namespace {

const char* const captureFolderKey = "Default";

void Write(IDataStore& store, const VDataPath& parent, const std::string& key,
           const VDataValue& value)
{
    const VDataToken token(VDataPath(parent, key));
    VDataWriter writer(store);
    static_cast<void>(writer.SetValue(token, value)); // a key of another type keeps its value
}

std::string ReadFolder(const IDataStore& store, const VDataPath& parent, const std::string& key)
{
    const VDataToken token(VDataPath(parent, key));
    const VDataReader reader(store);
    return ReadString(reader.GetValue(token));
}

} // namespace

void SetSystemFolder(IDataStore& store, const std::string& key, const std::string& folder)
{
    Write(store, WellKnownPaths::SystemPreferences(), key, MakeStringValue(folder));
}

std::string GetSystemFolder(const IDataStore& store, const std::string& key)
{
    return ReadFolder(store, WellKnownPaths::SystemPreferences(), key);
}

void SetUserFolder(IDataStore& store, const std::string& key, const std::string& folder)
{
    Write(store, WellKnownPaths::UserPreferences(), key, MakeStringValue(folder));
}

std::string GetUserFolder(const IDataStore& store, const std::string& key)
{
    return ReadFolder(store, WellKnownPaths::UserPreferences(), key);
}

void SetBool(IDataStore& store, const std::string& key, bool value)
{
    Write(store, WellKnownPaths::UserPreferences(), key, MakeBoolValue(value));
}

void SetCaptureFolder(IDataStore& store, const std::string& folder)
{
    Write(store, WellKnownPaths::CaptureFolder(), captureFolderKey, MakeStringValue(folder));
}

std::string GetCaptureFolder(const IDataStore& store)
{
    return ReadFolder(store, WellKnownPaths::CaptureFolder(), captureFolderKey);
}
