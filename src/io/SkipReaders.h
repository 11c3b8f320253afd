#pragma once

#include "io/IReader.h"

#include <cstddef>
#include <memory>
#include <vector>

namespace KVR {
namespace IO {

struct ISchema;

/// A scratch buffer for bytes that nobody wants. It never grows beyond 1 MiB, as a damaged count
/// can ask for 32 GiB: a longer run is read in blocks of that size.
class VScratchBytes
{
public:
    /// Reads `size` bytes, with one read if they fit the buffer.
    bool Skip(IInputStream& stream, std::uint64_t size);

private:
    std::vector<unsigned char> bytes;
};

/// Steps over a fixed number of bytes, and may be folded into a larger run.
class VReaderSkipBytes : public IReaderCollapsable
{
public:
    explicit VReaderSkipBytes(std::uint32_t size);
    bool Read(IInputStream& stream, void* destination) override;

private:
    VScratchBytes scratch;
};

/// Steps over a fixed number of bytes that have no place in the destination. A parent must not fold
/// them into a flat copy with their neighbours, and therefore sees no flat size.
class VReaderSkipBytesNoCollapse : public IReaderCollapsable
{
public:
    explicit VReaderSkipBytesNoCollapse(std::uint32_t size);
    bool Read(IInputStream& stream, void* destination) override;

private:
    const std::uint32_t size;
    VScratchBytes scratch;
};

/// Steps over a fixed number of elements, one by one.
class VReaderSkipArray : public IReaderCollapsable
{
public:
    VReaderSkipArray(std::shared_ptr<IReaderCollapsable> child, std::uint32_t count);
    bool Read(IInputStream& stream, void* destination) override;

private:
    const std::shared_ptr<IReaderCollapsable> child;
    const std::uint32_t count;
};

/// Steps over a stored count and so many elements of a fixed size, as one run.
class VReaderSkipContiguousVector : public IReaderCollapsable
{
public:
    explicit VReaderSkipContiguousVector(std::uint32_t elementSize);
    bool Read(IInputStream& stream, void* destination) override;

private:
    const std::uint32_t elementSize;
    VScratchBytes scratch;
};

/// Steps over a stored count and so many elements, one by one.
class VReaderSkipContainer : public IReaderCollapsable
{
public:
    /// @param mostElements  how often the child is called at most, for elements without bytes: a
    ///                      stored count of four milliards would be waited for in vain
    explicit VReaderSkipContainer(std::shared_ptr<IReaderCollapsable> child,
                                  std::uint32_t mostElements = ~std::uint32_t{0});
    bool Read(IInputStream& stream, void* destination) override;

private:
    const std::shared_ptr<IReaderCollapsable> child;
    const std::uint32_t mostElements;
};

/// Steps over the members of a tuple in order. It never reports a flat size, so that an array of
/// tuples stays an array.
class VReaderSkipTuple : public IReaderCollapsable
{
public:
    explicit VReaderSkipTuple(std::vector<std::shared_ptr<IReaderCollapsable>> members);
    bool Read(IInputStream& stream, void* destination) override;

private:
    const std::vector<std::shared_ptr<IReaderCollapsable>> members;
};

/// Returns a reader that consumes a value stored under `schema` and discards it, or null if an
/// Array or a List in it has not exactly one part. The reader keeps nothing of `schema`. [any]
std::shared_ptr<IReaderCollapsable> BuildSkipReader(const ISchema& schema);

} // namespace IO
} // namespace KVR
