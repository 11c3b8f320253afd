#include "utils/SplitTokens.h"

#include <cstddef>

namespace KVR {

namespace {

/// A token while its characters arrive. White space at its end is held back until it is known that
/// something follows.
class VTokenInTheMaking
{
public:
    void AddText(wchar_t character)
    {
        token += whiteSpace;
        whiteSpace.clear();
        token += character;
        started = true;
    }

    void AddWhiteSpace(wchar_t character)
    {
        if (started) {
            whiteSpace += character;
        }
    }

    /// A quoted section counts as text even when it is empty: `"" a` keeps its blank.
    void AddQuote()
    {
        token += whiteSpace;
        whiteSpace.clear();
        started = true;
    }

    std::wstring Take()
    {
        std::wstring taken;
        taken.swap(token);
        whiteSpace.clear();
        started = false;
        return taken;
    }

private:
    std::wstring token;
    std::wstring whiteSpace;
    bool started = false;
};

} // namespace

std::vector<std::wstring> SplitTokens(const std::wstring& text, wchar_t separator, wchar_t quote,
                                      const std::wstring& whiteSpace)
{
    std::vector<std::wstring> tokens;
    VTokenInTheMaking token;
    bool quoted = false;
    for (const wchar_t character : text) {
        if (character == quote) {
            quoted = !quoted;
            token.AddQuote();
        } else if (!quoted && character == separator) {
            tokens.push_back(token.Take());
        } else if (!quoted && whiteSpace.find(character) != std::wstring::npos) {
            token.AddWhiteSpace(character);
        } else {
            token.AddText(character);
        }
    }
    tokens.push_back(token.Take());
    return tokens;
}

} // namespace KVR
