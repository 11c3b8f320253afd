#include "ConfigurationFile.h"
#include "DocumentEdit.h"
#include "ICommand.h"
#include "ItemText.h"
#include "QuorixDataStore/DataStoreFileFormat.h"
#include "UtilsFileSystem/ReadFile.h"
#include "UtilsFileSystem/ReplaceFile.h"
#include "Variant/Interning.h"
#include "io/SchemaText.h"
#include "io/ValueText.h"
#include "io/Values.h"

#include <CLI/CLI.hpp>

#include <cstring>
#include <filesystem>
#include <optional>
#include <ostream>
#include <sys/stat.h>

namespace QuorixConfig {

namespace {

using namespace DataStoreFileFormat;

/// Changes one value of a file.
///
/// The file is edited and not written anew, and what the edit has led to is loaded and compared
/// with what was meant before anything is written.
class VSetCommand : public ICommand
{
public:
    CLI::App* Declare(CLI::App& application) override
    {
        CLI::App* command = application.add_subcommand(
            "set", "Changes the value of an item; the file so far is kept as FILE.bak");
        command->add_option("FILE", path, "The file; it must load without an error")->required();
        command->add_option("PATH", itemPath, "The item's data path, with dots")->required();
        command->add_option("TEXT", text, "The value as it stands in a file, a text in quotes")
            ->required();
        command->add_flag("--verified", toVerified,
                          "The verified value, also where there is a proposed one");
        command->add_flag("--raw", raw, "TEXT is a text without quotes and escapes");
        command->add_option("--format", format, "Adds the item, of this format, if it is missing");
        return command;
    }

    int Run(std::ostream&, std::ostream& errors) override
    {
        const std::string reason = Change(errors);
        if (!reason.empty()) {
            errors << path << ": error: " << Printable(reason) << '\n';
            return failed;
        }
        return done;
    }

private:
    /// @return what is wrong, empty if nothing is
    std::string Change(std::ostream& errors)
    {
        VConfigurationFile file;
        if (!LoadForUse(path, file, errors)) {
            return "Nothing is written, since the file has errors";
        }
        const std::optional<std::string> before = UtilsFileSystem::ReadFile(path, greatestFile);
        if (!before) {
            return "The file cannot be read";
        }
        const VItem* item = file.Find(itemPath);
        VDataValue value;
        std::string reason = MakeValue(item, value);
        if (!reason.empty()) {
            return reason;
        }
        VDocumentEdit edit(*before);
        Apply(edit, item, value);
        const std::string after = edit.Print();
        if (!IsAsMeant(file, LoadText(after), value)) {
            return "Nothing is written, since the file cannot be written anew without a loss";
        }
        return Replace(*before, after);
    }

    std::string MakeValue(const VItem* item, VDataValue& value) const
    {
        if (item != nullptr) {
            value.Schema = item->Schema;
        } else if (format.empty()) {
            return "There is no item " + itemPath + " (--format adds one)";
        } else if (!KVR::IO::ParseSchemaText(value, format.c_str())) {
            return "This is no format: " + format;
        } else if (VDataPath(itemPath).Count() < 2 || VDataPath(itemPath).HasWildcard()) {
            return "No item can be at " + itemPath;
        }
        if (raw) {
            return MakeRawValue(value);
        }
        const char* position = text.data();
        const char* const end = position + text.size();
        const bool read = KVR::IO::TextToBinary(position, end, *value.EffectiveSchema(),
                                                value.Bytes, KVR::IO::SchemaTextModeNamed);
        if (!read || value.Empty() || position != end) {
            return "This is no value of the item's format: " + text;
        }
        return std::string();
    }

    std::string MakeRawValue(VDataValue& value) const
    {
        if (value.EffectiveSchema()->Type != KVR::IO::EType::String) {
            return "Only a text may be given with --raw";
        }
        value.Bytes = MakeStringValue(text).Bytes;
        return std::string();
    }

    bool GoesToProposed(const VItem* item) const
    {
        return item != nullptr && !item->Proposed.Empty() && !toVerified;
    }

    void Apply(VDocumentEdit& edit, const VItem* item, const VDataValue& value) const
    {
        const std::string valueText = ValueText(value);
        if (item == nullptr) {
            VItem added;
            added.Schema = value.EffectiveSchema();
            edit.AppendItem(VDataPath(itemPath), FormatText(added), valueText);
        } else {
            edit.SetAttribute(itemPath, GoesToProposed(item) ? Proposed.Name : Verified.Name,
                              valueText);
        }
    }

    /// Whether nothing but the one value has changed. A real number that was given may lose its
    /// last digit in a file, as any does; that it is there is all that can be asked.
    bool IsAsMeant(const VConfigurationFile& before, const VConfigurationFile& after,
                   const VDataValue& value) const
    {
        const VItem* now = after.Find(itemPath);
        if (!after.Errors.empty() || after.Warnings != before.Warnings || now == nullptr) {
            return false;
        }
        std::map<VDataPath, VItem> expected = before.Items;
        for (auto& [itemKey, item] : expected) {
            if (itemKey.Text() == itemPath) {
                (GoesToProposed(&item) ? item.Proposed : item.Verified) = Written(value);
            }
        }
        if (before.Find(itemPath) == nullptr) {
            VItem added;
            added.Schema = value.EffectiveSchema();
            added.Verified = Written(value);
            expected.emplace(VDataPath(itemPath), added);
        }
        return expected == after.Items;
    }

    /// Returns the value as it reads back.
    static VDataValue Written(const VDataValue& value)
    {
        const std::string valueText = ValueText(value);
        VDataValue written{value.EffectiveSchema(), {}};
        const char* position = valueText.data();
        // What does not read back is found to differ.
        static_cast<void>(KVR::IO::TextToBinary(position, position + valueText.size(),
                                                *written.Schema, written.Bytes,
                                                KVR::IO::SchemaTextModeNamed));
        return written;
    }

    std::string Replace(const std::string& before, const std::string& after) const
    {
        const std::string backup = path + ".bak";
        struct stat status
        {
        };
        if (stat(path.c_str(), &status) != 0) {
            return std::string("The file cannot be read: ") + std::strerror(errno);
        }
        // Nobody may read the copy who may not read the file.
        const mode_t mask = umask(077);
        const bool kept = UtilsFileSystem::ReplaceFile(backup, before) &&
                          chmod(backup.c_str(), status.st_mode & 07777) == 0;
        umask(mask);
        if (!kept) {
            return "Nothing is written, since " + backup + " cannot be written";
        }
        return UtilsFileSystem::ReplaceFile(path, after) ? std::string()
                                                         : "The file cannot be written";
    }

    std::string path;
    std::string itemPath;
    std::string text;
    std::string format;
    bool toVerified = false;
    bool raw = false;
};

} // namespace

std::unique_ptr<ICommand> MakeSetCommand()
{
    return std::make_unique<VSetCommand>();
}

} // namespace QuorixConfig
