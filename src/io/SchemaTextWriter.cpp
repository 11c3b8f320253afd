#include "io/SchemaText.h"

#include "io/EnumDescription.h"
#include "io/ISchema.h"
#include "io/SchemaMembers.h"

#include <array>
#include <string>

namespace KVR {
namespace IO {

namespace {

void AppendQuoted(std::string& output, const std::string& text)
{
    output += '"';
    for (const char character : text) {
        switch (character) {
        case '\t':
            output += "\\t";
            break;
        case '\n':
            output += "\\n";
            break;
        case '\r':
            output += "\\r";
            break;
        case '"':
            output += "\\\"";
            break;
        case '\\':
            output += "\\\\";
            break;
        default:
            output += character;
        }
    }
    output += '"';
}

/// Ends a run of items that each left a "," behind.
void CloseList(std::string& output, char bracket)
{
    if (output.back() == ',') {
        output.back() = bracket;
    } else {
        output += bracket;
    }
}

template <typename Items, typename AppendItem>
void AppendList(std::string& output, const Items& items, SchemaTextMode mode, AppendItem appendItem)
{
    output += '[';
    // Deliberate: only the number of items, which does not read back. Lists of items and their
    // types in logs rely on this mode to fit a line.
    if (mode == SchemaTextModeRow) {
        output += std::to_string(items.size());
        output += ']';
        return;
    }
    for (const auto& item : items) {
        appendItem(item);
        output += ',';
    }
    CloseList(output, ']');
}

void AppendSchema(std::string& output, const ISchema& schema, SchemaTextMode mode);

void AppendMember(std::string& output, const ISchema& schema, ESchemaMember member,
                  SchemaTextMode mode)
{
    switch (member) {
    case ESchemaMember::Type:
        AppendQuoted(output, DescribeEType().NameOf(static_cast<std::int32_t>(schema.Type)));
        break;
    case ESchemaMember::Role:
        AppendQuoted(output, DescribeERole().NameOf(static_cast<std::int32_t>(schema.Role)));
        break;
    case ESchemaMember::Detail:
        output += std::to_string(schema.Detail);
        break;
    case ESchemaMember::Count:
        output += std::to_string(schema.Count);
        break;
    case ESchemaMember::TypeName:
        AppendQuoted(output, schema.TypeName);
        break;
    case ESchemaMember::EnumValues:
        AppendList(output, schema.EnumValues, mode, [&](const ISchema::EnumValue& entry) {
            output += '[';
            AppendQuoted(output, entry.first);
            output += ',' + std::to_string(entry.second) + ']';
        });
        break;
    case ESchemaMember::SubSchemas:
        AppendList(output, schema.SubSchemas, mode, [&](const ISchema::SubSchema& part) {
            output += '[';
            AppendQuoted(output, part.first);
            output += ',';
            AppendSchema(output, part.second, mode);
            output += ']';
        });
        break;
    case ESchemaMember::Docs:
        AppendList(output, schema.Docs, mode,
                   [&](const std::string& text) { AppendQuoted(output, text); });
        break;
    }
}

using MemberTexts = std::array<std::string, SchemaMemberCount>;

MemberTexts MakeDefaultTexts()
{
    MemberTexts texts;
    for (std::size_t i = 0; i < texts.size(); ++i) {
        AppendMember(texts[i], ISchema(), static_cast<ESchemaMember>(i), SchemaTextModeBrief);
    }
    return texts;
}

const MemberTexts& DefaultTexts()
{
    static const MemberTexts& texts = *new MemberTexts(MakeDefaultTexts());
    return texts;
}

void AppendPositional(std::string& output, const ISchema& schema, SchemaTextMode mode)
{
    output += '[';
    for (std::size_t i = 0; i < SchemaMemberCount; ++i) {
        AppendMember(output, schema, static_cast<ESchemaMember>(i), mode);
        output += ',';
    }
    CloseList(output, ']');
}

void AppendNamed(std::string& output, const ISchema& schema, SchemaTextMode mode)
{
    output += '{';
    for (std::size_t i = 0; i < SchemaMemberCount; ++i) {
        const std::size_t memberStart = output.size();
        AppendQuoted(output, DescribeSchemaMembers()[i].Name);
        output += ':';

        const std::size_t textStart = output.size();
        AppendMember(output, schema, static_cast<ESchemaMember>(i), mode);

        const bool isDefault = output.compare(textStart, output.npos, DefaultTexts()[i]) == 0;
        if (mode == SchemaTextModeBrief && isDefault) {
            output.resize(memberStart);
        } else {
            output += ',';
        }
    }
    CloseList(output, '}');
}

void AppendSchema(std::string& output, const ISchema& schema, SchemaTextMode mode)
{
    if (mode == SchemaTextModeNamed || mode == SchemaTextModeBrief) {
        AppendNamed(output, schema, mode);
    } else {
        AppendPositional(output, schema, mode);
    }
}

} // namespace

bool WriteSchemaText(std::string& output, const ISchema& schema, SchemaTextMode mode)
{
    AppendSchema(output, schema, mode);
    return true;
}

} // namespace IO
} // namespace KVR
