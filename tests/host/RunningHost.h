#pragma once

#include "SocketTable.h"
#include "support/HostProcess.h"
#include "support/RawClient.h"

#include <gtest/gtest.h>

#include <chrono>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <sys/resource.h>
#include <thread>
#include <vector>

// What the tests of the running host share: a host that is ready, devices, and what each of them
// must see of a host in good health.

namespace TestSupport {

constexpr std::uint16_t controlStreamPort = 803;

const std::string declaration = R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)";

const std::string serverInformation =
    declaration + R"(<ServerInformation><StreamVersion major="1" minor="0"/></ServerInformation>)";

/// Whether a sanitizer makes everything slower and memory greater.
#if defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define QUORIX_TEST_SANITIZED
#endif
#elif defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define QUORIX_TEST_SANITIZED
#endif
#ifdef QUORIX_TEST_SANITIZED
constexpr bool sanitized = true;
#else
constexpr bool sanitized = false;
#endif

/// Waits, within the limit of everything, for what another process brings about.
inline bool ComesTrue(const std::function<bool()>& condition)
{
    const auto deadline = std::chrono::steady_clock::now() + hostLimit;
    while (!condition()) {
        if (std::chrono::steady_clock::now() > deadline) {
            return false;
        }
        std::this_thread::yield();
    }
    return true;
}

/// A host that has started and a device that it serves.
class VRunningHost : public VHostProcess
{
public:
    explicit VRunningHost(std::vector<std::string> arguments = {"--headless", "--console"},
                          std::vector<std::string> launcher = {})
        : VHostProcess(std::move(arguments), std::move(launcher))
    {
        if (!WaitReady()) {
            throw std::runtime_error("the host did not get ready:\n" + Errors());
        }
    }

    /// Returns how many descriptors the process has open.
    std::size_t Descriptors() const
    {
        const std::filesystem::directory_iterator entries("/proc/" + std::to_string(Pid()) + "/fd");
        return static_cast<std::size_t>(std::distance(begin(entries), end(entries)));
    }

    /// Returns a figure of the process's memory in KiB, such as "VmRSS".
    long Memory(const std::string& figure) const
    {
        std::ifstream status("/proc/" + std::to_string(Pid()) + "/status");
        for (std::string line; std::getline(status, line);) {
            if (line.rfind(figure + ":", 0) == 0) {
                return std::stol(line.substr(figure.size() + 1));
            }
        }
        throw std::runtime_error("no figure " + figure);
    }
};

/// Connects a device to the control stream.
inline VRawClient Connect(int receiveBuffer = 0)
{
    return VRawClient(controlStreamPort, receiveBuffer);
}

inline std::vector<std::unique_ptr<VRawClient>> ConnectMany(std::size_t count)
{
    std::vector<std::unique_ptr<VRawClient>> devices;
    for (std::size_t i = 0; i < count; ++i) {
        devices.push_back(std::make_unique<VRawClient>(controlStreamPort));
    }
    return devices;
}

/// Waits until the host has read all that devices have sent. What it does upon the last of it is
/// done when it answers a further request.
inline bool HostHasReadEverything()
{
    return ComesTrue([] {
        for (const QuorixHost::VSocketRow& row : QuorixHost::ReadSocketTables()) {
            if (row.localPort == controlStreamPort && row.inode != 0 && row.receiveQueue != 0) {
                return false;
            }
        }
        return true;
    });
}

/// A device that has done its worst is followed by one that means well.
inline void ExpectAnswersTheNextGoodFrame()
{
    VRawClient device = Connect();
    EXPECT_EQ(serverInformation, device.Request("<ServerInformation/>"));
}

/// Stops the host in order, which a sanitizer's report or a leak would show in the exit code.
inline void ExpectOrderlyEnd(VHostProcess& host)
{
    EXPECT_EQ("ok", host.Command("quit"));
    EXPECT_EQ(0, host.WaitExit().value_or(-1)) << host.Errors();
}

/// Allows this process, the devices, as many descriptors as the system does.
inline void RaiseDescriptorLimit()
{
    rlimit limit = {};
    getrlimit(RLIMIT_NOFILE, &limit);
    limit.rlim_cur = limit.rlim_max;
    setrlimit(RLIMIT_NOFILE, &limit);
}

/// A text of almost the longest line that the console takes. Each of its characters is five on the
/// wire, so that an event which holds it does not fit any connection's buffers.
inline std::string GreatText()
{
    constexpr std::size_t longestLine = std::size_t{1} << 20;
    constexpr std::size_t roomForTheCommand = 64;
    return std::string(longestLine - roomForTheCommand, '&');
}

/// Sees to it that an event with the great text is more than the system keeps for a device that
/// does not read, whose own buffer must be a small one. Throws where it is not.
inline void ExpectGreatTextToFillBuffers()
{
    // The system's default. The network is the test's own, so nobody else hears of it.
    constexpr long mostBytesToSend = 4 << 20;
    const char* const setting = "/proc/sys/net/ipv4/tcp_wmem";
    const auto present = [setting] {
        long least = 0, initial = 0, most = 0;
        std::ifstream(setting) >> least >> initial >> most;
        return most;
    };
    if (present() > mostBytesToSend) {
        std::ofstream(setting) << "4096 16384 " << mostBytesToSend;
    }
    if (present() > mostBytesToSend) {
        throw std::runtime_error(std::string(setting) + " is above " +
                                 std::to_string(mostBytesToSend) + " and cannot be lowered");
    }
}

/// Publishes an event that is greater than what the system's buffers hold. Once its first bytes
/// have come, the host is sure to be stalled until the device reads, or goes.
///
/// @param deaf  has a small buffer and has read all that it was sent before
/// @return false when it did not come to that
inline bool StallWithEvent(VHostProcess& host, const VRawClient& deaf)
{
    ExpectGreatTextToFillBuffers();
    return host.SendLine("fire Event.Big Text=" + GreatText()) && deaf.AwaitReadable();
}

} // namespace TestSupport
