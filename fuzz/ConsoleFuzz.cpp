// Feeds any bytes to the host's console, in pieces as a pipe delivers them, and checks that each
// line has one answer of the promised form.

#include "Console.h"
#include "ConsoleCommands.h"
#include "ControlSystem.h"
#include "LineBuffer.h"

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>

namespace {

// Short enough for the input to exceed it.
constexpr std::size_t maximumLineBytes = 256;

void Require(bool holds, const char* what, const std::string& text)
{
    if (!holds) {
        std::fprintf(stderr, "does not hold: %s\n%s\n", what, text.c_str());
        std::abort();
    }
}

/// Looks at an answer. @return 1, so that answers can be counted
std::size_t Check(QuorixHost::VConsole& console, const QuorixHost::VLineBuffer::VLine& line)
{
    Require(line.text.size() <= maximumLineBytes, "a line is no longer than allowed", line.text);
    Require(line.text.find('\n') == std::string::npos, "a line has no line feed", line.text);
    if (!line.tooLong) {
        const std::string answer = console.Answer(line.text);
        Require(answer == "ok" || answer.rfind("ok {", 0) == 0 || answer.rfind("error: ", 0) == 0,
                "an answer is ok or an error", answer);
        Require(std::none_of(answer.begin(), answer.end(),
                             [](char c) { return c == '\n' || c == '\r' || c == '\0'; }),
                "an answer is one line", answer);
    }
    return 1;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size == 0) {
        return 0;
    }
    QuorixHost::VConsole console;
    QuorixHost::AddEventCommands(console, std::make_shared<QuorixHost::VControlSystem>());
    QuorixHost::AddStopCommand(console, [] {});

    const std::size_t pieceSize = 1 + data[0];
    const std::string stream(reinterpret_cast<const char*>(data) + 1, size - 1);
    QuorixHost::VLineBuffer buffer(maximumLineBytes);
    std::size_t answers = 0;
    for (std::size_t i = 0; i < stream.size(); i += pieceSize) {
        const std::string piece = stream.substr(i, pieceSize);
        buffer.Append(piece.data(), piece.size());
        while (const auto line = buffer.TakeLine()) {
            answers += Check(console, *line);
        }
    }
    if (const auto last = buffer.TakeLastLine()) {
        answers += Check(console, *last);
    }

    const bool openEnd = !stream.empty() && stream.back() != '\n';
    const auto lines = static_cast<std::size_t>(std::count(stream.begin(), stream.end(), '\n')) +
                       (openEnd ? 1 : 0);
    Require(answers == lines, "each line has one answer", stream);
    return 0;
}
