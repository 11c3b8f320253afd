#include "io/DataValue.h"
#include "io/EnumDescription.h"
#include "io/ISchema.h"
#include "io/SchemaMembers.h"
#include "io/SchemaText.h"

#include "Variant/Interning.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <utility>

namespace KVR {
namespace IO {

namespace {

constexpr std::size_t mostLevels = 256;

bool IsBlank(char character)
{
    return character == '\t' || character == '\n' || character == '\r' || character == ' ';
}

bool StartsNumber(const char* text)
{
    const char first = *text == '-' || *text == '+' ? text[1] : *text;
    return first >= '0' && first <= '9';
}

/// Reads schemas from zero-terminated text. Each operation skips blanks in front of what it reads;
/// on false the cursor stands somewhere at or behind where it stood, never behind the terminator.
class VSchemaTextReader
{
public:
    explicit VSchemaTextReader(const char* text) : cursor(text) {}

    const char* Position() const { return cursor; }

    bool ReadSchema(ISchema& schema)
    {
        if (level == mostLevels) {
            return false;
        }
        ++level;
        SkipBlanks();
        const bool good = *cursor == '[' ? ReadPositional(schema) : ReadNamed(schema);
        --level;
        return good;
    }

private:
    /// Where the value of a named member lies.
    struct Range
    {
        const char* Begin = nullptr; ///< null for a member that is absent
        const char* End = nullptr;
    };
    using Ranges = std::array<Range, SchemaMemberCount>;

    void SkipBlanks()
    {
        while (IsBlank(*cursor)) {
            ++cursor;
        }
    }

    bool Take(char character)
    {
        SkipBlanks();
        if (*cursor != character) {
            return false;
        }
        ++cursor;
        return true;
    }

    bool ReadPositional(ISchema& schema)
    {
        bool good = Take('[');
        for (std::size_t i = 0; i < SchemaMemberCount; ++i) {
            good = (i == 0 || Take(',')) && good;
            // A member that failed does not keep the others from being read.
            good = ReadMember(schema, static_cast<ESchemaMember>(i)) && good;
        }
        return Take(']') && good;
    }

    bool ReadNamed(ISchema& schema)
    {
        Ranges ranges;
        if (!FindMembers(ranges)) {
            return false;
        }
        const char* const behind = cursor;
        for (std::size_t i = 0; i < SchemaMemberCount; ++i) {
            if (ranges[i].Begin == nullptr) {
                continue; // absent: keeps its default
            }
            cursor = ranges[i].Begin;
            if (!ReadMember(schema, static_cast<ESchemaMember>(i))) {
                return false;
            }
            // Not further: blanks between the value and the comma were not skipped as part of it.
            while (cursor < ranges[i].End && IsBlank(*cursor)) {
                ++cursor;
            }
            if (cursor != ranges[i].End) {
                return false;
            }
        }
        cursor = behind;
        return true;
    }

    /// Walks an object to its end without looking into its values.
    bool FindMembers(Ranges& ranges)
    {
        if (!Take('{')) {
            return false;
        }
        if (Take('}')) {
            return true;
        }
        std::string key;
        do {
            Range range;
            if (!ReadQuoted(key) || !Take(':') || !SkipValue(range)) {
                return false;
            }
            Remember(ranges, key, range);
        } while (Take(','));
        return Take('}');
    }

    static void Remember(Ranges& ranges, const std::string& key, const Range& range)
    {
        const auto& members = DescribeSchemaMembers();
        for (std::size_t i = 0; i < members.size(); ++i) {
            // Of keys that appear twice the first one counts.
            if (key == members[i].Name && ranges[i].Begin == nullptr) {
                ranges[i] = range;
            }
        }
    }

    bool SkipValue(Range& range)
    {
        SkipBlanks();
        range.Begin = cursor;
        const bool good = SkipCharacters();
        range.End = cursor;
        return good;
    }

    /// Finds the end of a value by its brackets alone; which bracket closes which is not looked at.
    bool SkipCharacters()
    {
        std::size_t depth = 0;
        for (;;) {
            // A value is skipped once for every level that it lies in, so the runs are long.
            cursor += std::strcspn(cursor, "\"[]{},");
            switch (*cursor) {
            case '\0':
                return false;
            case '"':
                if (!SkipQuoted()) {
                    return false;
                }
                if (depth == 0) {
                    return true;
                }
                break;
            case '[':
            case '{':
                ++depth;
                ++cursor;
                break;
            case ']':
            case '}':
                if (depth == 0) {
                    return true;
                }
                ++cursor;
                if (--depth == 0) {
                    return true;
                }
                break;
            default: // a comma
                if (depth == 0) {
                    return true;
                }
                ++cursor;
            }
        }
    }

    /// Moves behind the quoted string that begins here.
    bool SkipQuoted()
    {
        ++cursor;
        for (;;) {
            cursor += std::strcspn(cursor, "\"\\");
            const bool isEscape = *cursor == '\\';
            cursor += isEscape ? 1 : 0;
            if (*cursor == '\0') {
                return false;
            }
            ++cursor;
            if (!isEscape) {
                return true;
            }
        }
    }

    bool ReadMember(ISchema& schema, ESchemaMember member)
    {
        switch (member) {
        case ESchemaMember::Type:
            return ReadName(DescribeEType(), schema.Type);
        case ESchemaMember::Role:
            return ReadName(DescribeERole(), schema.Role);
        case ESchemaMember::Detail:
            return ReadDetail(schema.Detail);
        case ESchemaMember::Count:
            return ReadUnsigned(schema.Count);
        case ESchemaMember::TypeName:
            return ReadQuoted(schema.TypeName);
        case ESchemaMember::EnumValues:
            return ReadList([&] { return ReadEnumValue(schema); });
        case ESchemaMember::SubSchemas:
            return ReadList([&] { return ReadSubSchema(schema); });
        case ESchemaMember::Docs:
            return ReadList([&] {
                schema.Docs.emplace_back();
                return ReadQuoted(schema.Docs.back());
            });
        }
        return false;
    }

    template <typename Enumeration>
    bool ReadName(const EnumDescription& description, Enumeration& value)
    {
        std::string name;
        if (!ReadQuoted(name)) {
            return false;
        }
        const EnumDescription::Entry* entry = description.FindName(name);
        if (entry == nullptr) {
            return false;
        }
        value = static_cast<Enumeration>(entry->Value);
        return true;
    }

    bool ReadDetail(std::uint16_t& detail)
    {
        std::uint32_t number = 0;
        if (!ReadUnsigned(number) || number > std::numeric_limits<std::uint16_t>::max()) {
            return false;
        }
        detail = static_cast<std::uint16_t>(number);
        return true;
    }

    /// Reads as the conversion of a runtime library with 32-bit numbers does, on which stored texts
    /// rely: what is too great becomes the greatest number, and a negative number wraps.
    bool ReadUnsigned(std::uint32_t& number)
    {
        SkipBlanks();
        if (!StartsNumber(cursor)) {
            return false;
        }
        const bool negative = *cursor == '-';
        if (negative || *cursor == '+') {
            ++cursor;
        }
        char* end = nullptr;
        const unsigned long read = std::strtoul(cursor, &end, 10);
        cursor = end;

        constexpr std::uint32_t greatest = std::numeric_limits<std::uint32_t>::max();
        number = read > greatest ? greatest : static_cast<std::uint32_t>(read);
        if (negative && read <= greatest) {
            number = 0 - number;
        }
        return true;
    }

    bool ReadSigned(std::int32_t& number)
    {
        SkipBlanks();
        if (!StartsNumber(cursor)) {
            return false;
        }
        char* end = nullptr;
        const long read = std::strtol(cursor, &end, 10);
        cursor = end;
        number = static_cast<std::int32_t>(
            std::clamp<long>(read, std::numeric_limits<std::int32_t>::min(),
                             std::numeric_limits<std::int32_t>::max()));
        return true;
    }

    template <typename ReadItem>
    bool ReadList(ReadItem readItem)
    {
        if (!Take('[')) {
            return false;
        }
        if (Take(']')) {
            return true;
        }
        do {
            if (!readItem()) {
                return false;
            }
        } while (Take(','));
        return Take(']');
    }

    bool ReadEnumValue(ISchema& schema)
    {
        schema.EnumValues.emplace_back();
        ISchema::EnumValue& entry = schema.EnumValues.back();
        return Take('[') && ReadQuoted(entry.first) && Take(',') && ReadSigned(entry.second) &&
               Take(']');
    }

    bool ReadSubSchema(ISchema& schema)
    {
        schema.SubSchemas.emplace_back();
        ISchema::SubSchema& part = schema.SubSchemas.back();
        return Take('[') && ReadQuoted(part.first) && Take(',') && ReadSchema(part.second) &&
               Take(']');
    }

    bool ReadQuoted(std::string& text)
    {
        text.clear();
        if (!Take('"')) {
            return false;
        }
        for (; *cursor != '"'; ++cursor) {
            if (*cursor == '\\') {
                ++cursor;
                if (!AppendEscaped(text)) {
                    return false;
                }
            } else if (*cursor != '\0') {
                text += *cursor;
            } else {
                return false;
            }
        }
        ++cursor;
        return true;
    }

    bool AppendEscaped(std::string& text) const
    {
        switch (*cursor) {
        case '\0':
            return false;
        case 'n':
            text += '\n';
            return true;
        case 'r':
            text += '\r';
            return true;
        case 't':
            // Deliberate: a tab and the letter t. Every release read it so, and the names in stored
            // files are matched with names that were read before; a tab therefore grows a "t"
            // with each write and read.
            text += "\tt";
            return true;
        default:
            text += *cursor;
            return true;
        }
    }

    const char* cursor;
    std::size_t level = 0;
};

} // namespace

bool ReadSchemaText(ISchema& schema, const char*& text)
{
    VSchemaTextReader reader(text);
    const bool good = reader.ReadSchema(schema);
    text = reader.Position();
    return good;
}

bool ParseSchemaText(VDataValue& value, const char* text)
{
    value.Bytes.clear();
    ISchema schema;
    if (!ReadSchemaText(schema, text)) {
        return false;
    }
    value.Schema = &GetUniqueSchema(schema);
    return true;
}

} // namespace IO
} // namespace KVR
