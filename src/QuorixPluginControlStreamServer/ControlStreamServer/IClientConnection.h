#pragma once

#include "notification/ICallbackPostal.h"

#include <memory>
#include <string>

namespace ControlStreamServer {

/// One device's connection: whole text messages in, whole text messages out.
///
/// Threads: Close and Send [any]; the callback runs on the thread that reads the connection.
class IClientConnection
{
public:
    /// Called with the connection itself and one message.
    using MessageCallback =
        KVR::ICallbackPostal<void(std::shared_ptr<IClientConnection>, std::wstring)>;

    /// Ends the connection; a second call does nothing. No more messages are delivered once the
    /// one that is being handled has returned.
    ///
    /// Throws boost::system::system_error with the location "close" where the system refuses.
    virtual void Close() = 0;

    /// Writes one message and blocks until the system has taken its last byte. Messages from
    /// several threads follow one another whole.
    ///
    /// A failure to write is not told: the connection goes on until reading fails.
    virtual void Send(const std::wstring& message) = 0;

    /// Returns the callback that receives each message. With nothing set, messages are dropped.
    virtual MessageCallback& GetMessageCallback() = 0;

    virtual ~IClientConnection() noexcept(false) {} // "close" may leave an implementation
};

} // namespace ControlStreamServer
