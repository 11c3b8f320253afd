// Reads any text as a schema. What was read must survive every mode that reads back, and a text
// that fails must leave the value's schema alone. Nothing is interned, since that is for ever.

#include "io/DataValue.h"
#include "io/ISchema.h"
#include "io/SchemaEquality.h"
#include "io/SchemaText.h"

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>

using namespace KVR::IO;

namespace {

void Require(bool holds, const char* what)
{
    if (!holds) {
        std::fprintf(stderr, "does not hold: %s\n", what);
        std::abort();
    }
}

bool HasTab(const std::string& text)
{
    return text.find('\t') != std::string::npos;
}

/// True if a name or a text holds a tab, which grows by a "t" with each write and read.
bool HasTab(const ISchema& schema)
{
    const auto namedSo = [](const auto& pair) { return HasTab(pair.first); };
    return HasTab(schema.TypeName) ||
           std::any_of(schema.EnumValues.begin(), schema.EnumValues.end(), namedSo) ||
           std::any_of(schema.SubSchemas.begin(), schema.SubSchemas.end(), namedSo) ||
           std::any_of(schema.Docs.begin(), schema.Docs.end(),
                       [](const std::string& text) { return HasTab(text); }) ||
           std::any_of(schema.SubSchemas.begin(), schema.SubSchemas.end(),
                       [](const ISchema::SubSchema& part) { return HasTab(part.second); });
}

std::size_t LevelsOf(const ISchema& schema)
{
    std::size_t levels = 0;
    for (const ISchema::SubSchema& part : schema.SubSchemas) {
        levels = std::max(levels, LevelsOf(part.second));
    }
    return levels + 1;
}

void TryModes(const ISchema& schema)
{
    for (const SchemaTextMode mode :
         {SchemaTextModePositional, SchemaTextModeNamed, SchemaTextModeBrief}) {
        std::string text;
        Require(WriteSchemaText(text, schema, mode), "every schema has a text");

        ISchema readBack;
        const char* cursor = text.c_str();
        Require(ReadSchemaText(readBack, cursor), "what was written reads back");
        Require(cursor == text.c_str() + text.size(), "and is read to its end");
        if (!HasTab(schema)) {
            Require(StrictlyEqual(schema, readBack), "the same schema reads back");
            Require(RoleAwareEqual(schema, readBack), "strictly equal is equal");
            Require(StrictHash(schema) == StrictHash(readBack), "equal schemas have one hash");
            Require(schema.Docs == readBack.Docs && schema.Detail == readBack.Detail,
                    "members that equality leaves out read back");
        }
    }
}

void TryFailure(const std::string& text)
{
    const ISchema schemaBefore;
    VDataValue value;
    value.Schema = &schemaBefore;
    value.Bytes = {1};
    Require(!ParseSchemaText(value, text.c_str()), "a text fails the same way each time");
    Require(value.Schema == &schemaBefore, "a failure leaves the schema");
    Require(value.Bytes.empty(), "the bytes are emptied first");
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const std::string text(data, data + size);
    const char* const begin = text.c_str();
    const char* cursor = begin;
    ISchema schema;
    const bool good = ReadSchemaText(schema, cursor);

    Require(cursor >= begin && cursor <= begin + text.size(), "the cursor stays in the text");
    if (good) {
        Require(LevelsOf(schema) <= 256, "the levels are bounded");
        TryModes(schema);
    } else {
        TryFailure(text);
    }
    return 0;
}
