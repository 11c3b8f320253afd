#include "window/ShownText.h"

#include <algorithm>

namespace QuorixHost {

QString ShownLine(QString text)
{
    if (text.size() > longestShownText) {
        // Not in the middle of a character that is two of QString's.
        text.truncate(longestShownText - (text.at(longestShownText - 1).isHighSurrogate() ? 1 : 0));
        text.append(QChar(0x2026));
    }
    // What would begin a new line must not make the rest pass for another entry.
    std::replace_if(
        text.begin(), text.end(), [](QChar character) { return character.isSpace(); }, QChar(' '));
    return text;
}

QString ShownTip(const QString& text)
{
    return "<p>" + text.toHtmlEscaped() + "</p>";
}

} // namespace QuorixHost
