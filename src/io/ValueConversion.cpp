#include "io/ValueConversion.h"

#include "io/BinaryLayout.h"
#include "io/EnumMapping.h"
#include "io/InputStreamAdapter.h"
#include "io/SchemaComparison.h"
#include "io/SchemaShape.h"
#include "io/SkipReaders.h"
#include "io/VectorReader.h"

#include <algorithm>
#include <limits>
#include <map>
#include <stdexcept>
#include <string>
#include <unordered_map>
#include <utility>

namespace KVR {
namespace IO {

namespace {

using ByteVector = std::vector<unsigned char>;

// A new array of a great count, in the elements of a list, could ask for any number.
constexpr std::size_t mostBytes = std::size_t{256} * 1024 * 1024;

unsigned WidthOf(EType type)
{
    switch (type) {
    case EType::Bool:
    case EType::Int8:
    case EType::UInt8:
        return 1;
    case EType::Int16:
    case EType::UInt16:
        return 2;
    case EType::Int32:
    case EType::UInt32:
    case EType::Float32:
        return 4;
    default:
        return 8;
    }
}

bool IsNumber(EType type)
{
    return type >= EType::Bool && type <= EType::Float64;
}

/// The number of a new enum: 0 need not be one of its entries.
std::int32_t NewNumber(const ISchema& schema)
{
    return schema.EnumValues.empty() ? 0 : schema.EnumValues.front().second;
}

bool AppendNew(ByteVector& bytes, const ISchema& schema);

/// Appends as many new elements as an array has, all alike.
bool AppendNewArray(ByteVector& bytes, const ISchema& schema)
{
    ByteVector element;
    if (schema.SubSchemas.size() != 1 || !AppendNew(element, schema.SubSchemas.front().second)) {
        return false;
    }
    if (element.size() > mostBytes / std::max<std::size_t>(schema.Count, 1)) {
        return false;
    }
    for (std::uint32_t i = 0; i < schema.Count && !element.empty(); ++i) {
        bytes.insert(bytes.end(), element.begin(), element.end());
    }
    return true;
}

/// Appends the value of a member that was not stored.
bool AppendNew(ByteVector& bytes, const ISchema& schema)
{
    if (IsEnumType(schema.Type)) {
        return Detail::AppendEnum(bytes, schema.Type, NewNumber(schema));
    }
    if (schema.Type == EType::Array) {
        return AppendNewArray(bytes, schema);
    }
    if (schema.Type == EType::Tuple || schema.Type == EType::NamedTuple) {
        return std::all_of(schema.SubSchemas.begin(), schema.SubSchemas.end(),
                           [&bytes](const ISchema::SubSchema& member) {
                               return AppendNew(bytes, member.second) && bytes.size() <= mostBytes;
                           });
    }
    const bool hasLength = schema.Type == EType::String || schema.Type == EType::List;
    const unsigned width = hasLength               ? sizeof(std::uint32_t)
                           : IsNumber(schema.Type) ? WidthOf(schema.Type)
                                                   : 0;
    bytes.insert(bytes.end(), width, 0);
    return true;
}

/// Converts one value, of which it reads the parts in stored order.
class VValueConversion
{
public:
    explicit VValueConversion(Detail::VVectorReader& cursor_) : cursor(cursor_) {}

    bool Convert(const ISchema& stored, const ISchema& current, ByteVector& result)
    {
        if (result.size() > mostBytes) {
            return false;
        }
        if (IsEnumType(stored.Type)) {
            return ConvertEnum(stored, current, result);
        }
        if (IsNumber(stored.Type)) {
            ConvertNumber(stored.Type, current.Type, result);
            return true;
        }
        switch (stored.Type) {
        case EType::String:
            return ConvertString(result);
        case EType::Array:
            return ConvertElements(stored, current, stored.Count, result);
        case EType::List: {
            const auto count = cursor.Read<std::uint32_t>();
            Detail::AppendNumber(result, count);
            return ConvertElements(stored, current, count, result);
        }
        case EType::Tuple:
            return ConvertTuple(stored, current, result);
        case EType::NamedTuple:
            return ConvertMembers(stored, current, result);
        default:
            return false;
        }
    }

private:
    void ConvertNumber(EType stored, EType current, ByteVector& result)
    {
        if (stored == current && stored != EType::Bool) {
            const unsigned char* const bytes = cursor.Take(WidthOf(stored));
            result.insert(result.end(), bytes, bytes + WidthOf(stored));
        } else if (stored == EType::Float32) {
            Detail::AppendNumber(result, static_cast<double>(cursor.Read<float>()));
        } else if (stored == EType::Float64) {
            Detail::AppendNumber(result, static_cast<float>(cursor.Read<double>()));
        } else {
            // A wider number is the stored one with its sign in front, of which it keeps its width.
            const std::uint64_t wide = ReadInteger(stored);
            for (unsigned i = 0; i < WidthOf(current); ++i) {
                result.push_back(static_cast<unsigned char>(wide >> (8 * i)));
            }
        }
    }

    template <typename T>
    std::uint64_t ReadSigned()
    {
        return static_cast<std::uint64_t>(static_cast<std::int64_t>(cursor.Read<T>()));
    }

    std::uint64_t ReadInteger(EType type)
    {
        switch (type) {
        case EType::Bool:
            return cursor.Read<std::uint8_t>() != 0 ? 1 : 0;
        case EType::Int8:
            return ReadSigned<std::int8_t>();
        case EType::Int16:
            return ReadSigned<std::int16_t>();
        case EType::Int32:
            return ReadSigned<std::int32_t>();
        case EType::UInt8:
            return cursor.Read<std::uint8_t>();
        case EType::UInt16:
            return cursor.Read<std::uint16_t>();
        case EType::UInt32:
            return cursor.Read<std::uint32_t>();
        default:
            return cursor.Read<std::uint64_t>();
        }
    }

    std::int32_t ReadEnum(EType type)
    {
        return type == EType::Enum8    ? cursor.Read<std::int8_t>()
               : type == EType::Enum16 ? cursor.Read<std::int16_t>()
                                       : cursor.Read<std::int32_t>();
    }

    bool ConvertEnum(const ISchema& stored, const ISchema& current, ByteVector& result)
    {
        std::int32_t number = ReadEnum(stored.Type);
        const EnumMapping& mapping = MappingOf(stored, current);
        if (!mapping.empty()) {
            const auto found = mapping.find(number);
            if (found == mapping.end()) {
                return false;
            }
            number = found->second;
        }
        return FitsEnum(number, current.Type) && Detail::AppendEnum(result, current.Type, number);
    }

    static bool FitsEnum(std::int32_t number, EType type)
    {
        switch (type) {
        case EType::Enum8:
            return number >= std::numeric_limits<std::int8_t>::min() &&
                   number <= std::numeric_limits<std::uint8_t>::max();
        case EType::Enum16:
            return number >= std::numeric_limits<std::int16_t>::min() &&
                   number <= std::numeric_limits<std::uint16_t>::max();
        default:
            return true;
        }
    }

    /// Each pair of enums is mapped once, however long the list is that holds them.
    const EnumMapping& MappingOf(const ISchema& stored, const ISchema& current)
    {
        const auto inserted = mappings.try_emplace({&stored, &current});
        if (inserted.second) {
            std::vector<std::string> errors;
            BuildEnumMapping(stored, current, inserted.first->second, errors);
        }
        return inserted.first->second;
    }

    bool ConvertString(ByteVector& result)
    {
        std::string text;
        return cursor.ReadString(text) && Detail::AppendString(result, text);
    }

    bool ConvertElements(const ISchema& stored, const ISchema& current, std::uint32_t count,
                         ByteVector& result)
    {
        if (stored.SubSchemas.size() != 1 || current.SubSchemas.size() != 1) {
            return false;
        }
        const ISchema& element = stored.SubSchemas.front().second;
        if (Detail::TakesNoBytes(element) && count > Detail::MostElementsWithoutBytes) {
            return false;
        }
        for (std::uint32_t i = 0; i < count; ++i) {
            if (!Convert(element, current.SubSchemas.front().second, result)) {
                return false;
            }
        }
        return true;
    }

    bool ConvertTuple(const ISchema& stored, const ISchema& current, ByteVector& result)
    {
        if (stored.SubSchemas.size() != current.SubSchemas.size()) {
            return false;
        }
        for (std::size_t i = 0; i < stored.SubSchemas.size(); ++i) {
            if (!Convert(stored.SubSchemas[i].second, current.SubSchemas[i].second, result)) {
                return false;
            }
        }
        return true;
    }

    /// Members come in stored order and go in the current one, so each is kept until all were read.
    bool ConvertMembers(const ISchema& stored, const ISchema& current, ByteVector& result)
    {
        std::vector<std::pair<bool, ByteVector>> members(current.SubSchemas.size());
        const Detail::VMemberIndex& currentMembers =
            memberIndices.try_emplace(&current, current).first->second;
        for (const ISchema::SubSchema& member : stored.SubSchemas) {
            const std::size_t index = currentMembers.Find(member.first);
            if (index == Detail::NoMember) {
                if (!Skip(member.second)) {
                    return false;
                }
                continue;
            }
            members[index].first = true;
            members[index].second.clear();
            if (!Convert(member.second, current.SubSchemas[index].second, members[index].second)) {
                return false;
            }
        }
        return AppendMembers(current, members, result);
    }

    static bool AppendMembers(const ISchema& current,
                              const std::vector<std::pair<bool, ByteVector>>& members,
                              ByteVector& result)
    {
        for (std::size_t i = 0; i < members.size(); ++i) {
            const ByteVector& bytes = members[i].second;
            result.insert(result.end(), bytes.begin(), bytes.end());
            const bool isNew = !members[i].first;
            if ((isNew && !AppendNew(result, current.SubSchemas[i].second)) ||
                result.size() > mostBytes) {
                return false;
            }
        }
        return true;
    }

    bool Skip(const ISchema& stored)
    {
        const std::shared_ptr<IReaderCollapsable> reader = BuildSkipReader(stored);
        IInputStreamAdapter<Detail::VVectorReader> stream(&cursor);
        return reader != nullptr && reader->Read(stream, nullptr);
    }

    Detail::VVectorReader& cursor;
    std::map<std::pair<const ISchema*, const ISchema*>, EnumMapping> mappings;
    std::unordered_map<const ISchema*, Detail::VMemberIndex> memberIndices;
};

} // namespace

bool ConvertValue(const ISchema& stored, const std::vector<unsigned char>& bytes,
                  const ISchema& current, std::vector<unsigned char>& result)
{
    result.clear();
    Detail::VVectorReader cursor(bytes);
    try {
        return VValueConversion(cursor).Convert(stored, current, result) &&
               cursor.GetPosition() == bytes.size();
    } catch (const std::runtime_error&) {
        return false; // the bytes end before the value
    }
}

} // namespace IO
} // namespace KVR
