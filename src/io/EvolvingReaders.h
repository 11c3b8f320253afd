#pragma once

#include "io/EnumMapping.h"
#include "io/IReader.h"

#include <cstdint>
#include <memory>

namespace KVR {
namespace IO {

struct ISchema;
struct ReaderBuildNode;

/// Reads an enum whose numbers changed since the value was written.
///
/// Deliberate: it reads and writes 4 bytes, whatever the width of either enum. It is right only for
/// enums that are stored, and held, in 32 bits; readers of such files rely on it, and those who
/// read narrower ones must refuse them before.
class VReaderMappedEnum : public IReaderCollapsable
{
public:
    VReaderMappedEnum(EnumMapping mapping, std::uint64_t destinationOffset);

    /// @return false, with `destination` untouched, for a number that the mapping does not know;
    ///         its 4 bytes are consumed
    bool Read(IInputStream& stream, void* destination) override;

private:
    const EnumMapping mapping;
};

/// Builds a reader for a value that was stored under exactly the current schema.
///
/// @return null if a part has no reader, or if `node` has another number of parts than the schema
/// @throws boost::bad_function_call if a node has no `MakeReader` [any]
std::shared_ptr<IReaderCollapsable> BuildReader(const ISchema& current,
                                                const ReaderBuildNode& node);

/// Builds a reader that fills an object of the current type from a value stored under `stored`. It
/// follows the stored order; members that the current type has lost are stepped over, and members
/// that it has gained keep what the object holds.
///
/// What CompareSchemas calls an error need not give null here. Of an array whose length changed the
/// reader reads as many elements as the current type has, so ask CompareSchemas first.
///
/// @return null if the value cannot be read
/// @throws boost::bad_function_call if a node that is needed has no `MakeReader` [any]
std::shared_ptr<IReaderCollapsable>
BuildEvolvingReader(const ISchema& current, const ReaderBuildNode& node, const ISchema& stored);

} // namespace IO
} // namespace KVR
