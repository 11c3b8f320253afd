#include "ControlStreamClient/Discovery.h"

#include "ControlStreamClient/Client.h"
#include "ControlStreamClient/Error.h"
#include "ControlStreamClient/NetworkInterfaces.h"
#include "device/DiscoverySupport.h"

#include <gmock/gmock.h>

namespace {

using ControlStream::DiscoverAddresses;
using ControlStream::FindHost;
using ControlStream::NoLimit;
using ControlStream::VDiscoveredHost;
using ControlStream::VDiscovery;
using ControlStream::VError;
using testing::ElementsAre;
using testing::IsEmpty;

constexpr std::chrono::milliseconds limit{60000};

std::string FailureOf(const std::string& name)
{
    try {
        return "found " + FindHost(name, limit);
    } catch (const VError& error) {
        EXPECT_EQ(ControlStream::EErrorKind::NoConnection, error.Kind());
        return error.what();
    }
}

class Discovery : public VQuietNetwork
{
};

class HostByName : public VQuietNetwork
{
};

TEST_F(Discovery, FindsAHostWithAllThatItAdvertises)
{
    const VAdvertiser advertiser("Quorix on studio", "studio.local", "127.0.0.5");
    VDiscovery discovery;

    const std::vector<VDiscoveredHost> hosts = discovery.Browse(limit);

    ASSERT_EQ(1U, hosts.size());
    EXPECT_EQ("Quorix on studio", hosts[0].Name);
    EXPECT_EQ("studio.local", hosts[0].HostName);
    EXPECT_EQ("lo", hosts[0].Interface);
    EXPECT_THAT(hosts[0].Addresses, ElementsAre("127.0.0.5"));
    EXPECT_EQ(810, hosts[0].AdvertisedPort);
}

TEST_F(Discovery, FindsSeveralHostsInTheOrderOfTheirNames)
{
    const VAdvertiser second("B\xC3\xBChne 2", 811);
    const VAdvertiser first("B\xC3\xBChne 1");
    VDiscovery discovery;

    const std::vector<VDiscoveredHost> hosts = discovery.Browse(limit);

    ASSERT_EQ(2U, hosts.size());
    EXPECT_EQ("B\xC3\xBChne 1", hosts[0].Name);
    EXPECT_EQ(810, hosts[0].AdvertisedPort);
    EXPECT_EQ("B\xC3\xBChne 2", hosts[1].Name);
    EXPECT_EQ(811, hosts[1].AdvertisedPort);
}

TEST_F(Discovery, GivesIPv4AddressesFirst)
{
    const VAdvertiser advertiser("Quorix"); // of this machine, whose loopback has both kinds
    VDiscovery discovery;

    const std::vector<VDiscoveredHost> hosts = discovery.Browse(limit);

    ASSERT_EQ(1U, hosts.size());
    ASSERT_FALSE(hosts[0].Addresses.empty());
    EXPECT_EQ("127.0.0.1", hosts[0].Addresses[0]);
}

TEST_F(Discovery, EndsByItselfWhereNobodyIsThere)
{
    VDiscovery discovery;

    EXPECT_THAT(discovery.Browse(NoLimit), IsEmpty());
}

TEST_F(Discovery, EndsWithTheLimit)
{
    const VAdvertiser advertiser("Quorix");
    VDiscovery discovery;

    EXPECT_THAT(discovery.Browse(std::chrono::milliseconds(0)), IsEmpty());
}

TEST_F(Discovery, EndsWhenTheCallerHasSeenEnough)
{
    const VAdvertiser advertiser("Quorix");
    VDiscovery discovery;
    int asked = 0;

    const std::vector<VDiscoveredHost> hosts =
        discovery.Browse(limit, [&asked](const std::vector<VDiscoveredHost>& seen) {
            ++asked;
            return !seen.empty();
        });

    EXPECT_EQ(1, asked);
    EXPECT_EQ(1U, hosts.size());
}

TEST_F(Discovery, BrowsesAnewEachTime)
{
    VDiscovery discovery;
    {
        const VAdvertiser advertiser("Quorix");
        EXPECT_EQ(1U, discovery.Browse(limit).size());
    }

    // A word of its going may still be on the way.
    const auto deadline = std::chrono::steady_clock::now() + limit;
    while (!discovery.Browse(limit).empty() && std::chrono::steady_clock::now() < deadline) {
    }
    EXPECT_THAT(discovery.Browse(limit), IsEmpty());
}

TEST_F(Discovery, GivesTheAddressesOfOneName)
{
    const VAdvertiser wanted("Stage 2", "two.local", "127.0.0.5");
    const VAdvertiser other("Stage 1");

    EXPECT_THAT(DiscoverAddresses("Stage 2", limit), ElementsAre("127.0.0.5"));
    EXPECT_THAT(DiscoverAddresses("Stage", limit), IsEmpty());
}

TEST_F(HostByName, TakesAnAddressAndAKnownNameAsTheyAre)
{
    EXPECT_EQ("10.1.2.3", FindHost("10.1.2.3", limit));
    EXPECT_EQ("localhost", FindHost("localhost", limit));
}

TEST_F(HostByName, GivesTheAddressOfWhoAdvertisesItselfSo)
{
    const VAdvertiser advertiser("Quorix on studio", "studio.local", "127.0.0.5");
    const VAdvertiser plain("Stage", "stage.local", "127.0.0.6");

    EXPECT_EQ("127.0.0.5", FindHost("Quorix on studio", limit));
    EXPECT_EQ("127.0.0.6", FindHost("Stage", limit));
}

TEST_F(HostByName, SaysWhereItLookedForAnUnknownName)
{
    EXPECT_EQ("no host advertises itself as 'Quorix on studio'", FailureOf("Quorix on studio"));
    EXPECT_THAT(FailureOf("stage"),
                testing::MatchesRegex("no IPv4 address is known for stage: .*; no host advertises "
                                      "itself as 'stage'"));
}

TEST(NetworkInterfaces, AreThoseThatAreUp)
{
    const std::vector<ControlStream::VNetworkInterface> interfaces =
        ControlStream::ListNetworkInterfaces();

    ASSERT_EQ(1U, interfaces.size());
    EXPECT_EQ("lo", interfaces[0].Name);
    ASSERT_FALSE(interfaces[0].Addresses.empty());
    EXPECT_EQ("127.0.0.1", interfaces[0].Addresses[0]);
}

} // namespace
