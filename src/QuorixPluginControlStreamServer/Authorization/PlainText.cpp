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

// Without markup it takes next to none, up to what a text of Qt holds.
constexpr std::size_t longestText = std::size_t{1} << 20;

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
    return text.substr(0, hasMarkup ? longestMarkup : longestText);
}

bool BelongsToTagName(wchar_t unit)
{
    return unit == L'/' || unit == L'!' || unit == L'-' || (unit >= L'0' && unit <= L'9') ||
           (unit >= L'A' && unit <= L'Z') || (unit >= L'a' && unit <= L'z');
}

/// Returns the length of the comment that begins here, without its end; 0 where none does.
std::size_t CommentLength(const std::wstring& text, std::size_t begin)
{
    if (text.compare(begin, 4, L"<!--") != 0) {
        return 0;
    }
    const std::size_t end = text.find(L"-->", begin);
    return (end == std::wstring::npos ? text.size() : end) - begin;
}

/// Returns the text with each tag cut down to its name: a link asks for the colours of windows, and
/// a process without any would crash.
std::wstring WithoutAttributes(const std::wstring& text)
{
    std::wstring result;
    for (std::size_t position = 0; position < text.size();) {
        const std::size_t tag = std::min(text.find(L'<', position), text.size());
        result.append(text, position, tag - position);
        if (const std::size_t comment = CommentLength(text, tag)) {
            result.append(text, tag, comment);
            position = tag + comment;
            continue;
        }
        const std::size_t close = std::min(text.find(L'>', tag), text.size());
        const auto name = text.begin() + static_cast<std::ptrdiff_t>(std::min(tag + 1, close));
        const auto end = text.begin() + static_cast<std::ptrdiff_t>(close);
        result.append(text, tag, tag < close ? 1 : 0);
        result.append(name, std::find_if_not(name, end, &BelongsToTagName));
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
