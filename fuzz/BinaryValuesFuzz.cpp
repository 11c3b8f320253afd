// Takes any bytes for a value of any schema: skips it, writes it in every mode, and compares how
// far each of them came.

#include "SchemaThenBytes.h"

#include "io/ISchema.h"
#include "io/InputStreamAdapter.h"
#include "io/SchemaShape.h"
#include "io/SkipReaders.h"
#include "io/ValueText.h"
#include "io/VectorReader.h"

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

using namespace KVR;
using namespace KVR::IO;

namespace {

void Require(bool holds, const char* what)
{
    if (!holds) {
        std::fprintf(stderr, "does not hold: %s\n", what);
        std::abort();
    }
}

/// Writes a value and tells whether that worked; `cutOff` tells of the exception for missing bytes.
bool Write(const std::vector<unsigned char>& bytes, const ISchema& schema, SchemaTextMode mode,
           std::string& text, bool& cutOff)
{
    cutOff = false;
    try {
        return BinaryToText(bytes, schema, text, mode);
    } catch (const std::runtime_error& error) {
        Require(std::strcmp("Unexpected end of binary data", error.what()) == 0,
                "no other exception");
        cutOff = true;
        return false;
    }
}

void TryMode(const std::vector<unsigned char>& bytes, const ISchema& schema, SchemaTextMode mode,
             bool skipped, std::uint64_t size)
{
    std::string text;
    bool cutOff = false;
    const bool written = Write(bytes, schema, mode, text, cutOff);
    Require(!written || skipped, "what can be written can be skipped");
    Require(!cutOff || !skipped, "what can be skipped is not cut off");
    if (written && mode <= SchemaTextModeNamed) {
        std::vector<unsigned char> readBack;
        const char* begin = text.data();
        Require(TextToBinary(begin, begin + text.size(), schema, readBack, mode),
                "what was written reads back");
        Require(readBack.size() == size, "with as many bytes as were skipped");
    }
}

/// True if a few bytes may become megabytes of text, which are worth writing once, not five times.
bool HasElementsWithoutBytes(const ISchema& schema)
{
    const bool repeats = schema.Type == EType::Array || schema.Type == EType::List;
    return std::any_of(schema.SubSchemas.begin(), schema.SubSchemas.end(),
                       [repeats](const ISchema::SubSchema& part) {
                           return (repeats && Detail::TakesNoBytes(part.second)) ||
                                  HasElementsWithoutBytes(part.second);
                       });
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const VSchemaThenBytes input = SplitInput(data, size);
    if (!input.good) {
        return 0;
    }
    const std::vector<unsigned char> bytes(input.rest, input.end);
    const std::shared_ptr<IReaderCollapsable> reader = BuildSkipReader(input.schema);
    if (reader == nullptr) {
        std::string text;
        Require(!BinaryToText(bytes, input.schema, text), "what has no layout has no text");
        return 0;
    }

    Detail::VVectorReader cursor(bytes);
    IInputStreamAdapter<Detail::VVectorReader> stream(&cursor);
    const bool skipped = reader->Read(stream, nullptr);
    Require(skipped != stream.IsPastEnd(), "a skip fails exactly at the end of the bytes");
    TryMode(bytes, input.schema, input.mode, skipped, cursor.GetPosition());
    if (!HasElementsWithoutBytes(input.schema)) {
        for (int mode = 0; mode <= 4; ++mode) {
            TryMode(bytes, input.schema, SchemaTextMode(mode), skipped, cursor.GetPosition());
        }
    }
    return 0;
}
