#include "korva-control/TerminalText.h"

#include "utils/WideText.h"

#include <cstdio>

namespace {

bool IsControl(wchar_t unit)
{
    return unit < 0x20 || (unit >= 0x7F && unit <= 0x9F);
}

/// Line and paragraph separators, and the marks that embed, override or isolate a direction.
bool IsInvisible(wchar_t unit)
{
    return unit == 0x200E || unit == 0x200F || (unit >= 0x2028 && unit <= 0x202E) ||
           (unit >= 0x2066 && unit <= 0x2069);
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
