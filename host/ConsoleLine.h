#pragma once

#include <cstddef>
#include <optional>
#include <stdexcept>
#include <string>
#include <utility>

namespace QuorixHost {

/// What is wrong with a console command, as its answer tells it behind "error: ".
class VConsoleError : public std::runtime_error
{
public:
    using std::runtime_error::runtime_error;
};

/// Takes one console line apart, from the left: words between blanks.
///
/// A word, or the value behind the first '=' of a word, may stand in double quotes. It then holds
/// blanks, and \" and \\ for a quote and a backslash. A quote anywhere else is an ordinary
/// character.
class VConsoleLine
{
public:
    /// @param text  valid UTF-8 without line ends
    explicit VConsoleLine(std::string text);

    /// Takes the next word. Throws VConsoleError where there is none, with `what` it would have
    /// been, and where quotes do not end.
    std::string TakeWord(const char* what);

    /// Takes the next word as NAME=VALUE. @return empty at the end of the line. Throws
    /// VConsoleError where the word has no '=', no name, or quotes that do not end.
    std::optional<std::pair<std::string, std::string>> TakeAssignment();

    /// Takes all that is left, as it stands but for blanks in front.
    std::string TakeRest();

    /// Returns whether anything but blanks is left.
    bool HasMore();

    /// Throws VConsoleError where anything but blanks is left.
    void ExpectEnd();

private:
    bool AtEnd() const { return position == text.size(); }
    void SkipBlanks();
    std::string TakeUntil(const char* ends);
    std::string TakeQuoted();
    std::string TakePlainOrQuoted();

    std::string text;
    std::size_t position = 0;
};

} // namespace QuorixHost
