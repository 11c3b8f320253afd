#pragma once

#include <cstddef>
#include <string>

namespace KVR {

// A wide text holds one 16-bit code unit in each element, so that a character beyond U+FFFF is two
// elements, although `wchar_t` has 32 bits here: lengths, order and what devices count depend on
// it.

/// Decodes UTF-8. Each maximal ill-formed part gives one U+FFFD: overlong forms, encoded surrogates
/// and values above U+10FFFF are ill-formed. Byte-order marks and zeros stay. [any]
std::wstring Utf8ToWide(const std::string& text);

/// The same for `size` bytes, which may be null if `size` is 0.
std::wstring Utf8ToWide(const char* text, std::size_t size);

/// Encodes as UTF-8. A surrogate without its partner gives EF BF BD.
///
/// Lenient towards texts that were not made by `Utf8ToWide`: an element from 0x10000 to 0x10FFFF,
/// as in a literal of this compiler, becomes one four-byte sequence, and a greater one U+FFFD.
/// [any]
std::string WideToUtf8(const std::wstring& text);

/// The same for `size` elements, which may be null if `size` is 0.
std::string WideToUtf8(const wchar_t* text, std::size_t size);

} // namespace KVR
