#include "utils/WideText.h"

// ICU's macros stand in headers alone; the program links none of its libraries.
#include <unicode/utf16.h>
#include <unicode/utf8.h>

#include <cstdint>
#include <cstring>
#include <type_traits>

namespace KVR {

namespace {

constexpr std::size_t blockSize = 16;

/// @return whether a whole block is ASCII, asked of eight bytes at a time
template <typename VUnit>
bool IsAsciiBlock(const VUnit* block)
{
    static_assert(sizeof(VUnit) == 1 || sizeof(VUnit) == 4);
    constexpr std::uint64_t beyondAscii =
        sizeof(VUnit) == 1 ? 0x8080808080808080 : 0xFFFFFF80FFFFFF80;
    std::uint64_t all = 0;
    for (std::size_t offset = 0; offset < blockSize * sizeof(VUnit); offset += sizeof all) {
        std::uint64_t part = 0;
        std::memcpy(&part, reinterpret_cast<const char*>(block) + offset, sizeof part);
        all |= part;
    }
    return (all & beyondAscii) == 0;
}

/// Copies the ASCII at the beginning of a text, which is nearly all of every message: whole blocks,
/// which the compiler turns into a few instructions each, and then what is left.
///
/// @return how many units were copied
template <typename From, typename To>
std::size_t CopyAscii(const From* __restrict text, std::size_t size, To* __restrict target)
{
    using VUnit = std::make_unsigned_t<From>;
    std::size_t done = 0;
    for (; size - done >= blockSize && IsAsciiBlock(text + done); done += blockSize) {
        for (std::size_t i = 0; i < blockSize; ++i) {
            target[done + i] = static_cast<To>(text[done + i]);
        }
    }
    for (; done < size && static_cast<VUnit>(text[done]) < 0x80; ++done) {
        target[done] = static_cast<To>(text[done]);
    }
    return done;
}

} // namespace

std::wstring Utf8ToWide(const std::string& text)
{
    return Utf8ToWide(text.data(), text.size());
}

std::wstring Utf8ToWide(const char* text, std::size_t size)
{
    std::wstring wide(size, L'\0'); // no text has more units than bytes
    const std::size_t ascii = CopyAscii(text, size, wide.data());
    wchar_t* target = wide.data() + ascii;

    const auto* const bytes = reinterpret_cast<const std::uint8_t*>(text);
    const auto end = static_cast<std::int64_t>(size);
    for (auto i = static_cast<std::int64_t>(ascii); i < end;) {
        UChar32 codePoint = 0;
        U8_NEXT_OR_FFFD(bytes, i, end, codePoint);
        if (codePoint < 0x10000) {
            *target++ = static_cast<wchar_t>(codePoint);
        } else {
            *target++ = static_cast<wchar_t>(U16_LEAD(codePoint));
            *target++ = static_cast<wchar_t>(U16_TRAIL(codePoint));
        }
    }

    wide.resize(static_cast<std::size_t>(target - wide.data()));
    return wide;
}

std::string WideToUtf8(const std::wstring& text)
{
    return WideToUtf8(text.data(), text.size());
}

std::string WideToUtf8(const wchar_t* text, std::size_t size)
{
    constexpr std::uint32_t replacement = 0xFFFD;
    constexpr std::uint32_t lastCodePoint = 0x10FFFF;

    std::string utf8(size, '\0');
    std::size_t length = CopyAscii(text, size, utf8.data());
    if (length == size) {
        return utf8;
    }

    utf8.resize(length + (size - length) * U8_MAX_LENGTH);
    char* const bytes = utf8.data();
    for (std::size_t i = length; i < size; ++i) {
        // A negative element becomes a great one. NOLINTNEXTLINE(bugprone-signed-char-misuse): none
        auto codePoint = static_cast<std::uint32_t>(text[i]);
        if (U16_IS_LEAD(codePoint) && i + 1 < size && U16_IS_TRAIL(text[i + 1])) {
            ++i;
            codePoint = U16_GET_SUPPLEMENTARY(codePoint, text[i]);
        } else if (U_IS_SURROGATE(codePoint) || codePoint > lastCodePoint) {
            codePoint = replacement;
        }
        U8_APPEND_UNSAFE(bytes, length, codePoint);
    }

    utf8.resize(length);
    return utf8;
}

} // namespace KVR
