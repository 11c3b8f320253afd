#include "io/ValueTextWriter.h"

#include "io/ISchema.h"
#include "io/InputStreamAdapter.h"
#include "io/SchemaShape.h"
#include "io/SkipReaders.h"
#include "io/ValueTextNumbers.h"

namespace KVR {
namespace IO {
namespace Detail {

namespace {

// Arrays within arrays, or long member names in them, could still ask for more text than any memory
// holds.
constexpr std::size_t mostTextWithoutBytes = std::size_t{4} * 1024 * 1024;

/// True for a count that no bytes stand behind and that is greater than anybody means.
bool IsCountOfNothing(const ISchema& element, std::uint32_t count)
{
    return count > MostElementsWithoutBytes && TakesNoBytes(element);
}

std::int32_t ReadEnum(EType type, VVectorReader& reader)
{
    switch (type) {
    case EType::Enum8:
        return reader.Read<std::int8_t>();
    case EType::Enum16:
        return reader.Read<std::int16_t>();
    default:
        return reader.Read<std::int32_t>();
    }
}

} // namespace

VValueTextWriter::VValueTextWriter(const std::vector<unsigned char>& bytes, std::string& text_,
                                   SchemaTextMode mode_)
    : reader(bytes), text(text_), mode(mode_)
{
}

bool VValueTextWriter::Write(const ISchema& schema)
{
    return WriteValue(schema, true);
}

bool VValueTextWriter::WriteValue(const ISchema& schema, bool isTop)
{
    if (IsNumber(schema.Type)) {
        WriteNumbers(schema.Type, 1, reader, text);
        return true;
    }
    switch (schema.Type) {
    case EType::Bool:
        WriteBool();
        return true;
    case EType::String:
        return WriteString();
    case EType::Enum8:
    case EType::Enum16:
    case EType::Enum32:
        return WriteEnum(schema);
    case EType::Array:
        return WriteArray(schema, isTop);
    case EType::List:
        return WriteList(schema, isTop);
    case EType::Tuple:
    case EType::NamedTuple:
        return WriteTuple(schema, isTop);
    default:
        return false; // Void, Ref and what is no type have no text
    }
}

void VValueTextWriter::WriteBool()
{
    const char* const word = reader.Read<std::uint8_t>() != 0 ? "true" : "false";
    if (mode == SchemaTextModeQuotedRow) {
        AppendQuoted(word);
    } else {
        text += word;
    }
}

bool VValueTextWriter::WriteString()
{
    std::string characters;
    if (!reader.ReadString(characters)) {
        return false;
    }
    AppendWord(characters);
    return true;
}

bool VValueTextWriter::WriteEnum(const ISchema& schema)
{
    const std::int32_t value = ReadEnum(schema.Type, reader);
    const ISchema::EnumValue* const entry = enumEntries.FindNumber(schema, value);
    if (entry == nullptr) {
        return false;
    }
    AppendWord(entry->first);
    return true;
}

bool VValueTextWriter::WriteArray(const ISchema& schema, bool isTop)
{
    const ISchema& element = schema.SubSchemas.front().second;
    if (IsCountOfNothing(element, schema.Count)) {
        return false;
    }
    return mode == SchemaTextModeBrief ? WriteCountOnly(schema, schema.Count)
                                       : WriteElements(element, schema.Count, isTop);
}

bool VValueTextWriter::WriteList(const ISchema& schema, bool isTop)
{
    const ISchema& element = schema.SubSchemas.front().second;
    const auto count = reader.Read<std::uint32_t>();
    if (IsCountOfNothing(element, count)) {
        return false;
    }
    if (mode == SchemaTextModeBrief) {
        reader.StepBack(sizeof(count)); // the skip reader wants to read the count itself
        return WriteCountOnly(schema, count);
    }
    return WriteElements(element, count, isTop);
}

bool VValueTextWriter::WriteElements(const ISchema& element, std::uint32_t count, bool isTop)
{
    if (HasBrackets(isTop)) {
        text += '[';
    }
    if (IsNumber(element.Type)) {
        WriteNumbers(element.Type, count, reader, text);
    } else if (!WriteEachElement(element, count)) {
        return false;
    }
    if (HasBrackets(isTop)) {
        text += ']';
    }
    return true;
}

bool VValueTextWriter::WriteEachElement(const ISchema& element, std::uint32_t count)
{
    const bool withoutBytes = TakesNoBytes(element);
    for (std::uint32_t i = 0; i < count; ++i) {
        if (i != 0) {
            text += ',';
        }
        const std::size_t sizeBefore = text.size();
        if (!WriteValue(element, false)) {
            return false;
        }
        if (withoutBytes) {
            textWithoutBytes += text.size() - sizeBefore;
            if (textWithoutBytes > mostTextWithoutBytes) {
                return false;
            }
        }
    }
    return true;
}

bool VValueTextWriter::WriteCountOnly(const ISchema& schema, std::uint32_t count)
{
    text += '[' + std::to_string(count) + ']';
    IInputStreamAdapter<VVectorReader> stream(&reader);
    return BuildSkipReader(schema)->Read(stream, nullptr);
}

bool VValueTextWriter::WriteTuple(const ISchema& schema, bool isTop)
{
    const bool asPairs = mode == SchemaTextModeNamed || mode == SchemaTextModeBrief;
    if (HasBrackets(isTop)) {
        text += asPairs ? '{' : '[';
    }
    bool first = true;
    for (const ISchema::SubSchema& member : schema.SubSchemas) {
        if (!first) {
            text += ',';
        }
        first = false;
        if (asPairs) {
            AppendQuoted(member.first);
            text += ':';
        }
        if (!WriteValue(member.second, false)) {
            return false;
        }
    }
    if (HasBrackets(isTop)) {
        text += asPairs ? '}' : ']';
    }
    return true;
}

void VValueTextWriter::AppendWord(const std::string& word)
{
    if (mode == SchemaTextModeRow) {
        text += word;
    } else {
        AppendQuoted(word);
    }
}

void VValueTextWriter::AppendQuoted(const std::string& characters)
{
    text += '"';
    for (const char character : characters) {
        switch (character) {
        case '\b':
            text += "\\b";
            break;
        case '\t':
            text += "\\t";
            break;
        case '\n':
            text += "\\n";
            break;
        case '\f':
            text += "\\f";
            break;
        case '\r':
            text += "\\r";
            break;
        case '"':
            text += "\\\"";
            break;
        case '\\':
            text += "\\\\";
            break;
        default:
            text += character;
        }
    }
    text += '"';
}

bool VValueTextWriter::HasBrackets(bool isTop) const
{
    // Deliberate: rows have no outer brackets. Devices and operators know "1,2,3"; an empty list is
    // therefore no text at all, which does not read back.
    return !isTop || mode <= SchemaTextModeBrief;
}

} // namespace Detail
} // namespace IO
} // namespace KVR
