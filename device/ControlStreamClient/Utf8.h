#pragma once

#include <string>

namespace ControlStream {

/// Whether the bytes are UTF-8: no overlong forms, no encoded surrogates, nothing above U+10FFFF.
/// Costs one look at each byte where they are all ASCII. [any]
bool IsUtf8(const std::string& bytes);

/// Puts U+FFFD in the place of each ill-formed part, and of each zero, at which the XML parser
/// would stop. [any]
void MakeReadable(std::string& bytes);

} // namespace ControlStream
