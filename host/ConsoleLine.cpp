#include "ConsoleLine.h"

#include <algorithm>
#include <utility>

namespace QuorixHost {
namespace {

const char* const blanks = " \t";

} // namespace

VConsoleLine::VConsoleLine(std::string text) : text(std::move(text)) {}

std::string VConsoleLine::TakeWord(const char* what)
{
    if (!HasMore()) {
        throw VConsoleError(std::string("expected ") + what);
    }
    return TakePlainOrQuoted();
}

std::optional<std::pair<std::string, std::string>> VConsoleLine::TakeAssignment()
{
    if (!HasMore()) {
        return std::nullopt;
    }
    const std::size_t begin = position;
    std::string name = TakeUntil("= \t");
    if (AtEnd() || text[position] != '=' || name.empty()) {
        position = begin;
        throw VConsoleError("expected NAME=VALUE, not '" + TakeUntil(blanks) + "'");
    }
    ++position;
    return std::make_pair(std::move(name), TakePlainOrQuoted());
}

std::string VConsoleLine::TakeRest()
{
    SkipBlanks();
    std::string rest = text.substr(position);
    position = text.size();
    return rest;
}

bool VConsoleLine::HasMore()
{
    SkipBlanks();
    return !AtEnd();
}

void VConsoleLine::ExpectEnd()
{
    if (HasMore()) {
        throw VConsoleError("unexpected '" + text.substr(position) + "'");
    }
}

void VConsoleLine::SkipBlanks()
{
    const std::size_t next = text.find_first_not_of(blanks, position);
    position = next == std::string::npos ? text.size() : next;
}

std::string VConsoleLine::TakeUntil(const char* ends)
{
    const std::size_t end = std::min(text.find_first_of(ends, position), text.size());
    std::string taken = text.substr(position, end - position);
    position = end;
    return taken;
}

std::string VConsoleLine::TakePlainOrQuoted()
{
    return !AtEnd() && text[position] == '"' ? TakeQuoted() : TakeUntil(blanks);
}

std::string VConsoleLine::TakeQuoted()
{
    std::string taken;
    for (++position; !AtEnd() && text[position] != '"'; ++position) {
        const bool escaped = text[position] == '\\' && position + 1 < text.size() &&
                             (text[position + 1] == '"' || text[position + 1] == '\\');
        position += escaped ? 1 : 0;
        taken += text[position];
    }
    if (AtEnd()) {
        throw VConsoleError("a quoted text does not end");
    }
    ++position;
    if (!AtEnd() && std::string(blanks).find(text[position]) == std::string::npos) {
        throw VConsoleError("a blank must follow a quoted text");
    }
    return taken;
}

} // namespace QuorixHost
