#pragma once

#include <stdexcept>
#include <string>

namespace ControlStream {

/// What kept an operation of the client from being done.
enum class EErrorKind {
    Usage, ///< the host would drop the message in silence or change its content; nothing was sent
    NoConnection, ///< no connection was made, or there is none any more
    TimedOut,     ///< the time limit ran out; the text says what was waited for
    Closed,       ///< the host, or the network, ended the connection
    Protocol,     ///< the host sent something that is not the control stream
};

/// The one exception that the client library throws, apart from those of running out of memory.
///
/// Its text is a sentence without its full stop, in UTF-8, to be shown to a person.
class VError : public std::runtime_error
{
public:
    VError(EErrorKind errorKind, const std::string& text)
        : std::runtime_error(text), kind(errorKind)
    {
    }

    // Copies share no text: the standard's would, and copies go from thread to thread.
    VError(const VError& other) : std::runtime_error(std::string(other.what())), kind(other.kind) {}
    VError& operator=(const VError& other)
    {
        std::runtime_error::operator=(std::runtime_error(std::string(other.what())));
        kind = other.kind;
        return *this;
    }

    EErrorKind Kind() const { return kind; }

private:
    EErrorKind kind;
};

} // namespace ControlStream
