#pragma once

#include <cstdint>
#include <string>

namespace ControlStreamBenchmark {

/// @return `text`, which is UTF-8, behind its header
std::string MakeFrame(const std::string& text);

/// The request that is measured: Host.Echo with two parameters.
std::string ExecuteCommandFrame();

/// The request that reads the strobe intensity of camera 1.
std::string ReadStrobeFrame();

/// A request that any control stream answers, as devices send it first.
std::string ServerInformationFrame();

/// @return whether somebody accepts connections on `port` of the loopback interface
bool CanConnect(std::uint16_t port);

/// A device's blocking connection to the loopback interface. Every operation throws
/// std::system_error or, where the peer ends or answers otherwise than it should,
/// std::runtime_error.
///
/// Threads: one at a time.
class VDeviceConnection
{
public:
    /// @param lastByte  of the address 127.0.0.x. Each address has ports of its own, so that a
    /// device
    ///                  that connects very often does not run out of them.
    explicit VDeviceConnection(std::uint16_t port, std::uint8_t lastByte = 1);

    VDeviceConnection(VDeviceConnection&& other) noexcept;
    VDeviceConnection(const VDeviceConnection&) = delete;
    VDeviceConnection& operator=(const VDeviceConnection&) = delete;
    VDeviceConnection& operator=(VDeviceConnection&&) = delete;
    ~VDeviceConnection();

    int Socket() const { return socket; }

    /// Reads one frame, its header included.
    std::string ReadFrame();

    /// Sends a frame and waits for the frame that answers it.
    std::string Ask(const std::string& request);

    /// Sends a frame whose answer is known, and waits for just that answer.
    void Exchange(const std::string& request, const std::string& reply);

    /// Sets the acknowledgement of what arrives next: at once, or delayed until there is data to
    /// send. The kernel forgets it with the next exchange.
    void SetQuickAcknowledgement(bool quick);

private:
    void Send(const std::string& bytes);
    void Read(char* target, std::size_t size);

    int socket;
};

} // namespace ControlStreamBenchmark
