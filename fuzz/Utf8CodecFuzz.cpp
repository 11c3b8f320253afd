// Decodes any bytes as UTF-8 and encodes any elements as a wide text, and checks what must hold of
// the results whatever came in.

#include "utils/WideText.h"

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>

namespace {

void Require(bool holds, const char* what)
{
    if (!holds) {
        std::fprintf(stderr, "does not hold: %s\n", what);
        std::abort();
    }
}

/// Tells how many bytes the well-formed sequence at the start of a text has, 0 if there is none.
/// Written from the definition of a code point's value, to share nothing with the codec.
std::size_t LengthOfSequence(const unsigned char* bytes, std::size_t size)
{
    std::size_t length = 0;
    std::uint32_t least = 0;
    std::uint32_t value = 0;
    if (bytes[0] < 0x80) {
        return 1;
    }
    if ((bytes[0] & 0xE0) == 0xC0) {
        length = 2;
        least = 0x80;
        value = bytes[0] & 0x1Fu;
    } else if ((bytes[0] & 0xF0) == 0xE0) {
        length = 3;
        least = 0x800;
        value = bytes[0] & 0x0Fu;
    } else if ((bytes[0] & 0xF8) == 0xF0) {
        length = 4;
        least = 0x10000;
        value = bytes[0] & 0x07u;
    }
    if (length == 0 || length > size) {
        return 0;
    }
    for (std::size_t i = 1; i < length; ++i) {
        if ((bytes[i] & 0xC0) != 0x80) {
            return 0;
        }
        value = value << 6 | (bytes[i] & 0x3Fu);
    }
    const bool isSurrogate = value >= 0xD800 && value <= 0xDFFF;
    return value < least || value > 0x10FFFF || isSurrogate ? 0 : length;
}

bool IsWellFormed(const std::string& text)
{
    const auto* const bytes = reinterpret_cast<const unsigned char*>(text.data());
    for (std::size_t i = 0; i < text.size();) {
        const std::size_t length = LengthOfSequence(bytes + i, text.size() - i);
        if (length == 0) {
            return false;
        }
        i += length;
    }
    return true;
}

void TryDecoding(const std::string& bytes)
{
    const std::wstring text = KVR::Utf8ToWide(bytes);
    Require(text.size() <= bytes.size(), "a text has no more units than bytes");
    Require(std::all_of(text.begin(), text.end(),
                        [](wchar_t unit) { return unit >= 0 && unit <= 0xFFFF; }),
            "decoding gives 16-bit units");

    const std::string encoded = KVR::WideToUtf8(text);
    Require(IsWellFormed(encoded), "what was decoded encodes well-formed");
    Require(KVR::Utf8ToWide(encoded) == text, "what was decoded survives the round trip");
    Require(!IsWellFormed(bytes) || encoded == bytes, "well-formed bytes survive the round trip");
    Require(IsWellFormed(bytes) || text.find(L'\uFFFD') != std::wstring::npos,
            "ill-formed bytes leave a replacement");
}

void TryEncoding(const std::wstring& text)
{
    const std::string encoded = KVR::WideToUtf8(text);
    Require(IsWellFormed(encoded), "any elements encode well-formed");
    Require(KVR::WideToUtf8(KVR::Utf8ToWide(encoded)) == encoded, "the encoding is settled");
}

/// Makes elements of `width` bytes each; what is left over is dropped.
std::wstring Elements(const std::uint8_t* data, std::size_t size, std::size_t width)
{
    std::wstring text;
    for (std::size_t i = 0; i + width <= size; i += width) {
        std::uint32_t element = 0;
        std::memcpy(&element, data + i, width);
        text += static_cast<wchar_t>(element);
    }
    return text;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    TryDecoding(std::string(data, data + size));
    TryEncoding(Elements(data, size, 2));
    TryEncoding(Elements(data, size, 4));
    return 0;
}
