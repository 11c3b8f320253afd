#pragma once

#include <sys/types.h>

#include <cstddef>
#include <cstdint>

namespace ControlStreamBenchmark {

/// A server process that is measured: the host, or a limit that it is compared with.
class IServer
{
public:
    virtual pid_t Process() const = 0;
    virtual std::uint16_t Port() const = 0;

    virtual ~IServer() = default;
};

/// A server process that can be told to send events to all its connections.
class IEventServer : public IServer
{
public:
    /// @return how many events one call of Fire may order
    virtual std::size_t MaximalCount() const = 0;

    /// Orders `count` events of the same bytes at once; returns before they are sent.
    virtual void Fire(std::size_t count) = 0;

    /// Waits until the server has said that every event ordered was sent. Throws
    /// std::runtime_error.
    virtual void AwaitFired() = 0;
};

} // namespace ControlStreamBenchmark
