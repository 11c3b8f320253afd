#include "io/TextModel.h"

#include "io/BinaryLayout.h"
#include "io/ValueText.h"

#include <algorithm>
#include <stdexcept>
#include <string>

using namespace KVR::IO;

namespace {

using Texts = std::vector<std::string>;

/// Splits the text of a bracketed row into the texts of its items.
Texts Split(const std::string& row)
{
    Texts items;
    std::string item;
    int depth = 0;
    bool quoted = false;
    for (std::size_t i = 1; i + 1 < row.size(); ++i) {
        const char character = row[i];
        if (!quoted && depth == 0 && character == ',') {
            items.push_back(item);
            item.clear();
            continue;
        }
        item += character;
        if (quoted && character == '\\') {
            item += row[++i];
        } else if (character == '"') {
            quoted = !quoted;
        } else if (!quoted && character == '[') {
            ++depth;
        } else if (!quoted && character == ']') {
            --depth;
        }
    }
    if (row.size() > 2) {
        items.push_back(item);
    }
    return items;
}

std::string Join(const Texts& items)
{
    std::string row = "[";
    for (const std::string& item : items) {
        row += (row.size() > 1 ? "," : "") + item;
    }
    return row + "]";
}

std::string Quote(const std::string& word)
{
    ISchema schema;
    schema.Type = EType::String;
    std::vector<unsigned char> bytes;
    Detail::AppendString(bytes, word);
    std::string text;
    BinaryToText(bytes, schema, text, SchemaTextModePositional);
    return text;
}

std::string Clean(const std::string& name)
{
    return name.rfind("LEGACY_", 0) == 0 ? name.substr(7) : name;
}

/// The text of the current entry that has the name, or another name of the same number.
std::string ConvertEntry(const ISchema& stored, const ISchema& current, const std::string& text)
{
    const auto entry =
        std::find_if(stored.EnumValues.begin(), stored.EnumValues.end(),
                     [&](const ISchema::EnumValue& one) { return Quote(one.first) == text; });
    for (const ISchema::EnumValue& alias : stored.EnumValues) {
        for (const ISchema::EnumValue& one : current.EnumValues) {
            if (alias.second == entry->second && Clean(one.first) == Clean(alias.first)) {
                return Quote(one.first);
            }
        }
    }
    throw std::runtime_error("an entry was lost");
}

std::string NewText(const ISchema& schema)
{
    switch (schema.Type) {
    case EType::Bool:
        return "false";
    case EType::String:
        return "\"\"";
    case EType::Enum8:
    case EType::Enum16:
    case EType::Enum32:
        return Quote(schema.EnumValues.at(0).first);
    case EType::List:
        return "[]";
    case EType::Array:
        return Join(Texts(schema.Count, NewText(schema.SubSchemas.at(0).second)));
    case EType::Tuple:
    case EType::NamedTuple: {
        Texts items;
        for (const ISchema::SubSchema& member : schema.SubSchemas) {
            items.push_back(NewText(member.second));
        }
        return Join(items);
    }
    default:
        return "0";
    }
}

std::string Convert(const ISchema& stored, const ISchema& current, const std::string& text);

std::string ConvertMembers(const ISchema& stored, const ISchema& current, const Texts& items)
{
    Texts converted;
    for (const ISchema::SubSchema& member : current.SubSchemas) {
        std::string text = NewText(member.second);
        for (std::size_t i = 0; i < items.size(); ++i) {
            if (stored.SubSchemas[i].first == member.first) {
                text = Convert(stored.SubSchemas[i].second, member.second, items[i]);
            }
        }
        converted.push_back(text);
    }
    return Join(converted);
}

std::string ConvertItems(const ISchema& stored, const ISchema& current, const Texts& items)
{
    Texts converted;
    for (std::size_t i = 0; i < items.size(); ++i) {
        const std::size_t part = stored.Type == EType::Tuple ? i : 0;
        converted.push_back(
            Convert(stored.SubSchemas[part].second, current.SubSchemas[part].second, items[i]));
    }
    return Join(converted);
}

std::string Convert(const ISchema& stored, const ISchema& current, const std::string& text)
{
    switch (stored.Type) {
    case EType::Bool:
        return current.Type == EType::Bool ? text : text == "true" ? "1" : "0";
    case EType::Enum8:
    case EType::Enum16:
    case EType::Enum32:
        return ConvertEntry(stored, current, text);
    case EType::Array:
    case EType::List:
    case EType::Tuple:
        return ConvertItems(stored, current, Split(text));
    case EType::NamedTuple:
        return ConvertMembers(stored, current, Split(text));
    default:
        return text;
    }
}

} // namespace

bool ConvertThroughText(const ISchema& stored, const std::vector<unsigned char>& bytes,
                        const ISchema& current, std::vector<unsigned char>& result)
{
    std::string text;
    if (!BinaryToText(bytes, stored, text, SchemaTextModePositional)) {
        return false;
    }
    const std::string converted = Convert(stored, current, text);
    const char* begin = converted.data();
    const char* const end = begin + converted.size();
    return TextToBinary(begin, end, current, result, SchemaTextModePositional) && begin == end;
}
