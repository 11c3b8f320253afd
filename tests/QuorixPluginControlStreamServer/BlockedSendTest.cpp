#include "ConnectionFixture.h"
#include "TooMuch.h"
#include "support/RawClient.h"

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <string>
#include <thread>
#include <vector>

// A sender that waits for a device to read, and all that can end its waiting.

namespace {

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

} // namespace
