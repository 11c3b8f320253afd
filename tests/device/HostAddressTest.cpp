#include "ControlStreamClient/HostAddress.h"

#include "ControlStreamClient/Client.h"
#include "ControlStreamClient/Error.h"

#include <future>
#include <memory>
#include <stdexcept>

#include <arpa/inet.h>

#include <gmock/gmock.h>

namespace {

using ControlStream::EErrorKind;
using ControlStream::FindAddresses;
using ControlStream::LookUp;
using ControlStream::VDeadline;
using ControlStream::VError;
using ControlStream::VLookUpResult;
using namespace std::chrono_literals;

std::string ErrorOf(const std::string& host, const VDeadline& deadline, const LookUp& lookUp,
                    EErrorKind kind)
{
    try {
        FindAddresses(host, deadline, lookUp);
    } catch (const VError& error) {
        EXPECT_EQ(kind, error.Kind());
        return error.what();
    }
    return "no error";
}

TEST(HostAddress, DottedAddressIsNeverLookedUp)
{
    const LookUp never = [](const std::string&) -> VLookUpResult {
        ADD_FAILURE() << "it was looked up";
        return {};
    };

    const std::vector<in_addr> found = FindAddresses("192.0.2.7", VDeadline(1h), never);

    ASSERT_EQ(1U, found.size());
    EXPECT_EQ(0xC0000207, ntohl(found[0].s_addr));
}

TEST(HostAddress, NameGivesAllItsAddressesInOrder)
{
    const LookUp two = [](const std::string& host) {
        EXPECT_EQ("stage", host);
        return VLookUpResult{{in_addr{htonl(1)}, in_addr{htonl(2)}}, ""};
    };

    for (const auto limit : {std::chrono::milliseconds(1h), ControlStream::NoLimit}) {
        const std::vector<in_addr> found = FindAddresses("stage", VDeadline(limit), two);

        ASSERT_EQ(2U, found.size());
        EXPECT_EQ(1U, ntohl(found[0].s_addr));
        EXPECT_EQ(2U, ntohl(found[1].s_addr));
    }
}

TEST(HostAddress, NameWithoutAddressIsNoConnection)
{
    const LookUp none = [](const std::string&) { return VLookUpResult{{}, "never heard of it"}; };

    EXPECT_EQ("no IPv4 address is known for stage: never heard of it",
              ErrorOf("stage", VDeadline(1h), none, EErrorKind::NoConnection));
}

TEST(HostAddress, ResolverThatThrowsIsNoConnection)
{
    const LookUp broken = [](const std::string&) -> VLookUpResult {
        throw std::runtime_error("out of threads");
    };

    EXPECT_EQ("no IPv4 address is known for stage: out of threads",
              ErrorOf("stage", VDeadline(1h), broken, EErrorKind::NoConnection));
}

TEST(HostAddress, ResolverThatHangsIsATimeOutThatSaysSo)
{
    auto release = std::make_shared<std::promise<void>>();
    auto ended = std::make_shared<std::promise<void>>();
    const LookUp hanging = [release, ended](const std::string&) {
        release->get_future().wait();
        ended->set_value();
        return VLookUpResult();
    };

    EXPECT_EQ("timed out after 0.02 s, waiting for the address of stage",
              ErrorOf("stage", VDeadline(20ms), hanging, EErrorKind::TimedOut));

    release->set_value();
    ended->get_future().wait();
}

TEST(HostAddress, LocalHostIsKnownToTheSystem)
{
    const VLookUpResult result = ControlStream::LookUpAddresses("localhost");

    ASSERT_FALSE(result.Addresses.empty()) << result.Error;
    EXPECT_EQ(INADDR_LOOPBACK, ntohl(result.Addresses[0].s_addr));
}

TEST(HostAddress, AddressOfTheLaterProtocolIsRefused)
{
    const VLookUpResult result = ControlStream::LookUpAddresses("::1");

    EXPECT_TRUE(result.Addresses.empty());
    EXPECT_FALSE(result.Error.empty());
}

} // namespace
