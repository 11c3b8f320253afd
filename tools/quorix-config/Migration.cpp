#include "Migration.h"

#include "io/SchemaComparison.h"
#include "io/ValueConversion.h"
#include "io/ValueText.h"

#include <stdexcept>

namespace QuorixConfig {

namespace {

/// True if a file can hold the value: it holds texts.
bool HasText(const VDataValue& value)
{
    std::string text;
    try {
        return KVR::IO::BinaryToText(value.Bytes, *value.EffectiveSchema(), text);
    } catch (const std::runtime_error&) {
        return false; // cut off, which a converted value is not
    }
}

/// Carries one item over, and collects what there is to say of it.
class VItemMigration
{
public:
    VItemMigration(const VDataPath& path, std::vector<VMigrationLine>& lines_)
        : pathText(path.Text()), lines(lines_)
    {
    }

    bool Carry(const VItem& old, const KVR::IO::ISchema& schema, VItem& result)
    {
        if (!Compare(*old.Schema, schema)) {
            return false;
        }
        result.Schema = &schema;
        return CarryValue("proposed", *old.Schema, old.Proposed, schema, result.Proposed) &&
               CarryValue("verified", *old.Schema, old.Verified, schema, result.Verified);
    }

    bool Refuse(const std::string& text)
    {
        lines.push_back({true, pathText + ": " + text});
        return false;
    }

private:
    bool Compare(const KVR::IO::ISchema& stored, const KVR::IO::ISchema& schema)
    {
        std::vector<std::string> warnings;
        std::vector<std::string> errors;
        KVR::IO::CompareSchemas(stored, schema, warnings, errors, pathText);
        for (const std::string& warning : warnings) {
            lines.push_back({false, warning});
        }
        for (const std::string& error : errors) {
            lines.push_back({true, error});
        }
        return errors.empty();
    }

    bool CarryValue(const std::string& name, const KVR::IO::ISchema& stored, const VDataValue& old,
                    const KVR::IO::ISchema& schema, VDataValue& result)
    {
        if (old.Empty()) {
            return true;
        }
        result.Schema = &schema;
        if (!KVR::IO::ConvertValue(stored, old.Bytes, schema, result.Bytes)) {
            return Refuse("The " + name + " value cannot be carried over.");
        }
        if (result.Empty()) {
            return Refuse("Nothing is left of the " + name + " value.");
        }
        if (!HasText(result)) {
            return Refuse("The " + name + " value cannot be written as text.");
        }
        return true;
    }

    const std::string pathText;
    std::vector<VMigrationLine>& lines;
};

} // namespace

VMigration Migrate(const ItemMap& old, const ItemMap& current)
{
    VMigration migration;
    for (const auto& [path, item] : old) {
        VItemMigration one(path, migration.Lines);
        const auto found = current.find(path);
        VItem result;
        const bool carried = found == current.end() || found->second.Schema == nullptr
                                 ? one.Refuse("There is no current schema.")
                                 : one.Carry(item, *found->second.Schema, result);
        if (carried) {
            migration.Items.emplace(path, result);
        } else {
            ++migration.LeftOut;
        }
    }
    return migration;
}

} // namespace QuorixConfig
