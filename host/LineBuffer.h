#pragma once

#include <cstddef>
#include <optional>
#include <string>

namespace QuorixHost {

/// Cuts a stream of bytes into lines and never keeps more than one line of the longest allowed
/// length.
///
/// A line ends with a line feed, before which a carriage return is dropped, or with the stream.
class VLineBuffer
{
public:
    /// A line that came, or the place of one that was too long to keep.
    struct VLine
    {
        std::string text;
        bool tooLong = false;
    };

    explicit VLineBuffer(std::size_t maximumBytes) : maximumBytes(maximumBytes) {}

    /// Takes bytes of the stream, which must outlive the calls of TakeLine up to the next Append.
    void Append(const char* bytes, std::size_t size);

    /// @return the next line, or empty until more bytes come
    std::optional<VLine> TakeLine();

    /// Ends the stream. @return what came behind the last line feed, empty if nothing did
    std::optional<VLine> TakeLastLine();

private:
    void Keep(const char* bytes, std::size_t size);
    VLine Finish();

    std::size_t maximumBytes;
    const char* next = nullptr; // bytes given to Append and not yet looked at
    std::size_t left = 0;
    VLine line; // so far
};

} // namespace QuorixHost
