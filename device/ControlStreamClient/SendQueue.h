#pragma once

#include <cstddef>
#include <deque>
#include <string>

namespace ControlStream {

/// Frames on their way out, as one run of bytes, so that many small ones leave in one system call.
///
/// It knows where its frames end: what has not begun to leave can still be taken back.
/// Threads: a plain object.
class VSendQueue
{
public:
    /// Appends a frame with this text, which must not be longer than a frame can be.
    void Add(const std::string& text);

    bool IsEmpty() const { return sent == bytes.size(); }

    /// What is to leave next, valid until the next operation.
    const char* Data() const { return bytes.data() + sent; }
    std::size_t Size() const { return bytes.size() - sent; }

    /// Tells that the first `count` bytes have left.
    void Advance(std::size_t count);

    /// Takes back all that has not begun to leave.
    ///
    /// @return false where a frame has left in part, whose rest stays: without it the stream is
    ///         broken for good
    bool DropUnsent();

    void Clear();

private:
    std::string bytes;
    std::size_t sent = 0;
    std::deque<std::size_t> frameEnds; // in `bytes`, of frames that have not left whole
    bool begun = false;                // whether the first of them has left in part
};

} // namespace ControlStream
