#include "QuorixPluginControlStreamServer/ControlStreamServer/SocketASIO.h"

#include "Arrivals.h"
#include "DebugServices/ThreadName.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/IClientConnection.h"
#include "support/LogCapture.h"
#include "support/RawClient.h"
#include "support/RefusedCall.h"

#include <boost/system/system_error.hpp>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sys/syscall.h>

#include <atomic>
#include <string>
#include <thread>
#include <type_traits>
#include <vector>

namespace {

using ControlStreamServer::IClientConnection;
using ControlStreamServer::ISocket;
using ControlStreamServer::VSocketASIO;
using TestSupport::VLogCapture;
using TestSupport::VRawClient;

static_assert(!std::is_nothrow_destructible_v<ISocket>);
static_assert(!std::is_nothrow_destructible_v<VSocketASIO>);

using Connections = VArrivals<std::weak_ptr<IClientConnection>>;

void CloseAll(const Connections& connections)
{
    for (const auto& connection : connections.All()) {
        if (const auto open = connection.lock()) {
            open->Close();
        }
    }
}

/// A socket of the test itself that is bound to a port of the loopback interface.
class VPlainSocket
{
public:
    VPlainSocket() : descriptor(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0))
    {
        sockaddr_in address{};
        address.sin_family = AF_INET;
        EXPECT_EQ(0,
                  ::bind(descriptor, reinterpret_cast<const sockaddr*>(&address), sizeof address));
        socklen_t size = sizeof address;
        EXPECT_EQ(0, ::getsockname(descriptor, reinterpret_cast<sockaddr*>(&address), &size));
        port = ntohs(address.sin_port);
    }
    ~VPlainSocket() { ::close(descriptor); }

    VPlainSocket(const VPlainSocket&) = delete;
    VPlainSocket& operator=(const VPlainSocket&) = delete;

    std::uint16_t Port() const { return port; }
    int Descriptor() const { return descriptor; }

private:
    const int descriptor;
    std::uint16_t port = 0;
};

/// Makes a socket to which the kernel refuses a system call.
/// @return the exception that this threw, empty for none
std::string FailureWithout(unsigned int systemCall)
{
    std::string failure;
    std::thread([&] {
        TestSupport::RefuseCall(systemCall);
        try {
            const VSocketASIO socket(0);
        } catch (const boost::system::system_error& error) {
            failure = error.what();
        }
    }).join();
    return failure;
}

/// Returns the descriptor of this process that listens on a port.
int ListenerOf(std::uint16_t port)
{
    for (int descriptor = 3; descriptor < 1024; ++descriptor) {
        sockaddr_in own{};
        socklen_t size = sizeof own;
        int listening = 0;
        socklen_t listeningSize = sizeof listening;
        if (::getsockopt(descriptor, SOL_SOCKET, SO_ACCEPTCONN, &listening, &listeningSize) == 0 &&
            listening != 0 &&
            ::getsockname(descriptor, reinterpret_cast<sockaddr*>(&own), &size) == 0 &&
            ntohs(own.sin_port) == port) {
            return descriptor;
        }
    }
    return -1;
}

TEST(Socket, ListensOnAFreePort)
{
    Connections connections;
    VSocketASIO socket(0);
    socket.SetConnectionHandler([&](const auto& connection) { connections.Add(connection); });
    ASSERT_NE(0, socket.Port());

    VRawClient client(socket.Port());

    EXPECT_EQ(1U, connections.Wait(1).size());
    CloseAll(connections);
}

TEST(Socket, AcceptsOnItsOwnThread)
{
    Connections connections;
    VArrivals<std::string> threads;
    VSocketASIO socket(0);
    socket.SetConnectionHandler([&](const auto& connection) {
        threads.Add(DebugServices::GetThreadName());
        connections.Add(connection);
    });

    VRawClient client(socket.Port());

    EXPECT_EQ("VSocketASIO0", threads.Wait(1)[0]);
    connections.Wait(1);
    CloseAll(connections);
}

TEST(Socket, StaysSilentWhereThePortIsTaken)
{
    const VPlainSocket holder;
    ASSERT_EQ(0, ::listen(holder.Descriptor(), 8));
    std::atomic<int> accepted{0};

    {
        VSocketASIO socket(holder.Port());
        socket.SetConnectionHandler([&](const auto&) { ++accepted; });
        EXPECT_EQ(0, socket.Port());
        VRawClient client(holder.Port()); // reaches the holder of the port
        const int taken = ::accept(holder.Descriptor(), nullptr, nullptr);
        EXPECT_GE(taken, 0);
        ::close(taken);
    }

    EXPECT_EQ(0, accepted);
}

TEST(Socket, StaysSilentWhereAnotherOfItsKindListens)
{
    Connections connections;
    VSocketASIO first(0);
    first.SetConnectionHandler([&](const auto& connection) { connections.Add(connection); });

    VSocketASIO second(first.Port());

    EXPECT_EQ(0, second.Port());
    VRawClient client(first.Port());
    connections.Wait(1);
    CloseAll(connections);
}

TEST(Socket, TakesItsPortAgainRightAfterItsConnectionsWereClosedHere)
{
    bool taken = false;
    // Another process may be given the free port in between, but not every time.
    for (int attempt = 0; attempt < 10 && !taken; ++attempt) {
        Connections connections;
        auto socket = std::make_unique<VSocketASIO>(0);
        const std::uint16_t port = socket->Port();
        socket->SetConnectionHandler([&](const auto& connection) { connections.Add(connection); });
        VRawClient client(port);
        connections.Wait(1);
        CloseAll(connections); // closed from this end first, so that the port lingers
        EXPECT_EQ("", client.ReadToEnd());
        client.Close();
        socket.reset();

        const VSocketASIO again(port);
        taken = again.Port() == port;
    }
    EXPECT_TRUE(taken);
}

TEST(Socket, AcceptsTheNextConnectionOnlyAfterTheHandlerHasReturned)
{
    Connections connections;
    VLatch proceed;
    std::atomic<int> inside{0};
    std::atomic<int> mostInside{0};
    VSocketASIO socket(0);
    socket.SetConnectionHandler([&](const auto& connection) {
        mostInside = std::max<int>(mostInside, ++inside);
        proceed.Wait();
        --inside;
        connections.Add(connection);
    });

    VRawClient first(socket.Port());
    VRawClient second(socket.Port()); // the system completes it behind the server's back
    EXPECT_TRUE(BecomesTrue([&] { return inside == 1; }));
    EXPECT_TRUE(connections.All().empty());
    proceed.Open();

    EXPECT_EQ(2U, connections.Wait(2).size());
    EXPECT_EQ(1, mostInside);
    CloseAll(connections);
}

TEST(Socket, CallsTheHandlerNoMoreOnceItIsGone)
{
    std::atomic<int> accepted{0};
    auto socket = std::make_unique<VSocketASIO>(0);
    const std::uint16_t port = socket->Port();
    socket->SetConnectionHandler([&](const auto&) { ++accepted; });

    socket.reset();

    EXPECT_THROW(VRawClient client(port), std::system_error);
    EXPECT_EQ(0, accepted);
}

TEST(Socket, UsesTheHandlerThatWasSetLast)
{
    Connections connections;
    VSocketASIO socket(0);
    socket.SetConnectionHandler([](const auto&) { FAIL() << "replaced"; });
    socket.SetConnectionHandler([&](const auto& connection) { connections.Add(connection); });

    VRawClient client(socket.Port());

    connections.Wait(1);
    CloseAll(connections);
}

TEST(Socket, DestroysItsHandlerLast)
{
    const auto owned = std::make_shared<int>(0);
    auto socket = std::make_unique<VSocketASIO>(0);
    socket->SetConnectionHandler([owned](const auto&) {});
    EXPECT_EQ(2, owned.use_count());

    socket.reset();

    EXPECT_EQ(1, owned.use_count());
}

TEST(Socket, ConnectionThatMeetsNoHandlerEndsTheThreadAndNothingElse)
{
    const VLogCapture log;
    {
        VSocketASIO socket(0);
        VRawClient client(socket.Port());
        EXPECT_TRUE(BecomesTrue([&] { return !log.Texts("Notification").empty(); }));
        EXPECT_THAT(log.Texts("Notification").front(),
                    testing::AllOf(testing::HasSubstr("VSocketASIO0"),
                                   testing::HasSubstr("call to empty boost::function")));
    }
    EXPECT_EQ(1U, log.Texts("Notification").size());
}

TEST(Socket, MayBeReleasedByItsOwnHandler)
{
    std::atomic<int> accepted{0};
    auto socket = std::make_unique<VSocketASIO>(0);
    const std::uint16_t port = socket->Port();
    VLatch bothConnected;
    VLatch released;
    socket->SetConnectionHandler([&](const std::shared_ptr<IClientConnection>& connection) {
        ++accepted;
        bothConnected.Wait();
        socket.reset();
        connection->Close();
        released.Open();
    });

    VRawClient first(port);
    VRawClient second(port);
    bothConnected.Open();
    released.Wait();

    EXPECT_EQ("", first.ReadToEnd());
    EXPECT_EQ("", second.ReadToEnd());
    EXPECT_EQ(1, accepted);
}

TEST(Socket, ClosesAConnectionThatWasAlreadyAcceptedWhenItWasReleasedOnItsOwnThread)
{
    Connections connections;
    VLatch entered;
    VLatch proceed;
    auto socket = std::make_shared<VSocketASIO>(0);
    const std::uint16_t port = socket->Port();
    socket->SetConnectionHandler([&](const std::shared_ptr<IClientConnection>& connection) {
        const bool isFirst = connections.All().empty();
        connection->GetMessageCallback().SetDirect(
            [&, owner = isFirst ? nullptr : std::move(socket)](const auto&, const auto&) {
                entered.Open();
                proceed.Wait();
            });
        connections.Add(connection);
    });
    // The first device keeps the thread busy until the others have come.
    VRawClient busy(port);
    busy.SendFrame("wait");
    entered.Wait();
    // The second has gone before it is accepted: its end releases the socket, which it owns alone.
    // The third is accepted right after it, so that its completion waits behind that end.
    VRawClient(port).Close();
    VRawClient onItsWay(port);
    proceed.Open();

    EXPECT_EQ("", onItsWay.ReadToEnd());
    EXPECT_EQ(2U, connections.All().size());
    EXPECT_EQ(nullptr, socket);
    EXPECT_THROW(VRawClient late(port), std::system_error);
    busy.Close();
    EXPECT_TRUE(BecomesTrue([&] { return connections.All()[0].expired(); }));
}

TEST(Socket, AcceptErrorEndsAcceptingForGoodAndNothingElseIsKept)
{
    Connections connections;
    VArrivals<std::wstring> messages;
    VSocketASIO socket(0);
    socket.SetConnectionHandler([&](const std::shared_ptr<IClientConnection>& connection) {
        connection->GetMessageCallback().SetDirect(
            [&](const std::shared_ptr<IClientConnection>& sender, const std::wstring& message) {
                messages.Add(message);
                sender->Send(message);
            });
        connections.Add(connection);
    });
    VRawClient established(socket.Port());
    connections.Wait(1);
    // Twice: what the thread finds together with the first request may be handled behind it.
    const auto fence = [&] {
        EXPECT_EQ("A", established.Request("A"));
        EXPECT_EQ("A", established.Request("A"));
    };

    // Ends the pending accept with an error, and then listens as before. Newer kernels take the
    // port away with the shutdown, older ones refuse to give it twice.
    const int descriptor = ListenerOf(socket.Port());
    sockaddr_in own{};
    socklen_t size = sizeof own;
    ASSERT_EQ(0, ::getsockname(descriptor, reinterpret_cast<sockaddr*>(&own), &size));
    ASSERT_EQ(0, ::shutdown(descriptor, SHUT_RDWR));
    fence();
    (void)::bind(descriptor, reinterpret_cast<const sockaddr*>(&own), size);
    ASSERT_EQ(0, ::listen(descriptor, 8));
    VRawClient later(socket.Port());
    fence();

    EXPECT_EQ(1U, connections.All().size());
    CloseAll(connections);
}

TEST(Socket, ThrowsOpenWhereNoSocketCanBeMade)
{
    EXPECT_EQ("open: Too many open files", FailureWithout(SYS_socket));

    // Before that, what an I/O service needs.
    EXPECT_EQ("epoll: Too many open files", FailureWithout(SYS_epoll_create1));
}

TEST(Socket, ListensOnAllInterfacesWithAddressReuse)
{
    const VSocketASIO socket(0);
    const int descriptor = ListenerOf(socket.Port());
    ASSERT_GE(descriptor, 0);
    sockaddr_in own{};
    socklen_t size = sizeof own;
    int reuse = 0;
    socklen_t reuseSize = sizeof reuse;

    ASSERT_EQ(0, ::getsockname(descriptor, reinterpret_cast<sockaddr*>(&own), &size));
    ASSERT_EQ(0, ::getsockopt(descriptor, SOL_SOCKET, SO_REUSEADDR, &reuse, &reuseSize));

    EXPECT_EQ(AF_INET, own.sin_family);
    EXPECT_EQ(htonl(INADDR_ANY), own.sin_addr.s_addr);
    EXPECT_NE(0, reuse);
}

TEST(Socket, DestructorThrowsCloseWhereTheSystemRefuses)
{
    std::string thrown;
    try {
        const VSocketASIO socket(0);
        const int descriptor = ListenerOf(socket.Port());
        ASSERT_GE(descriptor, 0);
        ASSERT_EQ(0, ::close(descriptor)); // behind its back
    } catch (const boost::system::system_error& error) {
        thrown = error.what();
    }
    EXPECT_EQ("close: Bad file descriptor", thrown);
}

TEST(Socket, MayBeDestroyedWhileConnectionsComeIn)
{
    for (int round = 0; round < 20; ++round) {
        Connections connections;
        auto socket = std::make_unique<VSocketASIO>(0);
        const std::uint16_t port = socket->Port();
        socket->SetConnectionHandler(
            [&](const std::shared_ptr<IClientConnection>& connection) { connection->Close(); });
        std::atomic<bool> refused{false};
        std::thread device([&] {
            while (!refused) {
                try {
                    VRawClient client(port);
                } catch (const std::system_error&) {
                    refused = true;
                }
            }
        });

        VRawClient client(port);
        socket.reset();

        device.join();
    }
}

} // namespace
