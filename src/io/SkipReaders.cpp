#include "io/SkipReaders.h"

#include "io/IInputStream.h"
#include "io/ISchema.h"
#include "io/SchemaShape.h"

#include <algorithm>
#include <limits>
#include <utility>

namespace KVR {
namespace IO {

namespace {

using ReaderPointer = std::shared_ptr<IReaderCollapsable>;

constexpr std::uint64_t mostScratchBytes = std::uint64_t{1024} * 1024;

bool ReadCount(IInputStream& stream, std::uint32_t& count)
{
    return stream.Read(&count, sizeof(count));
}

bool SkipElements(IInputStream& stream, IReader& child, std::uint32_t count)
{
    for (std::uint32_t i = 0; i < count; ++i) {
        if (!child.Read(stream, nullptr)) {
            return false;
        }
    }
    return true;
}

/// How often the elements of a container are worth reading: those without bytes never fail and
/// consume nothing, so that one stands for all of them.
std::uint32_t MostElementsOf(const ISchema& element)
{
    return Detail::TakesNoBytes(element) ? 1 : std::numeric_limits<std::uint32_t>::max();
}

ReaderPointer BuildArray(const ISchema& schema, ReaderPointer child)
{
    const std::uint64_t size = std::uint64_t{child->FlatSize} * schema.Count;
    if (child->FlatSize != 0 && size <= std::numeric_limits<std::uint32_t>::max()) {
        return std::make_shared<VReaderSkipBytes>(static_cast<std::uint32_t>(size));
    }
    const std::uint32_t count =
        std::min(schema.Count, MostElementsOf(schema.SubSchemas.front().second));
    return std::make_shared<VReaderSkipArray>(std::move(child), count);
}

ReaderPointer BuildList(const ISchema& schema, ReaderPointer child)
{
    if (child->FlatSize != 0) {
        return std::make_shared<VReaderSkipContiguousVector>(child->FlatSize);
    }
    return std::make_shared<VReaderSkipContainer>(std::move(child),
                                                  MostElementsOf(schema.SubSchemas.front().second));
}

/// Builds a reader for every part, or returns false if one has none.
bool BuildParts(const ISchema& schema, std::vector<ReaderPointer>& parts)
{
    parts.reserve(schema.SubSchemas.size());
    for (const ISchema::SubSchema& part : schema.SubSchemas) {
        parts.push_back(BuildSkipReader(part.second));
        if (parts.back() == nullptr) {
            return false;
        }
    }
    return true;
}

} // namespace

bool VScratchBytes::Skip(IInputStream& stream, std::uint64_t size)
{
    const std::uint64_t block = std::min(size, mostScratchBytes);
    if (bytes.size() < block) {
        bytes.resize(static_cast<std::size_t>(block));
    }
    while (size > mostScratchBytes) {
        if (!stream.Read(bytes.data(), bytes.size())) {
            return false;
        }
        size -= mostScratchBytes;
    }
    return stream.Read(bytes.data(), static_cast<std::size_t>(size));
}

VReaderSkipBytes::VReaderSkipBytes(std::uint32_t size)
{
    DestinationOffset = 0;
    FlatSize = size;
}

bool VReaderSkipBytes::Read(IInputStream& stream, void*)
{
    return scratch.Skip(stream, FlatSize);
}

VReaderSkipBytesNoCollapse::VReaderSkipBytesNoCollapse(std::uint32_t size_) : size(size_) {}

bool VReaderSkipBytesNoCollapse::Read(IInputStream& stream, void*)
{
    return scratch.Skip(stream, size);
}

VReaderSkipArray::VReaderSkipArray(ReaderPointer child_, std::uint32_t count_)
    : child(std::move(child_)), count(count_)
{
}

bool VReaderSkipArray::Read(IInputStream& stream, void*)
{
    return SkipElements(stream, *child, count);
}

VReaderSkipContiguousVector::VReaderSkipContiguousVector(std::uint32_t elementSize_)
    : elementSize(elementSize_)
{
}

bool VReaderSkipContiguousVector::Read(IInputStream& stream, void*)
{
    std::uint32_t count = 0;
    return ReadCount(stream, count) && scratch.Skip(stream, std::uint64_t{elementSize} * count);
}

VReaderSkipContainer::VReaderSkipContainer(ReaderPointer child_, std::uint32_t mostElements_)
    : child(std::move(child_)), mostElements(mostElements_)
{
}

bool VReaderSkipContainer::Read(IInputStream& stream, void*)
{
    std::uint32_t count = 0;
    return ReadCount(stream, count) && SkipElements(stream, *child, std::min(count, mostElements));
}

VReaderSkipTuple::VReaderSkipTuple(std::vector<ReaderPointer> members_)
    : members(std::move(members_))
{
}

bool VReaderSkipTuple::Read(IInputStream& stream, void*)
{
    return std::all_of(members.begin(), members.end(), [&stream](const ReaderPointer& member) {
        return member->Read(stream, nullptr);
    });
}

ReaderPointer BuildSkipReader(const ISchema& schema)
{
    const bool needsOnePart = schema.Type == EType::Array || schema.Type == EType::List;
    std::vector<ReaderPointer> parts;
    if ((needsOnePart && schema.SubSchemas.size() != 1) || !BuildParts(schema, parts)) {
        return nullptr;
    }

    switch (schema.Type) {
    case EType::Void:
        return std::make_shared<VReaderSkipBytes>(0);
    case EType::Bool:
    case EType::Int8:
    case EType::UInt8:
    case EType::Enum8:
        return std::make_shared<VReaderSkipBytes>(1);
    case EType::Int16:
    case EType::UInt16:
    case EType::Enum16:
        return std::make_shared<VReaderSkipBytes>(2);
    case EType::Int32:
    case EType::UInt32:
    case EType::Float32:
    case EType::Enum32:
        return std::make_shared<VReaderSkipBytes>(4);
    case EType::Int64:
    case EType::UInt64:
    case EType::Float64:
        return std::make_shared<VReaderSkipBytes>(8);
    case EType::String:
        return std::make_shared<VReaderSkipContiguousVector>(1);
    case EType::Array:
        return BuildArray(schema, std::move(parts.front()));
    case EType::List:
        return BuildList(schema, std::move(parts.front()));
    case EType::Tuple:
    case EType::NamedTuple:
    case EType::Ref:
        break;
    }
    // Also for numbers that are no type: whatever its parts are, they were stored in order.
    return std::make_shared<VReaderSkipTuple>(std::move(parts));
}

} // namespace IO
} // namespace KVR
