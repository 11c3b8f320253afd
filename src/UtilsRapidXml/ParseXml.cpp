#include "UtilsRapidXml/ParseXml.h"

#include <string>

namespace UtilsRapidXml {

namespace {

/// Walks over a text by exactly the rules by which RapidXml cuts it into tags, since a scan with
/// rules of its own could be led past elements that the parser then sees: in `<a"><b>` the quote
/// belongs to the name and opens no value.
///
/// Every Skip operation stops at the terminating zero. False means that the parser refuses the text
/// at this place, so that it never gets deeper.
template <typename Ch>
class VTagScanner
{
public:
    VTagScanner(const Ch* text, bool readsDeclaration_)
        : position(text), readsDeclaration(readsDeclaration_)
    {
    }

    /// Moves behind the next "<". False at the end of the text.
    bool FindTag()
    {
        while (*position != 0 && *position != Ch('<')) {
            ++position;
        }
        if (*position == 0) {
            return false;
        }
        ++position;
        return true;
    }

    bool IsAt(char character) const { return *position == Ch(character); }

    /// Moves behind a comment, CDATA, DOCTYPE or any other "<!" construct.
    bool SkipDeclaration()
    {
        if (StartsWith("!--")) {
            position += 3;
            return SkipBehind("-->");
        }
        if (StartsWith("![CDATA[")) {
            position += 8;
            return SkipBehind("]]>");
        }
        if (StartsWith("!DOCTYPE") && IsWhiteSpace(position[8])) {
            position += 9;
            return SkipDoctype();
        }
        return SkipBehind(">");
    }

    /// Moves behind a processing instruction or the XML declaration.
    bool SkipInstruction()
    {
        ++position;
        if (!readsDeclaration || !IsAtDeclaration()) {
            return SkipBehind("?>");
        }
        position += 4;
        SkipWhiteSpace();
        return SkipAttributes() && Take('?') && Take('>');
    }

    /// Moves behind a closing tag, whatever name it bears.
    bool SkipClosingTag()
    {
        ++position;
        SkipNodeName();
        SkipWhiteSpace();
        return Take('>');
    }

    /// Moves behind an opening tag.
    ///
    /// @param closed  receives whether the tag is the element's short form
    bool SkipOpeningTag(bool& closed)
    {
        const Ch* name = position;
        SkipNodeName();
        if (position == name) {
            return false;
        }
        SkipWhiteSpace();
        if (!SkipAttributes()) {
            return false;
        }
        closed = Take('/');
        return Take('>');
    }

private:
    static bool IsWhiteSpace(Ch ch)
    {
        return ch == Ch(' ') || ch == Ch('\t') || ch == Ch('\n') || ch == Ch('\r');
    }

    static bool IsNodeName(Ch ch)
    {
        return ch != 0 && ch != Ch('>') && ch != Ch('/') && ch != Ch('?') && !IsWhiteSpace(ch);
    }

    static bool IsAttributeName(Ch ch)
    {
        return IsNodeName(ch) && ch != Ch('<') && ch != Ch('=') && ch != Ch('!');
    }

    bool StartsWith(const char* expected) const
    {
        const Ch* at = position;
        while (*expected != 0 && *at == Ch(*expected)) {
            ++at;
            ++expected;
        }
        return *expected == 0;
    }

    /// Whether "xml" and a blank follow, each letter in either case.
    bool IsAtDeclaration() const
    {
        const char letters[] = "xmlXML";
        for (std::size_t i = 0; i < 3; ++i) {
            if (position[i] != Ch(letters[i]) && position[i] != Ch(letters[i + 3])) {
                return false;
            }
        }
        return IsWhiteSpace(position[3]);
    }

    bool SkipBehind(const char* end)
    {
        for (; *position != 0; ++position) {
            if (StartsWith(end)) {
                while (*end++ != 0) {
                    ++position;
                }
                return true;
            }
        }
        return false;
    }

    bool Take(char character)
    {
        if (!IsAt(character)) {
            return false;
        }
        ++position;
        return true;
    }

    void SkipWhiteSpace()
    {
        while (IsWhiteSpace(*position)) {
            ++position;
        }
    }

    void SkipNodeName()
    {
        while (IsNodeName(*position)) {
            ++position;
        }
    }

    bool SkipAttributes()
    {
        while (IsAttributeName(*position)) {
            if (!SkipAttribute()) {
                return false;
            }
        }
        return true;
    }

    bool SkipAttribute()
    {
        while (IsAttributeName(*position)) {
            ++position;
        }
        SkipWhiteSpace();
        if (!Take('=')) {
            return false;
        }
        SkipWhiteSpace();
        const Ch quote = *position;
        if (quote != Ch('"') && quote != Ch('\'')) {
            return false;
        }
        do {
            ++position;
        } while (*position != 0 && *position != quote);
        if (*position == 0) {
            return false;
        }
        ++position;
        SkipWhiteSpace();
        return true;
    }

    /// The brackets of an internal subset nest; all else up to ">" is skipped, quotes included.
    bool SkipDoctype()
    {
        while (*position != Ch('>')) {
            if (*position == 0) {
                return false;
            }
            if (*position == Ch('[')) {
                if (!SkipBrackets()) {
                    return false;
                }
            } else {
                ++position;
            }
        }
        ++position;
        return true;
    }

    bool SkipBrackets()
    {
        std::size_t open = 0;
        do {
            if (*position == 0) {
                return false;
            }
            if (*position == Ch('[')) {
                ++open;
            } else if (*position == Ch(']')) {
                --open;
            }
            ++position;
        } while (open > 0);
        return true;
    }

    const Ch* position;
    const bool readsDeclaration;
};

} // namespace

template <typename Ch>
bool IsNestedWithin(const Ch* text, std::size_t levels, bool readsDeclaration)
{
    // A level takes three characters at the least, "<a>", so that few messages need the scan.
    constexpr std::size_t charactersOfALevel = 3;
    if (std::char_traits<Ch>::length(text) / charactersOfALevel <= levels) {
        return true;
    }

    VTagScanner<Ch> scanner(text, readsDeclaration);
    std::size_t depth = 0;
    while (scanner.FindTag()) {
        bool readable = true;
        if (scanner.IsAt('!')) {
            readable = scanner.SkipDeclaration();
        } else if (scanner.IsAt('?')) {
            readable = scanner.SkipInstruction();
        } else if (scanner.IsAt('/')) {
            readable = depth > 0 && scanner.SkipClosingTag();
            depth -= readable ? 1 : 0;
        } else if (depth < levels) {
            bool closed = false;
            readable = scanner.SkipOpeningTag(closed);
            depth += closed ? 0 : 1;
        } else {
            return false;
        }
        if (!readable) {
            break; // the parser refuses the text here
        }
    }
    return true;
}

template bool IsNestedWithin(const char* text, std::size_t levels, bool readsDeclaration);
template bool IsNestedWithin(const wchar_t* text, std::size_t levels, bool readsDeclaration);

} // namespace UtilsRapidXml
