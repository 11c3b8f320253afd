#include "io/EvolvingReaders.h"

#include "io/IInputStream.h"
#include "io/ReaderBuildNode.h"
#include "io/SchemaComparison.h"
#include "io/SkipReaders.h"

#include <cstring>
#include <string>
#include <utility>

namespace KVR {
namespace IO {

namespace {

using ReaderPointer = std::shared_ptr<IReaderCollapsable>;

ReaderBuildContext MakeContext(EType storedType, const ReaderBuildNode& node)
{
    ReaderBuildContext context;
    context.StoredType = storedType;
    context.Offset = node.Offset;
    return context;
}

/// Appends a reader, or returns false if there is none.
bool Append(std::vector<ReaderPointer>& readers, ReaderPointer reader)
{
    if (reader == nullptr) {
        return false;
    }
    readers.push_back(std::move(reader));
    return true;
}

/// Builds a reader that steps over a member which the current type has lost. Its bytes are in the
/// stream and have no place in the object, so it must never look like a neighbour to be copied with
/// the others.
ReaderPointer BuildRemovedMember(const ISchema& stored)
{
    ReaderPointer reader = BuildSkipReader(stored);
    if (reader != nullptr && reader->FlatSize != 0) {
        reader = std::make_shared<VReaderSkipBytesNoCollapse>(reader->FlatSize);
    }
    return reader;
}

ReaderPointer BuildMember(const ISchema& current, std::size_t index, const ReaderBuildNode& node,
                          const ISchema::SubSchema& stored)
{
    if (index == Detail::NoMember) {
        return BuildRemovedMember(stored.second);
    }
    if (index >= node.Children.size()) {
        return nullptr;
    }
    return BuildEvolvingReader(current.SubSchemas[index].second, node.Children[index],
                               stored.second);
}

bool BuildMembers(const ISchema& current, const ReaderBuildNode& node, const ISchema& stored,
                  std::vector<ReaderPointer>& readers)
{
    const Detail::VMemberIndex currentMembers(current);
    for (const ISchema::SubSchema& member : stored.SubSchemas) {
        const std::size_t index = currentMembers.Find(member.first);
        if (!Append(readers, BuildMember(current, index, node, member))) {
            return false;
        }
    }
    return true;
}

bool BuildParts(const ISchema& current, const ReaderBuildNode& node, const ISchema& stored,
                std::vector<ReaderPointer>& readers)
{
    const std::size_t count = stored.SubSchemas.size();
    if (count != current.SubSchemas.size() || count > node.Children.size()) {
        return false;
    }
    for (std::size_t i = 0; i < count; ++i) {
        if (!Append(readers, BuildEvolvingReader(current.SubSchemas[i].second, node.Children[i],
                                                 stored.SubSchemas[i].second))) {
            return false;
        }
    }
    return true;
}

} // namespace

VReaderMappedEnum::VReaderMappedEnum(EnumMapping mapping_, std::uint64_t destinationOffset)
    : mapping(std::move(mapping_))
{
    DestinationOffset = destinationOffset;
}

bool VReaderMappedEnum::Read(IInputStream& stream, void* destination)
{
    std::int32_t stored = 0;
    if (!stream.Read(&stored, sizeof(stored))) {
        return false;
    }
    const auto found = mapping.find(stored);
    if (found == mapping.end()) {
        return false;
    }
    std::memcpy(destination, &found->second, sizeof(found->second));
    return true;
}

ReaderPointer BuildReader(const ISchema& current, const ReaderBuildNode& node)
{
    if (node.Children.size() != current.SubSchemas.size()) {
        return nullptr;
    }
    ReaderBuildContext context = MakeContext(current.Type, node);
    for (std::size_t i = 0; i < node.Children.size(); ++i) {
        if (!Append(context.Children,
                    BuildReader(current.SubSchemas[i].second, node.Children[i]))) {
            return nullptr;
        }
    }
    return node.MakeReader(context);
}

ReaderPointer BuildEvolvingReader(const ISchema& current, const ReaderBuildNode& node,
                                  const ISchema& stored)
{
    ReaderBuildContext context = MakeContext(stored.Type, node);
    if (stored.Type == EType::NamedTuple && current.Type == EType::NamedTuple) {
        if (!BuildMembers(current, node, stored, context.Children)) {
            return nullptr;
        }
    } else if (IsEnumType(stored.Type) && IsEnumType(current.Type)) {
        EnumMapping mapping;
        std::vector<std::string> errors;
        if (!BuildEnumMapping(stored, current, mapping, errors)) {
            return nullptr;
        }
        if (!mapping.empty()) {
            return std::make_shared<VReaderMappedEnum>(std::move(mapping), node.Offset);
        }
    } else if (!BuildParts(current, node, stored, context.Children)) {
        return nullptr;
    }
    return node.MakeReader(context);
}

} // namespace IO
} // namespace KVR
