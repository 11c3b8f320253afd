#pragma once

#include <QString>

namespace QuorixHost {

/// The greatest number of characters of a text that is shown.
constexpr int longestShownText = 500;

/// Returns a text as one line of a table. It may be a device's, so it is cut where nobody would
/// read on: one of a megabyte would hold up the window for minutes, laid out anew at each change.
QString ShownLine(QString text);

/// Returns a text as a tool tip, in which none of it is markup.
QString ShownTip(const QString& text);

} // namespace QuorixHost
