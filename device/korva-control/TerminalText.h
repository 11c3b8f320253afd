#pragma once

#include <string>

/// Makes a text from elsewhere harmless on a terminal: control characters, and invisible ones such
/// as those that turn the direction of a line, become "\n", "\t", "\x1B" or "\u202E"; what is not
/// UTF-8 becomes U+FFFD. A backslash stays as it is, so that the form is for reading, not for
/// decoding.
std::string ForTerminal(const std::string& text);

/// The same, but line ends and tabs stay, for a text of several lines.
std::string LinesForTerminal(const std::string& text);

/// The same as ForTerminal, in double quotes where the text is empty or holds a blank or a quote,
/// so that it can be told from its neighbours in a line.
std::string WordForTerminal(const std::string& text);
