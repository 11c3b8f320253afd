#pragma once

#include "DeviceConnection.h"

#include <cstdint>
#include <string>
#include <vector>

namespace ControlStreamBenchmark {

/// When a batch of events came.
struct VReception
{
    std::int64_t First = 0; // the first byte at any listener
    std::int64_t Last = 0;  // the last byte at the last listener

    double Seconds() const { return static_cast<double>(Last - First) / 1e9; }
};

/// Devices that only listen, all served by one thread.
///
/// Threads: one at a time.
class VListeners
{
public:
    /// @param event  the frame that each of them will get, over and over
    VListeners(std::uint16_t port, std::size_t count, const std::string& event);

    VListeners(const VListeners&) = delete;
    VListeners& operator=(const VListeners&) = delete;
    ~VListeners();

    std::size_t Count() const { return listeners.size(); }

    /// Asks the server something on every connection, so that it surely knows them all.
    void Introduce();

    /// Reads until every listener has got `events` events, and compares each byte. Throws
    /// std::runtime_error where another byte comes, a connection ends, or nothing comes for long.
    ///
    /// @param spin  whether this thread has a core of its own, and asks again without sleeping
    VReception Receive(std::size_t events, bool spin);

private:
    struct VListener
    {
        explicit VListener(std::uint16_t port) : Device(port) {}

        VDeviceConnection Device;
        std::size_t Received = 0;
    };

    void Take(VListener& listener, std::size_t expected);

    std::string event;
    int queue;
    std::vector<VListener> listeners;
    std::vector<char> buffer;
};

} // namespace ControlStreamBenchmark
