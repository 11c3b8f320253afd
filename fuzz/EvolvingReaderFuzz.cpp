// Takes any pair of schemas, one of which may be a random change of the other, and any bytes:
// compares the schemas, builds the reader, reads into an object of the current schema, and holds
// the result against a conversion through text.
//
// An input is four bytes, schema text up to a zero byte, and the rest. If the first of the four is
// 0, the rest starts with the text of the current schema up to a zero byte. Else the four are the
// seed of the change.

#include "io/EvolvingReaders.h"
#include "io/ISchema.h"
#include "io/InputStreamAdapter.h"
#include "io/NamedTypes.h"
#include "io/NativeReaders.h"
#include "io/SchemaComparison.h"
#include "io/SchemaMutation.h"
#include "io/SchemaObject.h"
#include "io/SchemaShape.h"
#include "io/SchemaText.h"
#include "io/SkipReaders.h"
#include "io/TextModel.h"
#include "io/ValueConversion.h"
#include "io/VectorReader.h"

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <set>
#include <stdexcept>
#include <string>
#include <vector>

using namespace KVR;
using namespace KVR::IO;

namespace {

constexpr std::size_t seedBytes = 4;

void Require(bool holds, const char* what)
{
    if (!holds) {
        std::fprintf(stderr, "does not hold: %s\n", what);
        std::abort();
    }
}

struct VInput
{
    ISchema stored;
    ISchema current;
    std::vector<unsigned char> bytes;
};

bool TakeSchema(const std::uint8_t*& begin, const std::uint8_t* end, ISchema& schema)
{
    const std::uint8_t* const zero = std::find(begin, end, std::uint8_t{0});
    if (zero == end) {
        return false;
    }
    const std::string text(begin, zero);
    const char* cursor = text.c_str();
    begin = zero + 1;
    return ReadSchemaText(schema, cursor);
}

bool TakeInput(const std::uint8_t* data, std::size_t size, VInput& input)
{
    if (size < seedBytes) {
        return false;
    }
    std::uint32_t seed = 0;
    std::memcpy(&seed, data, seedBytes);
    const std::uint8_t* begin = data + seedBytes;
    const std::uint8_t* const end = data + size;
    if (!TakeSchema(begin, end, input.stored)) {
        return false;
    }
    if (*data == 0) {
        if (!TakeSchema(begin, end, input.current)) {
            return false;
        }
    } else {
        input.current = input.stored;
        VSchemaMutation mutation(seed);
        mutation.ChangeReadably(input.current);
        if (seed % 8 == 1) {
            mutation.ChangeAnything(input.current);
        }
    }
    input.bytes.assign(begin, end);
    return true;
}

template <typename Holds>
bool HoldsAnywhere(const ISchema& schema, Holds holds)
{
    return holds(schema) || std::any_of(schema.SubSchemas.begin(), schema.SubSchemas.end(),
                                        [holds](const ISchema::SubSchema& part) {
                                            return HoldsAnywhere(part.second, holds);
                                        });
}

/// True if two members have one name: then the comparison and the reader pair other members.
bool HasSameNames(const ISchema& schema)
{
    return HoldsAnywhere(schema, [](const ISchema& part) {
        std::set<std::string> names;
        for (const ISchema::SubSchema& member : part.SubSchemas) {
            names.insert(member.first);
        }
        return part.Type == EType::NamedTuple && names.size() != part.SubSchemas.size();
    });
}

/// True if a list has not exactly one part, or what can have none has some. The comparison does not
/// tell of it, and of two such schemas nothing can be said.
bool HasOddParts(const ISchema& schema)
{
    return HoldsAnywhere(schema, [](const ISchema& part) {
        const bool isSequence = part.Type == EType::Array || part.Type == EType::List;
        const bool isTuple = part.Type == EType::Tuple || part.Type == EType::NamedTuple;
        return !isTuple && part.SubSchemas.size() != (isSequence ? 1 : 0);
    });
}

bool IsTidy(const ISchema& schema)
{
    return !HasSameNames(schema) && !HasOddParts(schema);
}

/// True if a list may have elements that no bytes stand behind, of which text takes more than
/// objects.
bool HasUnstoredElements(const ISchema& schema)
{
    return HoldsAnywhere(schema, [](const ISchema& part) {
        return part.Type == EType::List && Detail::TakesNoBytes(part.SubSchemas.front().second);
    });
}

/// True if an entry of an enum has a number that its width cannot keep.
bool HasGreatEntries(const ISchema& schema)
{
    const std::int32_t most = schema.Type == EType::Enum8    ? 0x7F
                              : schema.Type == EType::Enum16 ? 0x7FFF
                                                             : 0x7FFFFFFF;
    return std::any_of(schema.EnumValues.begin(), schema.EnumValues.end(),
                       [most](const ISchema::EnumValue& entry) {
                           return entry.second > most || entry.second < -most - 1;
                       });
}

/// True if the text of a value does not bring back the same bytes, or may be megabytes long.
bool IsLossyAsText(const ISchema& schema)
{
    return HasUnstoredElements(schema) || HoldsAnywhere(schema, [](const ISchema& part) {
               std::set<std::string> names;
               for (const ISchema::EnumValue& entry : part.EnumValues) {
                   names.insert(entry.first);
               }
               return part.Type == EType::Float32 || part.Type == EType::Float64 ||
                      part.Count > 100 || names.size() != part.EnumValues.size() ||
                      HasGreatEntries(part) || (IsEnumType(part.Type) && part.EnumValues.empty());
           });
}

struct VResult
{
    bool good = false;
    std::uint64_t position = 0;
    std::vector<unsigned char> bytes;
};

VResult Read(IReaderCollapsable& reader, const VSchemaLayout& layout, const VInput& input)
{
    VSchemaObject object(layout);
    Detail::VVectorReader cursor(input.bytes);
    IInputStreamAdapter<Detail::VVectorReader> stream(&cursor);
    VResult result;
    result.good = reader.Read(stream, Detail::PlaceOf(object.Get(), reader));
    result.position = cursor.GetPosition();
    object.AppendTo(result.bytes);
    return result;
}

bool IsConvertible(const VInput& input)
{
    std::vector<std::string> warnings;
    std::vector<std::string> errors;
    CompareSchemas(input.stored, input.current, warnings, errors, "path");
    return errors.empty() && IsTidy(input.stored) && IsTidy(input.current);
}

/// True if readers of objects can do what conversions can: they cannot map narrow enums.
bool IsReadable(const VInput& input)
{
    std::vector<std::string> errors;
    Detail::FindUnmappableEnums(input.stored, input.current, errors, "path");
    return errors.empty();
}

/// Converts the value, without the bytes behind it, and holds the result against its text.
void TryConversion(const VInput& input)
{
    Detail::VVectorReader cursor(input.bytes);
    IInputStreamAdapter<Detail::VVectorReader> stream(&cursor);
    const std::shared_ptr<IReaderCollapsable> skip = BuildSkipReader(input.stored);
    std::vector<unsigned char> bytes = input.bytes;
    const bool isWhole = skip != nullptr && skip->Read(stream, nullptr);
    if (isWhole) {
        bytes.resize(cursor.GetPosition());
    }
    std::vector<unsigned char> result;
    const bool converted = ConvertValue(input.stored, bytes, input.current, result);
    Require(isWhole || !converted, "what is cut off cannot be converted");
    std::vector<unsigned char> expected;
    if (isWhole && !IsLossyAsText(input.stored) && !IsLossyAsText(input.current) &&
        ConvertThroughText(input.stored, bytes, input.current, expected)) {
        Require(converted, "what has a text can be converted");
        Require(expected == result, "the text gives what the conversion gives");
    }
}

void CompareWithText(const VInput& input, const VResult& result)
{
    if (IsLossyAsText(input.stored) || IsLossyAsText(input.current)) {
        return;
    }
    std::vector<unsigned char> expected;
    try {
        if (ConvertThroughText(input.stored, input.bytes, input.current, expected)) {
            Require(result.good, "what has a text can be read");
            Require(expected == result.bytes, "the text gives the same value");
        }
    } catch (const std::runtime_error&) {
        Require(!result.good, "what is cut off cannot be read");
    }
}

void TryNamedTypes(ISchema schema)
{
    std::vector<ISchema> dictionary;
    bool changed = false;
    const std::size_t count = ExtractNamedTypes(schema, dictionary, changed);
    Require(count == dictionary.size(), "each entry is counted");
    ResolveNamedTypes(schema, dictionary);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    VInput input;
    if (!TakeInput(data, size, input)) {
        return 0;
    }
    TryNamedTypes(input.stored);
    const VSchemaLayout layout(input.current);
    if (layout.isTooLarge) {
        return 0;
    }
    const bool isConvertible = IsConvertible(input);
    if (isConvertible) {
        TryConversion(input);
    }
    const bool isReadable = isConvertible && IsReadable(input);
    const std::shared_ptr<IReaderCollapsable> reader =
        BuildEvolvingReader(input.current, layout.MakeNode(0), input.stored);
    if (reader == nullptr) {
        Require(!isReadable, "what the comparison calls readable has a reader");
        return 0;
    }
    const VResult result = Read(*reader, layout, input);
    if (!isReadable) {
        return 0;
    }
    const std::shared_ptr<IReaderCollapsable> skip = BuildSkipReader(input.stored);
    Detail::VVectorReader cursor(input.bytes);
    IInputStreamAdapter<Detail::VVectorReader> stream(&cursor);
    if (result.good) {
        Require(skip->Read(stream, nullptr), "what was read can be skipped");
        Require(cursor.GetPosition() == result.position, "with as many bytes");
    }
    CompareWithText(input, result);
    return 0;
}
