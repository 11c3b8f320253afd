#include "QuorixPluginControlStreamServer/ControlStreamServer/Server.h"

#include "Arrivals.h"
#include "DebugServices/ThreadName.h"
#include "FakeConnection.h"
#include "notification/AsioPostalService.h"
#include "support/FakeControlSystem.h"

#include <gtest/gtest.h>

#include <stdexcept>

namespace {

using ControlStreamServer::IClientConnection;
using ControlStreamServer::VServer;
using TestSupport::VFakeControlSystem;

#define DECLARATION L"<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"

const std::wstring Information =
    DECLARATION L"<ServerInformation><StreamVersion major=\"1\" minor=\"0\"/></ServerInformation>";
const std::wstring EventE = DECLARATION L"<Event><Name>E</Name><Parameters/></Event>";

/// Tells when the last weak reference to an object has gone: only then its memory is given back.
template <typename T>
class VTrackingAllocator
{
public:
    using value_type = T;

    explicit VTrackingAllocator(bool& released) : released(&released) {}
    template <typename U>
    explicit VTrackingAllocator(const VTrackingAllocator<U>& other) : released(other.released)
    {
    }

    T* allocate(std::size_t count) { return std::allocator<T>().allocate(count); }
    void deallocate(T* memory, std::size_t count)
    {
        *released = true;
        std::allocator<T>().deallocate(memory, count);
    }

    bool operator==(const VTrackingAllocator& other) const { return released == other.released; }
    bool operator!=(const VTrackingAllocator& other) const { return released != other.released; }

    bool* released;
};

class Server : public testing::Test
{
protected:
    std::shared_ptr<VServer>
    Create(const std::shared_ptr<KVR::IPostalService>& postalService = nullptr)
    {
        return VServer::Create(dispatcher, socket, postalService, false);
    }

    std::shared_ptr<VFakeConnection> Connect() const
    {
        auto connection = std::make_shared<VFakeConnection>();
        socket->Connect(connection);
        return connection;
    }

    void FireE() const { dispatcher->FireEvent(L"E", ControlSystem::IParameters()); }

    std::shared_ptr<VFakeControlSystem> dispatcher = std::make_shared<VFakeControlSystem>();
    std::shared_ptr<VFakeSocket> socket = std::make_shared<VFakeSocket>();
};

TEST_F(Server, IsNotCreatedWithoutDispatcherOrSocket)
{
    EXPECT_EQ(nullptr, VServer::Create(nullptr, socket, nullptr, false));
    EXPECT_EQ(nullptr, VServer::Create(dispatcher, nullptr, nullptr, false));
    EXPECT_EQ(0U, dispatcher->GetEventNotification().Count());
}

TEST_F(Server, AnswersWithADispatcherThatKnowsNothing)
{
    const auto server = Create();
    const auto device = Connect();

    EXPECT_TRUE(device->Receive(L"<ServerInformation/>"));
    EXPECT_TRUE(device->Receive(L"<Events/>"));

    EXPECT_EQ((std::vector<std::wstring>{Information, DECLARATION L"<Events/>"}), device->Sent());
}

TEST_F(Server, SendsEachEventToEveryDeviceAlsoOneThatHasSentNothing)
{
    const auto server = Create();
    const auto first = Connect();
    const auto second = Connect();
    second->Receive(L"<ServerInformation/>");

    FireE();

    EXPECT_EQ(std::vector<std::wstring>{EventE}, first->Sent());
    EXPECT_EQ((std::vector<std::wstring>{Information, EventE}), second->Sent());
}

TEST_F(Server, TakesAnEventWithNobodyConnected)
{
    const auto server = Create();

    FireE();

    const auto device = Connect();
    EXPECT_TRUE(device->Sent().empty());
}

TEST_F(Server, RepliesOnlyToTheDeviceThatAsked)
{
    const auto server = Create();
    const auto asking = Connect();
    const auto other = Connect();

    asking->Receive(L"<ServerInformation/>");

    EXPECT_EQ(1U, asking->Sent().size());
    EXPECT_TRUE(other->Sent().empty());
}

TEST_F(Server, OwnsNoConnection)
{
    const auto server = Create();
    auto device = Connect();
    const std::weak_ptr<VFakeConnection> watched = device;

    device.reset();

    EXPECT_TRUE(watched.expired());
}

/// A device that goes away. Its entry goes when `released` becomes true.
class DeadClient : public Server
{
protected:
    std::shared_ptr<VFakeConnection> ConnectMortal()
    {
        auto device =
            std::allocate_shared<VFakeConnection>(VTrackingAllocator<VFakeConnection>(released));
        socket->Connect(device);
        return device;
    }

    bool released = false;
};

TEST_F(DeadClient, IsRemovedAtTheNextEvent)
{
    const auto server = Create();
    const auto before = Connect();
    auto dying = ConnectMortal();
    const auto behind = Connect();
    dying.reset();
    EXPECT_FALSE(released);

    FireE();

    EXPECT_TRUE(released);
    EXPECT_EQ(1U, before->Sent().size());
    EXPECT_EQ(1U, behind->Sent().size());
}

TEST_F(DeadClient, IsRemovedAtTheNextConnection)
{
    const auto server = Create();
    const auto before = Connect();
    auto dying = ConnectMortal();
    const auto behind = Connect();
    dying.reset();
    EXPECT_FALSE(released);

    const auto last = Connect();

    EXPECT_TRUE(released);
    FireE();
    for (const auto& device : {before, behind, last}) {
        EXPECT_EQ(1U, device->Sent().size());
    }
}

TEST_F(DeadClient, IsNeverRemovedBeforeThat)
{
    const auto server = Create();
    const auto other = Connect();
    ConnectMortal().reset();

    other->Receive(L"<ServerInformation/>");
    other->Receive(L"nothing that anybody takes");

    EXPECT_FALSE(released);
}

TEST_F(Server, StopsWhereASendThrowsAndGoesOnWithTheNextEvent)
{
    class VThrowingConnection : public VFakeConnection
    {
    public:
        void Send(const std::wstring& message) override
        {
            if (Sent().empty()) {
                VFakeConnection::Send(message);
                throw std::runtime_error("not a system error");
            }
            VFakeConnection::Send(message);
        }
    };
    const auto server = Create();
    const auto throwing = std::make_shared<VThrowingConnection>();
    socket->Connect(throwing);

    EXPECT_THROW(FireE(), std::runtime_error);
    FireE(); // the mutex has been let go
    Connect();

    EXPECT_EQ(2U, throwing->Sent().size());
}

TEST_F(Server, DestructionEndsEventsAndClosesEveryLiveDevice)
{
    auto server = Create();
    const auto first = Connect();
    const auto second = Connect();
    Connect(); // goes away at once
    EXPECT_EQ(1U, dispatcher->GetEventNotification().Count());

    server.reset();

    EXPECT_EQ(0U, dispatcher->GetEventNotification().Count());
    EXPECT_EQ(1, first->Closed());
    EXPECT_EQ(1, second->Closed());
    FireE();
    EXPECT_TRUE(first->Sent().empty());
}

TEST_F(Server, LeavesItsHandlerOnTheSocketWhichThenClosesWhatComes)
{
    auto server = Create();
    server.reset();

    const auto late = Connect();

    EXPECT_EQ(1, late->Closed());
    EXPECT_FALSE(late->Receive(L"<ServerInformation/>"));
    EXPECT_TRUE(late->Sent().empty());
}

TEST_F(Server, DropsMessagesThatComeAfterItsEnd)
{
    auto server = Create();
    const auto device = Connect();
    server.reset();

    EXPECT_FALSE(device->Receive(L"<ServerInformation/>"));

    EXPECT_FALSE(device->GetMessageCallback().IsSet()); // the callback has dropped the dead target
    EXPECT_TRUE(device->Sent().empty());
}

TEST_F(Server, ConnectionInTheGapBeforeItsOwnerThrows)
{
    class VHastySocket : public VFakeSocket
    {
    public:
        void SetConnectionHandler(ConnectionHandler newHandler) override
        {
            VFakeSocket::SetConnectionHandler(std::move(newHandler));
            EXPECT_THROW(Connect(std::make_shared<VFakeConnection>()), std::bad_weak_ptr);
        }
    };

    const auto server =
        VServer::Create(dispatcher, std::make_shared<VHastySocket>(), nullptr, false);

    EXPECT_NE(nullptr, server);
}

TEST_F(Server, MayBeReleasedByACommandThatItRuns)
{
    std::shared_ptr<VServer> server = Create();
    dispatcher->Commands[L"C"] = [&](const auto&, const auto& success, const auto&) {
        server.reset();
        success(ControlSystem::IParameters());
    };
    const auto device = Connect();

    EXPECT_TRUE(device->Receive(
        L"<ExecuteCommand><Name>C</Name><Correlation>1</Correlation></ExecuteCommand>"));

    EXPECT_EQ(1U, device->Sent().size()); // replied before the message let go of the server
    EXPECT_EQ(1, device->Closed());
}

TEST_F(Server, MayBeReleasedByAnEventThatItSends)
{
    class VReleasingConnection : public VFakeConnection
    {
    public:
        explicit VReleasingConnection(std::shared_ptr<VServer>& server) : server(server) {}
        void Send(const std::wstring& message) override
        {
            server.reset();
            VFakeConnection::Send(message);
        }

    private:
        std::shared_ptr<VServer>& server;
    };
    std::shared_ptr<VServer> server = Create();
    const auto device = std::make_shared<VReleasingConnection>(server);
    socket->Connect(device);

    FireE();

    EXPECT_EQ(nullptr, server);
    EXPECT_EQ(1, device->Closed());
}

class ReplyFunctions : public Server
{
protected:
    ReplyFunctions()
    {
        dispatcher->Commands[L"C"] = [this](const auto&, const auto& s, const auto& f) {
            success = s;
            failure = f;
        };
    }

    static std::wstring Reply(const std::wstring& result)
    {
        return DECLARATION L"<CommandReply><Name>C</Name><Correlation>1</Correlation><Result>" +
               result + L"</Result><Parameters/></CommandReply>";
    }

    const std::wstring request =
        L"<ExecuteCommand><Name>C</Name><Correlation>1</Correlation></ExecuteCommand>";
    VFakeControlSystem::Success success;
    VFakeControlSystem::Failure failure;
};

TEST_F(ReplyFunctions, MayBeCalledLaterAndFromAnotherThread)
{
    const auto server = Create();
    const auto device = Connect();
    device->Receive(request);
    EXPECT_TRUE(device->Sent().empty());

    std::thread([this] { success(ControlSystem::IParameters()); }).join();

    EXPECT_EQ(std::vector<std::wstring>{Reply(L"OK")}, device->Sent());
}

TEST_F(ReplyFunctions, MayBeCalledAfterServerAndParserHaveDied)
{
    auto server = Create();
    const auto device = Connect();
    device->Receive(request);
    server.reset();

    ControlSystem::IResult result;
    result.Code = 2;
    failure(result);

    EXPECT_EQ(std::vector<std::wstring>{Reply(
                  L"Error: Invalid command name or command not valid for the host application.")},
              device->Sent());
}

TEST_F(ReplyFunctions, KeepTheConnectionTheyAnswer)
{
    const auto server = Create();
    auto device = Connect();
    const std::weak_ptr<VFakeConnection> watched = device;
    device->Receive(request);
    device.reset();
    EXPECT_FALSE(watched.expired());

    success.clear();
    failure.clear();

    EXPECT_TRUE(watched.expired());
}

TEST_F(ReplyFunctions, EachMakeAReplyWhereADispatcherCallsBoth)
{
    const auto server = Create();
    const auto device = Connect();
    device->Receive(request);

    success(ControlSystem::IParameters());
    failure(ControlSystem::IResult());

    EXPECT_EQ((std::vector<std::wstring>{Reply(L"OK"), Reply(L"Error: System Error")}),
              device->Sent());
}

TEST_F(ReplyFunctions, LetAnEventComeBetweenRequestAndReply)
{
    const auto server = Create();
    const auto device = Connect();

    device->Receive(request);
    FireE();
    success(ControlSystem::IParameters());

    EXPECT_EQ((std::vector<std::wstring>{EventE, Reply(L"OK")}), device->Sent());
}

class ServerThreads : public Server
{
protected:
    ServerThreads()
    {
        dispatcher->Commands[L"C"] = [this](const auto&, const auto& success, const auto&) {
            threads.Add(DebugServices::GetThreadName());
            success(ControlSystem::IParameters());
        };
    }

    const std::wstring request =
        L"<ExecuteCommand><Name>C</Name><Correlation>1</Correlation></ExecuteCommand>";
    VArrivals<std::string> threads;
};

TEST_F(ServerThreads, RunCommandsWhereTheMessageCame)
{
    const auto server = Create();
    const auto device = Connect();

    std::thread([&] {
        DebugServices::SetThreadName("Reading");
        device->Receive(request);
    }).join();

    EXPECT_EQ(std::vector<std::string>{"Reading"}, threads.All());
    EXPECT_EQ(1U, device->Sent().size());
}

TEST_F(ServerThreads, RunCommandsOnThePostalServiceWhereThereIsOne)
{
    const auto service = std::make_shared<NotificationSystem::VAsioPostalService>("Parsers", 1, 0);
    auto server = Create(service);
    const auto device = Connect();

    device->Receive(request);

    EXPECT_EQ(std::vector<std::string>{"Parsers0"}, threads.Wait(1));
    server.reset();
}

TEST_F(ServerThreads, DropAPostedMessageWhenTheServerHasGoneMeanwhile)
{
    const auto service = std::make_shared<NotificationSystem::VAsioPostalService>("Parsers", 1, 0);
    auto server = Create(service);
    const auto device = Connect();
    VLatch entered;
    VLatch proceed;
    service->Post(
        [&] {
            entered.Open();
            proceed.Wait();
        },
        0);
    entered.Wait();

    device->Receive(request);
    server.reset();
    proceed.Open();
    service->Stop();

    EXPECT_TRUE(threads.All().empty());
    EXPECT_TRUE(device->Sent().empty());
}

} // namespace
