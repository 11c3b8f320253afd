#pragma once

#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataVerifyWriter.h"
#include "QuorixPreferences/IHostPaths.h"
#include "QuorixPreferences/PreferenceFolders.h"
#include "QuorixPreferences/Preferences.h"
#include "io/Values.h"
#include "support/LogCapture.h"
#include "support/TemporaryFolder.h"

#include <gmock/gmock.h>

#include <filesystem>
#include <map>
#include <set>
#include <string>
#include <vector>

namespace PreferencesTest {

using Texts = std::vector<std::string>;

/// A host whose numbered folders are named by their numbers, and which remembers what was asked.
class VFakeHostPaths : public IHostPaths
{
public:
    explicit VFakeHostPaths(std::string parent) : parent(std::move(parent)) {}

    std::string GetFolder(int number) override
    {
        Asked.push_back(number);
        const auto other = Others.find(number);
        return other != Others.end() ? other->second : parent + "/" + std::to_string(number);
    }

    std::set<int> GetFeatures() override
    {
        Asked.push_back(0);
        return Features;
    }

    std::map<int, std::string> Others; ///< folders that lie elsewhere, or nowhere
    std::set<int> Features{1, 2, 3, 4};
    std::vector<int> Asked; ///< the folders that were asked for, and 0 for the features

private:
    const std::string parent;
};

/// A store, a host, and folders for its files. None of the other numbered folders exists.
class PreferencesFixture : public testing::Test
{
protected:
    PreferencesFixture()
    {
        std::filesystem::create_directory(folder.Path("26"));
        std::filesystem::create_directory(folder.Path("27"));
    }

    std::string SystemFile() const { return folder.Path("26/System.Prefs"); }
    std::string UserFile() const { return folder.Path("27/User.Prefs"); }

    /// Writes a file with items under "Preferences" and a further node.
    static void WritePreferences(const std::string& path, const std::string& node,
                                 const std::string& items)
    {
        TestSupport::WriteFile(path,
                               "<Configuration version=\"2.0\"><Node name=\"Preferences\"><Node "
                               "name=\"" +
                                   node + "\">" + items + "</Node></Node></Configuration>");
    }

    /// Returns an item that holds a text.
    static std::string StringItem(const std::string& name, const std::string& text)
    {
        return "<Item name=\"" + name + "\" format='{\"Type\":\"String\"}' value-verified='\"" +
               text + "\"'/>";
    }

    void Load() { LoadPreferences(store, host); }

    std::string TextOf(const std::string& path) const
    {
        return ReadString(VDataReader(store).GetValue(VDataToken(VDataPath(path))));
    }

    /// Returns "true" or "false", or what else there is in brackets.
    std::string SwitchOf(const std::string& path) const
    {
        bool value = false;
        if (!ReadValue(VDataReader(store).GetValue(VDataToken(VDataPath(path))), value)) {
            return "(no bool)";
        }
        return value ? "true" : "false";
    }

    bool Exists(const std::string& path) const
    {
        return VDataReader(store).HasValue(VDataToken(VDataPath(path)));
    }

    /// Returns everything logged, each line with its category and level.
    Texts Logged() const
    {
        Texts lines;
        for (const TestSupport::VLoggedMessage& message : log.Messages()) {
            lines.push_back(message.Category + " " + std::to_string(message.Level) + " " +
                            message.Text);
        }
        return lines;
    }

    const TestSupport::VTemporaryFolder folder;
    VFakeHostPaths host{folder.Path()};
    VDataStore store;
    const TestSupport::VLogCapture log;
};

} // namespace PreferencesTest
