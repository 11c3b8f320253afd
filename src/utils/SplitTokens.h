#pragma once

#include <string>
#include <vector>

namespace KVR {

/// Splits a text at its separators.
///
/// White space is dropped around a token and kept inside it. Between quotes the separator and white
/// space are ordinary characters; the quotes themselves are dropped, and one without a partner runs
/// to the end of the text. Empty tokens are kept, so an empty text is one empty token. [any]
///
/// @param whiteSpace  the characters that count as white space
std::vector<std::wstring> SplitTokens(const std::wstring& text, wchar_t separator, wchar_t quote,
                                      const std::wstring& whiteSpace);

} // namespace KVR
