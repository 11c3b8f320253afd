#pragma once

#include <string>
#include <vector>

/// Cuts a line into words at its blanks. A word may hold blanks in double quotes, and a quote or a
/// backslash behind a backslash. Throws VError of the kind Usage where a quote is not closed.
std::vector<std::string> SplitWords(const std::string& line);

/// The inverse for one word: as it has to be typed.
std::string QuotedWord(const std::string& word);
