#include "korva-control/ShellWords.h"

#include "ControlStreamClient/Error.h"

std::vector<std::string> SplitWords(const std::string& line)
{
    std::vector<std::string> words;
    bool inWord = false;
    bool inQuotes = false;
    for (std::size_t i = 0; i < line.size(); ++i) {
        const char character = line[i];
        const bool isBlank = character == ' ' || character == '\t';
        if (isBlank && !inQuotes) {
            inWord = false;
            continue;
        }
        if (!inWord) {
            words.emplace_back();
            inWord = true;
        }
        if (character == '"') {
            inQuotes = !inQuotes;
        } else if (character == '\\' && i + 1 < line.size()) {
            words.back() += line[++i];
        } else {
            words.back() += character;
        }
    }
    if (inQuotes) {
        throw ControlStream::VError(ControlStream::EErrorKind::Usage, "a quote is not closed");
    }
    return words;
}

std::string QuotedWord(const std::string& word)
{
    std::string quoted;
    for (const char character : word) {
        if (character == ' ' || character == '\t' || character == '"' || character == '\\') {
            quoted += '\\';
        }
        quoted += character;
    }
    return quoted;
}
