#pragma once

#include "io/IReader.h"
#include "io/ISchema.h"

#include <boost/function.hpp>

#include <cstdint>
#include <memory>
#include <vector>

namespace KVR {
namespace IO {

/// What the maker of a reader is told.
struct ReaderBuildContext
{
    EType StoredType = EType::Void; ///< the type under which the part was written

    /// The readers of the parts, in the order in which they were written. A part that the current
    /// type no longer has is among them as a reader that skips it.
    std::vector<std::shared_ptr<IReaderCollapsable>> Children;

    std::uint64_t Offset = 0; ///< of the node
};

/// Says how to read one part of a native type. Built by the code that owns the type, as a tree.
///
/// A reader is given the address of its own part: its parent adds `Offset`.
struct ReaderBuildNode
{
    std::uint64_t Offset = 0; ///< the place of this part within its parent's object

    /// Makes the reader, or returns null if it cannot read the stored type. Calling an empty one
    /// throws boost::bad_function_call.
    boost::function<std::shared_ptr<IReaderCollapsable>(const ReaderBuildContext&)> MakeReader;

    std::vector<ReaderBuildNode> Children; ///< one for each member, in the current schema's order
};

} // namespace IO
} // namespace KVR
