#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace ControlStream {

/// The bytes of a frame's header: the length of the text, least significant byte first.
constexpr std::size_t FrameHeaderSize = 4;

/// Writes the header of a frame whose text has `length` bytes.
void WriteFrameHeader(std::uint32_t length, unsigned char (&header)[FrameHeaderSize]);

/// Cuts the stream that arrives into frames.
///
/// Memory follows what has arrived, never what a header announces. Owns: the bytes that are not
/// taken yet. Threads: a plain object. Failure: a header above the limit throws when it would be
/// taken, and every time after that: where the next frame begins is not known any more.
class VFrameBuffer
{
public:
    /// @param limit  the longest text that is accepted, in bytes
    explicit VFrameBuffer(std::uint32_t limit);

    struct VSpace
    {
        char* Data;
        std::size_t Size; // never 0
    };

    /// Returns room for bytes that arrive, valid until the next operation.
    VSpace GetSpace();

    /// Takes over the first `count` bytes of the room that GetSpace returned last.
    void Commit(std::size_t count);

    /// Moves the text of the oldest whole frame into `text`.
    ///
    /// @return false, with `text` unchanged, while there is none
    /// @throws VError  of the kind Protocol, for a frame above the limit
    bool Take(std::string& text);

    /// Whether so much waits here that reading on would only serve a host that floods.
    bool IsFull() const;

    /// Says for people how far the last frame has come; empty when nothing is missing of it.
    std::string DescribeRest() const;

    void Clear();

private:
    std::size_t Size() const { return end - begin; }
    bool ReadHeader(std::size_t position, std::uint32_t& length) const;

    const std::uint32_t frameLimit;
    std::vector<char> bytes;
    std::size_t begin = 0; // of what is not taken yet
    std::size_t end = 0;
};

} // namespace ControlStream
