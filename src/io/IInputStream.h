#pragma once

#include <cstddef>
#include <utility>
#include <vector>

namespace KVR {

/// The source of bytes for readers of stored values.
///
/// A failed read leaves the stream wherever it stopped; nothing throws. Threads: one thread.
class IInputStream
{
public:
    /// Where to copy bytes to, and how many.
    using Part = std::pair<void*, std::size_t>;

    virtual ~IInputStream() = default;

    /// Copies `count` bytes; a count of 0 needs no destination.
    ///
    /// @return true if that many bytes were copied
    virtual bool Read(void* destination, std::size_t count) = 0;

    /// True if more was asked for than there is. A stream exactly at its end is not past it.
    virtual bool IsPastEnd() const = 0;

    /// Fills the parts in order and stops at the first that fails.
    ///
    /// @return true if all were filled
    virtual bool ReadParts(const std::vector<Part>& parts);

    /// True if the stream can be moved to another place; no stream of this library can.
    virtual bool IsSeekable() const;
};

} // namespace KVR
