#pragma once

#include "LineBuffer.h"

#include <boost/function.hpp>

#include <cstddef>
#include <memory>
#include <string>

class QSocketNotifier;

namespace QuorixHost {

class VConsole;

/// Carries lines from a descriptor to the console, and its answers to another descriptor.
///
/// Lines run one after the other on the event loop, each to its end before the next is taken, also
/// where a command spins a loop of its own. Owns: neither descriptor. Threads: [gui].
/// Failure: at the end of the input, or when nobody takes the answers any more, the console ends
/// and the host goes on.
class VConsoleStream
{
public:
    /// The longest line that is taken, in bytes; a longer one is answered by an error.
    static constexpr std::size_t maximumLineBytes = 1 << 20;

    /// Begins at once. @param console  outlives this object
    VConsoleStream(VConsole& console, int input, int output);
    ~VConsoleStream();

    VConsoleStream(const VConsoleStream&) = delete;
    VConsoleStream& operator=(const VConsoleStream&) = delete;

    /// Writes a line of its own, as the greeting is.
    void WriteLine(const std::string& line);

    /// Takes no further line, also none that came already. May be called by a command.
    void End();

private:
    void OnReadable();
    void AnswerLine(const VLineBuffer::VLine& line);

    VConsole& console;
    int output;
    VLineBuffer lines{maximumLineBytes};
    bool ended = false;
    std::unique_ptr<QSocketNotifier> notifier;
};

} // namespace QuorixHost
