#include "QuorixPluginControlStreamServer/Authorization/PlainText.h"

#include "utils/WideText.h"

#include <QGuiApplication>
#include <QString>
#include <QTextDocument>
#include <QVariant>

#include <algorithm>
#include <cstddef>

namespace {

// Reading markup takes time that grows with the square of its length: 200 kB of pictures take
// twenty seconds, and nobody has been asked yet. No name for people is longer than this.
constexpr std::size_t longestMarkup = 4096;

/// A document that loads nothing. A plain one opens what the text names while it reads the text: a
/// style sheet in a pipe would stop the thread for good, and a background picture ends a process
/// that has no windows.
class VClosedDocument : public QTextDocument
{
protected:
    QVariant loadResource(int /*type*/, const QUrl& /*name*/) override { return QVariant(); }
};

// Both ways by code units: QString::fromUtf8 would drop a leading byte-order mark.

QString ToQString(const std::wstring& text)
{
    QString converted;
    converted.reserve(static_cast<int>(text.size()));
    for (const wchar_t unit : text) {
        converted.append(QChar(static_cast<ushort>(unit)));
    }
    return converted;
}

std::wstring ToWide(const QString& text)
{
    std::wstring converted;
    converted.reserve(static_cast<std::size_t>(text.size()));
    for (const QChar unit : text) {
        converted.push_back(static_cast<wchar_t>(unit.unicode()));
    }
    return converted;
}

std::wstring Shortened(const std::wstring& text)
{
    const bool hasMarkup = text.find(L'<') != std::wstring::npos;
    return hasMarkup ? text.substr(0, longestMarkup) : text;
}

bool BelongsToTagName(wchar_t unit)
{
    return unit == L'/' || unit == L'!' || unit == L'-' || (unit >= L'0' && unit <= L'9') ||
           (unit >= L'A' && unit <= L'Z') || (unit >= L'a' && unit <= L'z');
}

/// Returns the text with each tag cut down to its name: a link asks for the colours of windows, and
/// a process without any would crash.
std::wstring WithoutAttributes(const std::wstring& text)
{
    std::wstring result;
    auto position = text.begin();
    while (position != text.end()) {
        const auto tag = std::find(position, text.end(), L'<');
        result.append(position, tag);
        const auto close = std::find(tag, text.end(), L'>');
        if (tag != text.end()) {
            result += L'<';
            result.append(tag + 1, std::find_if_not(tag + 1, close, &BelongsToTagName));
        }
        position = close; // which is copied with the text behind it
    }
    return result;
}

bool HasWindows()
{
    return qobject_cast<QGuiApplication*>(QCoreApplication::instance()) != nullptr;
}

} // namespace

std::string RichTextToPlainText(const std::string& richText)
{
    const std::wstring shortened = Shortened(KVR::Utf8ToWide(richText));
    VClosedDocument document;
    document.setUndoRedoEnabled(false); // nobody edits it
    document.setHtml(ToQString(HasWindows() ? shortened : WithoutAttributes(shortened)));
    return KVR::WideToUtf8(ToWide(document.toPlainText()));
}
