#pragma once

#include <cstdint>
#include <cstring>
#include <limits>
#include <string>
#include <type_traits>
#include <vector>

namespace KVR {
namespace IO {
namespace Detail {

/// A cursor over the bytes of a value, which it does not own: the vector must outlive it and keep
/// its size meanwhile.
///
/// A read first adds its width to the position. Where that leads beyond the bytes, the read fails
/// and the position stays beyond them, so that every later read fails too. Threads: one thread.
class VVectorReader
{
public:
    explicit VVectorReader(const std::vector<unsigned char>& bytes_) : bytes(bytes_) {}

    /// Reads a number of 1, 2, 4 or 8 bytes.
    ///
    /// @throws std::runtime_error "Unexpected end of binary data"
    template <typename T>
    T Read()
    {
        static_assert(std::is_arithmetic<T>::value && !std::is_same<T, bool>::value,
                      "a stored bool is an std::uint8_t, of which 2 to 255 are no valid bool");
        T number;
        std::memcpy(&number, Take(sizeof(T)), sizeof(T));
        return number;
    }

    /// Reads `count` bytes at once and returns where they are.
    ///
    /// @throws std::runtime_error "Unexpected end of binary data"
    const unsigned char* Take(std::uint64_t count)
    {
        if (!Advance(count)) {
            ThrowUnexpectedEnd();
        }
        return BytesBehind(count);
    }

    /// Reads a length of 4 bytes and then so many characters.
    ///
    /// @return false, with `text` untouched, if the characters run past the end
    /// @throws std::runtime_error "Unexpected end of binary data" if the length itself does
    bool ReadString(std::string& text);

    /// Adds `count` to the position, which stops at its greatest number instead of wrapping.
    ///
    /// @return true if the position does not lie beyond the bytes
    bool Advance(std::uint64_t count)
    {
        const std::uint64_t room = std::numeric_limits<std::uint64_t>::max() - position;
        position += count < room ? count : room;
        return !IsPastEnd();
    }

    /// Takes back the last `count` bytes, which must have been read.
    void StepBack(std::uint64_t count) { position -= count; }

    /// Returns the `count` bytes last read, after an Advance that was true.
    const unsigned char* BytesBehind(std::uint64_t count) const
    {
        return bytes.data() + (position - count);
    }

    /// True only beyond the end: exactly at the end nothing has gone wrong yet.
    bool IsPastEnd() const { return position > bytes.size(); }

    std::uint64_t GetPosition() const { return position; }

private:
    [[noreturn]] static void ThrowUnexpectedEnd();

    const std::vector<unsigned char>& bytes;
    std::uint64_t position = 0;
};

} // namespace Detail
} // namespace IO
} // namespace KVR
