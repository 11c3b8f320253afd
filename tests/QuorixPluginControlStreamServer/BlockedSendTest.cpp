#include "ConnectionFixture.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/LastBytes.h"
#include "TooMuch.h"
#include "support/RawClient.h"

#include <gtest/gtest.h>

#include <linux/sockios.h>
#include <sys/ioctl.h>

#include <atomic>
#include <chrono>
#include <memory>
#include <string>
#include <thread>
#include <vector>

// A sender that waits for a device to read, and all that can end its waiting.

namespace {

using ControlStreamServer::AwaitLastBytes;
using ControlStreamServer::IClientConnection;
using TestSupport::VRawClient;

class BlockedSend : public VConnectionFixture
{
protected:
    BlockedSend() : client(socket->Port(), SmallBuffer), connection(ConnectionOf(0).lock())
    {
        sender = std::thread([this] {
            connection->Send(std::wstring(TooMuch, L'x'));
            returned = true;
        });
        // The first bytes are there, and the last cannot be.
        blocked = BecomesTrue([this] { return client.IsReadable(); }) && !returned;
    }

    ~BlockedSend() override
    {
        client.Close(); // so that a test that has failed ends too
        sender.join();
    }

    VRawClient client;
    std::shared_ptr<IClientConnection> connection;
    std::atomic<bool> returned{false};
    bool blocked = false;
    std::thread sender;
};

TEST_F(BlockedSend, GoesOnWhenThePeerReads)
{
    ASSERT_TRUE(blocked);

    EXPECT_EQ(std::string(TooMuch, 'x'), client.ReadFrame());

    EXPECT_TRUE(BecomesTrue([this] { return returned.load(); }));
}

TEST_F(BlockedSend, ReturnsWhenThePeerCloses)
{
    ASSERT_TRUE(blocked);

    client.Close();

    EXPECT_TRUE(BecomesTrue([this] { return returned.load(); }));
}

TEST_F(BlockedSend, ReturnsWhenThePeerIsKilled)
{
    ASSERT_TRUE(blocked);

    client.Reset();

    EXPECT_TRUE(BecomesTrue([this] { return returned.load(); }));
}

TEST_F(BlockedSend, ReturnsWhenTheConnectionIsClosedHere)
{
    ASSERT_TRUE(blocked);

    connection->Close();

    EXPECT_TRUE(BecomesTrue([this] { return returned.load(); }));
}

TEST_F(BlockedSend, DoesNotKeepTheConnectionFromReading)
{
    ASSERT_TRUE(blocked);

    client.SendFrame("request");

    EXPECT_EQ(std::vector<std::wstring>{L"request"}, messages.Wait(1));
    connection->Close();
}

bool IsAllRead(int descriptor)
{
    int unread = 0;
    return ::ioctl(descriptor, FIONREAD, &unread) != 0 || unread == 0;
}

bool IsClosing(int descriptor)
{
    tcp_info info{};
    socklen_t size = sizeof info;
    return ::getsockopt(descriptor, IPPROTO_TCP, TCP_INFO, &info, &size) != 0 ||
           info.tcpi_state != TCP_ESTABLISHED;
}

using Closing = VConnectionFixture;

/// A device that sends without end, whose messages are not read any more.
class LastBytes : public VConnectionFixture
{
protected:
    LastBytes() : client(socket->Port(), SmallBuffer), connection(ConnectionOf(0).lock())
    {
        onMessage = [this](const std::shared_ptr<IClientConnection>&) {
            entered.Open();
            held.Wait();
        };
        client.SendFrame("holds the reading");
        entered.Wait();
        client.SendFrame("unread");
    }

    ~LastBytes() override { held.Open(); }

    VLatch entered;
    VLatch held;
    VRawClient client;
    std::shared_ptr<IClientConnection> connection;
};

TEST_F(LastBytes, ReachADeviceThatSendsWhileItsConnectionIsClosed)
{
    const std::string text(std::size_t{64} * 1024, 'x'); // more than the device's own buffer holds
    connection->Send(std::wstring(text.begin(), text.end()));
    std::thread closing([this] { connection->Close(); });

    EXPECT_EQ(text, client.ReadFrame());

    EXPECT_EQ("", client.ReadToEnd());
    closing.join();
}

TEST_F(LastBytes, AreLeftToTheSystemWhereTheDeviceDoesNotReadThem)
{
    const std::string text(std::size_t{64} * 1024, 'x');
    connection->Send(std::wstring(text.begin(), text.end()));

    connection->Close(); // returns

    EXPECT_EQ(text, client.ReadFrame());
}

/// Many devices that read no more would otherwise add up to a stop that does not end.
TEST_F(LastBytes, AreWaitedForOnlyWhileTheDeviceTakesThem)
{
    const int descriptor = OtherEndOf(client);
    connection->Send(std::wstring(std::size_t{64} * 1024, L'x'));

    AwaitLastBytes(descriptor, std::chrono::hours(1)); // returns

    std::thread sending([this] {
        while (client.SendFrame("without end")) {
        }
    });
    AwaitLastBytes(descriptor, std::chrono::hours(1)); // returns
    connection->Close();
    sending.join();
}

/// A reset overtakes bytes that are on their way, and then they are lost.
TEST_F(LastBytes, AreWaitedForUntilTheDeviceHasAcknowledgedThem)
{
    const int later = 0; // some 40 milliseconds
    ASSERT_EQ(0,
              ::setsockopt(client.Descriptor(), IPPROTO_TCP, TCP_QUICKACK, &later, sizeof later));
    const int descriptor = OtherEndOf(client);
    connection->Send(L"the last");

    AwaitLastBytes(descriptor, std::chrono::hours(1));

    int owed = -1;
    EXPECT_EQ(0, ::ioctl(descriptor, SIOCOUTQ, &owed));
    EXPECT_EQ(0, owed);
    connection->Close();
}

/// The wait throws away what comes in, so that nothing behind it can be told from a frame.
TEST_F(LastBytes, AreWaitedForWithNothingDeliveredAnyMore)
{
    connection->Send(std::wstring(std::size_t{64} * 1024, L'x'));
    const int descriptor = OtherEndOf(client);
    std::thread closing([this] { connection->Close(); });
    EXPECT_TRUE(BecomesTrue([descriptor] { return IsAllRead(descriptor); }));

    held.Open();
    while (client.SendFrame("late")) {
    }

    closing.join();
    EXPECT_EQ(std::vector<std::wstring>{L"holds the reading"}, messages.Wait(1));
}

/// Either the wait or the reading gets the rest of a frame, so that one round may prove nothing.
TEST_F(Closing, DeliversNoFrameWhoseRestComesMeanwhile)
{
    for (std::size_t round = 0; round < 10; ++round) {
        VRawClient device(socket->Port(), SmallBuffer);
        const std::shared_ptr<IClientConnection> connection = ConnectionOf(round).lock();
        const int descriptor = OtherEndOf(device);
        connection->Send(std::wstring(std::size_t{64} * 1024, L'x'));
        device.Send(TestSupport::Frame("half").substr(0, 6));
        EXPECT_TRUE(BecomesTrue([descriptor] { return IsAllRead(descriptor); }));
        std::thread closing([&connection] { connection->Close(); });
        EXPECT_TRUE(BecomesTrue([descriptor] { return IsClosing(descriptor); }));

        device.Send("lf");

        closing.join();
    }
    EXPECT_TRUE(messages.All().empty());
}

} // namespace
