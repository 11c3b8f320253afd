#pragma once

#include "io/EnumEntries.h"
#include "io/SchemaTextMode.h"
#include "io/TextCursor.h"

#include <cstdint>
#include <string>
#include <vector>

namespace KVR {
namespace IO {

namespace Detail {

/// Reads one value from text.
///
/// Owns nothing: text and bytes must outlive it. Failure: false, with cursor and bytes wherever
/// they stood. Threads: one thread.
class VValueTextReader
{
public:
    VValueTextReader(const char* begin, const char* end, std::vector<unsigned char>& bytes,
                     SchemaTextMode mode);

    /// Appends the bytes of a value of `schema`, which must be well-formed and is the one at the
    /// top.
    bool Read(const ISchema& schema);

    /// Returns where reading stopped.
    const char* Position() const { return cursor.Position; }

private:
    bool ReadValue(const ISchema& schema, bool isTop);
    bool ReadValueBetweenBlanks(const ISchema& schema, bool isTop);
    bool ReadBool();
    bool ReadString();
    bool ReadEnum(const ISchema& schema);
    bool ReadFixed(const ISchema& schema, bool isTop);
    bool ReadFixedItems(const ISchema& schema);
    bool ReadFixedPairs(const ISchema& schema);
    bool ReadList(const ISchema& schema, bool isTop);
    bool ReadListItems(const ISchema& element, bool isTop, std::uint32_t& count);
    bool ReadElements(const ISchema& element, std::uint32_t limit, std::uint32_t& count);

    bool IsRow(bool isTop) const;
    bool TakeWord(const char* word);
    bool TakeEmpty(char open, char close);
    bool TakeString(std::string& characters);
    bool TakeQuoted(std::string& characters);
    bool TakeEscaped(std::string& characters);

    VTextCursor cursor;
    std::vector<unsigned char>& bytes;
    const SchemaTextMode mode;
    VEnumEntries enumEntries;
};

} // namespace Detail
} // namespace IO
} // namespace KVR
