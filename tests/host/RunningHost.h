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

/// Publishes events of half a mebibyte until one is not answered, because a device does not read.
///
/// @return how many events were published, with the last; 0 when it did not come to that
inline int FireUntilStalled(VHostProcess& host)
{
    constexpr std::size_t eventBytes = 512 * 1024;
    constexpr int mostEvents = 64; // the system's buffers hold a few mebibytes
    // Long enough for an answer that is only slow; one that comes later fails what follows.
    constexpr std::chrono::milliseconds stalled{3000};

    const std::string line = "fire Event.Big Text=" + std::string(eventBytes, 'x');
    for (int i = 1; i <= mostEvents; ++i) {
        if (!host.SendLine(line)) {
            return 0;
        }
        const std::optional<std::string> answer = host.ReadLine(stalled);
        if (!answer) {
            return i;
        }
        EXPECT_EQ("ok", *answer);
    }
    return 0;
}

} // namespace TestSupport
