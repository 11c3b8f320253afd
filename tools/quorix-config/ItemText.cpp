#include "ItemText.h"

#include "ConfigurationFile.h"
#include "io/EnumDescription.h"
#include "io/SchemaText.h"
#include "io/ValueText.h"

#include <cstdio>
#include <stdexcept>

namespace QuorixConfig {

std::string Printable(const std::string& text)
{
    std::string printable;
    for (const char character : text) {
        const auto byte = static_cast<unsigned char>(character);
        if (byte < 0x20 || byte == 0x7F) {
            char number[8];
            std::snprintf(number, sizeof number, "\\x%02X", byte);
            printable += number;
        } else {
            printable += character;
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
