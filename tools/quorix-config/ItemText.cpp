#include "ItemText.h"

#include "ConfigurationFile.h"
#include "io/EnumDescription.h"
#include "io/SchemaText.h"
#include "io/ValueText.h"

#include <cstdio>
#include <stdexcept>

namespace QuorixConfig {

namespace {

unsigned char ByteAt(const std::string& text, std::size_t index)
{
    return index < text.size() ? static_cast<unsigned char>(text[index]) : 0;
}

/// Returns how many bytes from here are a control character. U+0080 to U+009F take two, and there
/// are terminals that obey them like an escape sequence.
std::size_t ControlLength(const std::string& text, std::size_t index)
{
    const unsigned char byte = ByteAt(text, index);
    if (byte < 0x20 || byte == 0x7F) {
        return 1;
    }
    const unsigned char next = ByteAt(text, index + 1);
    return byte == 0xC2 && next >= 0x80 && next <= 0x9F ? 2 : 0;
}

std::string ByteNumber(unsigned char byte)
{
    char number[8];
    std::snprintf(number, sizeof number, "\\x%02X", byte);
    return number;
}

} // namespace

std::string Printable(const std::string& text)
{
    std::string printable;
    std::size_t controls = 0; // bytes that are yet to be written as numbers
    for (std::size_t index = 0; index < text.size(); ++index) {
        controls = controls != 0 ? controls : ControlLength(text, index);
        if (controls != 0) {
            printable += ByteNumber(ByteAt(text, index));
            --controls;
        } else {
            printable += text[index];
        }
    }
    return printable;
}

std::string ValueText(const VDataValue& value)
{
    std::string text;
    try {
        if (!value.Empty() && !KVR::IO::BinaryToText(value.Bytes, *value.EffectiveSchema(), text)) {
            text = "(no text)";
        }
    } catch (const std::runtime_error&) {
        text = "(no text)"; // bytes that end too early
    }
    return text;
}

std::string FormatText(const VItem& item)
{
    std::string text;
    // It cannot fail: every schema in memory has a text.
    static_cast<void>(KVR::IO::WriteSchemaText(text, *item.Schema, KVR::IO::SchemaTextModeBrief));
    return text;
}

std::string TypeName(const VItem& item)
{
    return KVR::IO::DescribeEType().NameOf(static_cast<std::int32_t>(item.Schema->Type));
}

std::string Describe(const VItem& item)
{
    std::string text = TypeName(item) + " = " + ValueText(item.Current());
    if (!item.Proposed.Empty()) {
        text += item.Verified.Empty() ? std::string(", proposed only")
                                      : ", verified = " + ValueText(item.Verified);
    }
    return Printable(text);
}

} // namespace QuorixConfig
