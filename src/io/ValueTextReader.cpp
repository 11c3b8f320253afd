#include "io/ValueTextReader.h"

#include "io/BinaryLayout.h"
#include "io/ISchema.h"
#include "io/SchemaShape.h"
#include "io/ValueTextNumbers.h"

#include <algorithm>
#include <cstring>

namespace KVR {
namespace IO {
namespace Detail {

namespace {

/// How many items the text of an Array or a tuple has.
std::size_t ItemCount(const ISchema& schema)
{
    return schema.Type == EType::Array ? schema.Count : schema.SubSchemas.size();
}

const ISchema::SubSchema& ItemAt(const ISchema& schema, std::size_t index)
{
    return schema.Type == EType::Array ? schema.SubSchemas.front() : schema.SubSchemas[index];
}

} // namespace

VValueTextReader::VValueTextReader(const char* begin, const char* end,
                                   std::vector<unsigned char>& bytes_, SchemaTextMode mode_)
    : cursor{begin, end}, bytes(bytes_), mode(mode_)
{
}

bool VValueTextReader::Read(const ISchema& schema)
{
    return ReadValue(schema, true);
}

bool VValueTextReader::ReadValue(const ISchema& schema, bool isTop)
{
    cursor.SkipBlanks();
    const bool good = ReadValueBetweenBlanks(schema, isTop);
    cursor.SkipBlanks();
    return good;
}

bool VValueTextReader::ReadValueBetweenBlanks(const ISchema& schema, bool isTop)
{
    if (IsNumber(schema.Type)) {
        std::uint32_t count = 0;
        return ReadNumbers(schema.Type, 1, cursor, bytes, count);
    }
    switch (schema.Type) {
    case EType::Bool:
        return ReadBool();
    case EType::String:
        return ReadString();
    case EType::Enum8:
    case EType::Enum16:
    case EType::Enum32:
        return ReadEnum(schema);
    case EType::Array:
    case EType::Tuple:
    case EType::NamedTuple:
        return ReadFixed(schema, isTop);
    case EType::List:
        return ReadList(schema, isTop);
    default:
        return false; // Void, Ref and what is no type have no text
    }
}

bool VValueTextReader::ReadBool()
{
    const bool quoted = mode == SchemaTextModeQuotedRow;
    if (TakeWord(quoted ? "\"true\"" : "true")) {
        bytes.push_back(1);
        return true;
    }
    if (TakeWord(quoted ? "\"false\"" : "false")) {
        bytes.push_back(0);
        return true;
    }
    return false;
}

bool VValueTextReader::ReadString()
{
    std::string characters;
    return TakeString(characters) && AppendString(bytes, characters);
}

bool VValueTextReader::ReadEnum(const ISchema& schema)
{
    std::string name;
    if (!TakeString(name)) {
        return false;
    }
    const ISchema::EnumValue* const entry = enumEntries.FindName(schema, name);
    return entry != nullptr && AppendEnum(bytes, schema.Type, entry->second);
}

bool VValueTextReader::ReadFixed(const ISchema& schema, bool isTop)
{
    if (schema.Type == EType::Array && schema.Count > MostElementsWithoutBytes &&
        TakesNoBytes(schema.SubSchemas.front().second)) {
        return false;
    }
    if (IsRow(isTop)) {
        return ReadFixedItems(schema);
    }
    if (ItemCount(schema) == 0) {
        return TakeEmpty('[', ']') || TakeEmpty('{', '}');
    }
    if (cursor.Take('[')) {
        return ReadFixedItems(schema) && cursor.Take(']');
    }
    if (cursor.Take('{')) {
        return ReadFixedPairs(schema) && cursor.Take('}');
    }
    return false;
}

bool VValueTextReader::ReadFixedItems(const ISchema& schema)
{
    if (schema.Type == EType::Array) {
        std::uint32_t count = 0;
        return schema.Count == 0 ||
               (ReadElements(schema.SubSchemas.front().second, schema.Count, count) &&
                count == schema.Count);
    }
    for (std::size_t i = 0; i < schema.SubSchemas.size(); ++i) {
        if ((i != 0 && !cursor.Take(',')) || !ReadValue(schema.SubSchemas[i].second, false)) {
            return false;
        }
    }
    return true;
}

bool VValueTextReader::ReadFixedPairs(const ISchema& schema)
{
    std::string key;
    for (std::size_t i = 0; i < ItemCount(schema); ++i) {
        if (i != 0 && !cursor.Take(',')) {
            return false;
        }
        const ISchema::SubSchema& item = ItemAt(schema, i);
        cursor.SkipBlanks();
        if (!TakeQuoted(key) || key != item.first) {
            return false;
        }
        cursor.SkipBlanks();
        if (!cursor.Take(':') || !ReadValue(item.second, false)) {
            return false;
        }
    }
    return true;
}

bool VValueTextReader::ReadList(const ISchema& schema, bool isTop)
{
    const std::size_t place = bytes.size();
    std::uint32_t count = 0;
    AppendNumber(bytes, count);
    const bool good = ReadListItems(schema.SubSchemas.front().second, isTop, count);
    // Deliberate: also after a failure. Callers that show what could be read of a text rely on a
    // count that tells how many items are there.
    std::memcpy(bytes.data() + place, &count, sizeof(count));
    return good;
}

bool VValueTextReader::ReadListItems(const ISchema& element, bool isTop, std::uint32_t& count)
{
    constexpr std::uint32_t noLimit = 0;
    if (IsRow(isTop)) {
        return ReadElements(element, noLimit, count);
    }
    if (!cursor.Take('[')) {
        return false;
    }
    cursor.SkipBlanks();
    return cursor.Take(']') || (ReadElements(element, noLimit, count) && cursor.Take(']'));
}

bool VValueTextReader::ReadElements(const ISchema& element, std::uint32_t limit,
                                    std::uint32_t& count)
{
    if (IsNumber(element.Type)) {
        return ReadNumbers(element.Type, limit, cursor, bytes, count);
    }
    return ReadSeparated(cursor, limit, count, [&] { return ReadValue(element, false); });
}

bool VValueTextReader::IsRow(bool isTop) const
{
    return isTop && mode > SchemaTextModeBrief;
}

bool VValueTextReader::TakeWord(const char* word)
{
    const std::size_t length = std::strlen(word);
    const auto left = static_cast<std::size_t>(cursor.End - cursor.Position);
    if (left < length || std::memcmp(cursor.Position, word, length) != 0) {
        return false;
    }
    cursor.Position += length;
    return true;
}

/// Takes a pair of brackets with nothing in it, or leaves the cursor where it is.
bool VValueTextReader::TakeEmpty(char open, char close)
{
    const char* const start = cursor.Position;
    if (cursor.Take(open)) {
        cursor.SkipBlanks();
        if (cursor.Take(close)) {
            return true;
        }
        cursor.Position = start;
    }
    return false;
}

bool VValueTextReader::TakeString(std::string& characters)
{
    if (TakeQuoted(characters)) {
        return true;
    }
    if (mode != SchemaTextModeRow) {
        return false;
    }
    // Deliberate: a bare run knows no brackets and keeps its last blanks, so that rows of words may
    // hold both. No characters at all are a word too.
    const char* const comma = std::find(cursor.Position, cursor.End, ',');
    characters.assign(cursor.Position, comma);
    cursor.Position = comma;
    return true;
}

/// Takes a quoted string, or leaves the cursor where it is.
bool VValueTextReader::TakeQuoted(std::string& characters)
{
    const char* const start = cursor.Position;
    characters.clear();
    bool good = cursor.Take('"');
    while (good && !cursor.Take('"')) {
        if (cursor.AtEnd()) {
            good = false;
        } else if (cursor.Take('\\')) {
            good = TakeEscaped(characters);
        } else {
            characters += *cursor.Position++;
        }
    }
    if (!good) {
        cursor.Position = start;
    }
    return good;
}

bool VValueTextReader::TakeEscaped(std::string& characters)
{
    constexpr char names[] = "trnfb\"\\";
    constexpr char meanings[] = "\t\r\n\f\b\"\\";
    const char* const name =
        cursor.AtEnd() || *cursor.Position == '\0' ? nullptr : std::strchr(names, *cursor.Position);
    if (name == nullptr) {
        return false;
    }
    characters += meanings[name - names];
    ++cursor.Position;
    return true;
}

} // namespace Detail
} // namespace IO
} // namespace KVR
