#pragma once

#include "io/EnumEntries.h"
#include "io/SchemaTextMode.h"
#include "io/VectorReader.h"

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace KVR {
namespace IO {

namespace Detail {

/// Writes one value as text.
///
/// Owns nothing: bytes and text must outlive it. Failure: false, or the exception of a cursor that
/// runs past the end; the text then holds what was written so far. Threads: one thread.
class VValueTextWriter
{
public:
    VValueTextWriter(const std::vector<unsigned char>& bytes, std::string& text,
                     SchemaTextMode mode);

    /// Appends the value of `schema`, which must be well-formed and is the one at the top.
    bool Write(const ISchema& schema);

private:
    bool WriteValue(const ISchema& schema, bool isTop);
    void WriteBool();
    bool WriteString();
    bool WriteEnum(const ISchema& schema);
    bool WriteArray(const ISchema& schema, bool isTop);
    bool WriteList(const ISchema& schema, bool isTop);
    bool WriteElements(const ISchema& element, std::uint32_t count, bool isTop);
    bool WriteEachElement(const ISchema& element, std::uint32_t count);
    bool WriteCountOnly(const ISchema& schema, std::uint32_t count);
    bool WriteTuple(const ISchema& schema, bool isTop);

    void AppendWord(const std::string& word);
    void AppendQuoted(const std::string& characters);
    bool HasBrackets(bool isTop) const;

    VVectorReader reader;
    std::string& text;
    const SchemaTextMode mode;
    VEnumEntries enumEntries;
    std::size_t textWithoutBytes = 0; // written for elements that no bytes stand behind
};

} // namespace Detail
} // namespace IO
} // namespace KVR
