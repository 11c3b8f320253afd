#include "io/ValueText.h"

#include "io/DataValue.h"
#include "io/SchemaShape.h"
#include "io/ValueTextReader.h"
#include "io/ValueTextWriter.h"

#include <stdexcept>

namespace KVR {
namespace IO {

bool BinaryToText(const std::vector<unsigned char>& bytes, const ISchema& schema, std::string& text,
                  SchemaTextMode mode)
{
    text.clear();
    return Detail::IsWellFormed(schema) &&
           Detail::VValueTextWriter(bytes, text, mode).Write(schema);
}

bool BinaryToText(const std::vector<unsigned char>& bytes, const ISchema& schema, std::string& text,
                  bool quoted)
{
    return BinaryToText(bytes, schema, text, quoted ? SchemaTextModeQuotedRow : SchemaTextModeRow);
}

bool TextToBinary(const char*& begin, const char* end, const ISchema& schema,
                  std::vector<unsigned char>& bytes, SchemaTextMode mode)
{
    bytes.clear();
    if (!Detail::IsWellFormed(schema)) {
        return false;
    }
    Detail::VValueTextReader reader(begin, end, bytes, mode);
    const bool good = reader.Read(schema);
    begin = reader.Position();
    return good;
}

} // namespace IO
} // namespace KVR

std::string ValueToText(const VDataValue& value)
{
    std::string text;
    try {
        if (!KVR::IO::BinaryToText(value.Bytes, *value.EffectiveSchema(), text,
                                   KVR::IO::SchemaTextModeRow)) {
            text.clear();
        }
    } catch (const std::runtime_error&) {
        text.clear(); // the bytes end before the value: as if it had no text
    }
    return text;
}
