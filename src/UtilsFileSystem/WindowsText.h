#pragma once

#include <string>

namespace UtilsFileSystem {

// What is particular to Windows, as rules on texts and numbers, so that they can be tried anywhere.
// Nothing but the operations that meet Windows itself applies them.

/// Returns whether a path's text is relative on Windows. A single leading separator counts as
/// relative, and so does a drive without one.
bool IsRelativePath(const std::string& text);

/// Returns the text by which Windows takes a path of any length: a relative one as it stands, every
/// other with backslashes and the prefix for a drive or for a network share.
///
/// Deliberate: a text that has the prefix already gets a second one. Callers pass plain paths.
std::string MakeLongPathText(const std::string& text);

/// What Windows tells of its version.
struct VWindowsVersion
{
    unsigned Major = 0;
    unsigned Minor = 0;
    bool Workstation = true; ///< not a server
};

/// Returns the name of a Windows version with the width of its words behind it.
///
/// @param version  null if Windows did not tell
std::string GetWindowsName(const VWindowsVersion* version);

} // namespace UtilsFileSystem
