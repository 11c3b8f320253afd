#pragma once

#include <memory>
#include <string>

namespace ControlStreamServer {

class IClientConnection;

/// Takes one type of message and answers it.
class IMessageParser
{
public:
    /// Answers `message` on `connection` if it is of this parser's type and complete. [socket]
    ///
    /// @param message            the parser's own copy, which it may overwrite
    /// @param translateEntities  whether XML entities in the message are decoded while it is read
    /// @return whether the message was taken; false has had no effect and logs nothing
    virtual bool Parse(std::shared_ptr<IClientConnection> connection, std::wstring message,
                       bool translateEntities) = 0;

    virtual ~IMessageParser() = default;
};

} // namespace ControlStreamServer
