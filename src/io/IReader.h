#pragma once

#include <cstdint>

namespace KVR {

class IInputStream;

/// Reads one stored value, or steps over it. Built once for a schema, it reads any number of
/// values.
///
/// Threads: one at a time, since a reader may hold a scratch buffer.
class IReader
{
public:
    /// Consumes one value; a reader that only skips ignores `destination`, which is null for it.
    ///
    /// @return false if the stream ended, which leaves stream and destination where they were then
    virtual bool Read(IInputStream& stream, void* destination) = 0;

    virtual ~IReader() = default;
};

/// A reader that tells its parent whether it may be folded into one larger run of bytes, so that
/// the parent can decide without knowing its class.
class IReaderCollapsable : public IReader
{
public:
    /// The offset of a reader whose data have no flat place in the destination.
    static constexpr std::uint64_t NoOffset = ~std::uint64_t{0};

    /// Where in the destination object the data land, or NoOffset.
    std::uint64_t DestinationOffset = NoOffset;

    /// How many bytes the reader consumes, if that is fixed and they can be taken as one run;
    /// 0 if not.
    std::uint32_t FlatSize = 0;
};

} // namespace KVR
