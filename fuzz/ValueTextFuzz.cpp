// Reads any text as a value of any schema. What was read takes memory in proportion to the text, is
// a complete value, and reads back from the text that it is written as.

#include "SchemaThenBytes.h"

#include "io/ISchema.h"
#include "io/SchemaText.h"
#include "io/ValueText.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

using namespace KVR::IO;

namespace {

void Require(bool holds, const char* what)
{
    if (!holds) {
        std::fprintf(stderr, "does not hold: %s\n", what);
        std::abort();
    }
}

bool Read(const std::string& text, const ISchema& schema, std::vector<unsigned char>& bytes,
          SchemaTextMode mode, bool& all)
{
    const char* begin = text.data();
    const char* const end = begin + text.size();
    const char* position = begin;
    const bool good = TextToBinary(position, end, schema, bytes, mode);
    Require(position >= begin && position <= end, "the position stays in the text");
    // One digit may become a double of 8 bytes.
    Require(bytes.size() <= 8 * (text.size() + 1), "memory is bounded by the text");
    all = position == end;
    return good;
}

/// Writes a value that was read, in the modes of which every text reads back.
void TryWriting(const std::vector<unsigned char>& bytes, const ISchema& schema)
{
    for (const SchemaTextMode mode : {SchemaTextModePositional, SchemaTextModeNamed}) {
        std::string text;
        if (!BinaryToText(bytes, schema, text, mode)) {
            continue; // an entry that does not fit its width, or too many elements without bytes
        }
        std::vector<unsigned char> readBack;
        bool all = false;
        Require(Read(text, schema, readBack, mode, all) && all, "what was written reads back");
        Require(readBack.size() == bytes.size(), "with as many bytes");

        // The last digits of a number may move, so the text is compared and not the bytes: after
        // a few rounds it must not fail at least.
        Require(BinaryToText(readBack, schema, text, mode), "and can be written again");
    }
    for (const SchemaTextMode mode :
         {SchemaTextModeBrief, SchemaTextModeRow, SchemaTextModeQuotedRow}) {
        std::string text;
        static_cast<void>(BinaryToText(bytes, schema, text, mode)); // must not throw
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const VSchemaThenBytes input = SplitInput(data, size);
    if (!input.good) {
        return 0;
    }
    const std::string text(input.rest, input.end);
    std::vector<unsigned char> bytes;
    bool all = false;
    if (Read(text, input.schema, bytes, input.mode, all)) {
        TryWriting(bytes, input.schema);
    }
    return 0;
}
