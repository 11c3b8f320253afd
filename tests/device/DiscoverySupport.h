#pragma once

#include "ControlStreamClient/Discovery.h"
#include "support/HostProcess.h"

#include <gtest/gtest.h>

#include <chrono>
#include <optional>
#include <string>

/// Somebody on the network who advertises a control stream, by a program that is not ours, until
/// this object is destroyed.
class VAdvertiser
{
public:
    /// @param port  as it is advertised
    explicit VAdvertiser(const std::string& name, int port = 810)
        : service(std::in_place, Words({"-s", "--", name, "_korva._tcp", std::to_string(port)}),
                  Words(), "avahi-publish")
    {
        EXPECT_TRUE(service->WaitForError("Established")) << service->Errors();
    }

    /// Advertises for another machine, which has one address.
    VAdvertiser(const std::string& name, const std::string& hostName, const std::string& address)
        : record(std::in_place, Words({"-a", "-R", hostName, address}), Words(), "avahi-publish")
    {
        EXPECT_TRUE(record->WaitForError("Established")) << record->Errors();
        service.emplace(Words({"-s", "-H", hostName, "--", name, "_korva._tcp", "810"}), Words(),
                        "avahi-publish");
        EXPECT_TRUE(service->WaitForError("Established")) << service->Errors();
    }

private:
    using Words = std::vector<std::string>;

    std::optional<TestSupport::VHostProcess> record;
    std::optional<TestSupport::VHostProcess> service;
};

/// A test on a network on which nobody advertises anything any more when it begins: what a test
/// before has withdrawn stays known for a second.
class VQuietNetwork : public testing::Test
{
protected:
    void SetUp() override
    {
        ControlStream::VDiscovery discovery;
        const auto deadline = std::chrono::steady_clock::now() + TestSupport::hostLimit;
        while (!discovery.Browse(TestSupport::hostLimit).empty()) {
            ASSERT_LT(std::chrono::steady_clock::now(), deadline);
        }
    }
};
