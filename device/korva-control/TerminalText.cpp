#include "korva-control/TerminalText.h"

#include "utils/WideText.h"

#include <algorithm>
#include <cstdio>
#include <iterator>

namespace {

bool IsControl(wchar_t unit)
{
    return unit < 0x20 || (unit >= 0x7F && unit <= 0x9F);
}

struct VRange
{
    wchar_t First;
    wchar_t Last;
};

// What is not seen itself but changes how what stands beside it is shown or read. Deliberate: the
// two joiners, U+200C and U+200D, are not among them, since words and emoji are written with them.
constexpr VRange invisible[] = {
    {0x00AD, 0x00AD}, // the soft hyphen
    {0x061C, 0x061C}, // marks of a direction, here and below
    {0x180E, 0x180E}, // a separator without width
    {0x200B, 0x200B}, // a blank without width
    {0x200E, 0x200F},
    {0x2028, 0x202E}, // ends of lines and paragraphs; what embeds and overrides a direction
    {0x2060, 0x206F}, // signs without width; what isolates a direction; controls of old
    {0xFEFF, 0xFEFF}, // the byte-order mark
    {0xFFF9, 0xFFFB}, // what hides notes between lines
};

bool IsInvisible(wchar_t unit)
{
    return std::any_of(std::begin(invisible), std::end(invisible), [unit](const VRange& range) {
        return unit >= range.First && unit <= range.Last;
    });
}

std::string Escape(wchar_t unit)
{
    switch (unit) {
    case L'\n':
        return "\\n";
    case L'\r':
        return "\\r";
    case L'\t':
        return "\\t";
    default:
        break;
    }
    char code[16];
    std::snprintf(code, sizeof code, unit < 0x100 ? "\\x%02X" : "\\u%04X",
                  static_cast<unsigned>(unit));
    return code;
}

std::string Escaped(const std::string& text, bool keepLines)
{
    std::wstring harmless;
    for (const wchar_t unit : KVR::Utf8ToWide(text)) {
        const bool kept = keepLines && (unit == L'\n' || unit == L'\t');
        if (!kept && (IsControl(unit) || IsInvisible(unit))) {
            const std::string escape = Escape(unit);
            harmless.append(escape.begin(), escape.end());
        } else {
            harmless += unit;
        }
    }
    return KVR::WideToUtf8(harmless);
}

} // namespace

std::string ForTerminal(const std::string& text)
{
    return Escaped(text, false);
}

std::string LinesForTerminal(const std::string& text)
{
    return Escaped(text, true);
}

std::string WordForTerminal(const std::string& text)
{
    if (!text.empty() && text.find_first_of(" \"") == std::string::npos) {
        return ForTerminal(text);
    }
    std::string quoted = "\"";
    for (const char character : ForTerminal(text)) {
        if (character == '"') {
            quoted += '\\';
        }
        quoted += character;
    }
    return quoted + "\"";
}
