#pragma once

#include <cstdint>

namespace KVR {
namespace IO {
namespace Detail {

/// The place in a text at which value text is read. It is its own record, so that the numbers and
/// the rest of the grammar can hand it to each other.
struct VTextCursor
{
    const char* Position;
    const char* End;

    bool AtEnd() const { return Position == End; }

    /// Skips the six blanks of ASCII. Asking the runtime library would ask the user's locale.
    void SkipBlanks()
    {
        while (!AtEnd() && IsBlank(*Position)) {
            ++Position;
        }
    }

    /// Steps over `character` if it is the next one.
    bool Take(char character)
    {
        if (AtEnd() || *Position != character) {
            return false;
        }
        ++Position;
        return true;
    }

private:
    static bool IsBlank(char character)
    {
        // The first comparison alone decides for nearly every character that is asked about.
        return character <= ' ' && (character == ' ' || (character >= '\t' && character <= '\r'));
    }
};

/// Reads items separated by "," until `limit` are read or no "," follows. A limit of 0 ends it only
/// where the count wraps around to 0, as more items could not be counted.
///
/// @param count    is increased by the items read, also before a failure
/// @param readOne  reads one item through `cursor`, with the blanks around it
/// @return false if an item failed
template <typename ReadOne>
bool ReadSeparated(VTextCursor& cursor, std::uint32_t limit, std::uint32_t& count, ReadOne readOne)
{
    do {
        if (!readOne()) {
            return false;
        }
        if (++count == limit) {
            return true;
        }
    } while (cursor.Take(','));
    return true;
}

} // namespace Detail
} // namespace IO
} // namespace KVR
