#include "QuorixPluginControlStreamServer/ControlStreamServer/ClientConnectionASIO.h"

#include "ConnectionFixture.h"
#include "SegmentCount.h"
#include "support/RawClient.h"

#include <boost/bind/bind.hpp>
#include <gtest/gtest.h>

#include <atomic>
#include <string>
#include <thread>
#include <type_traits>
#include <vector>

namespace {

using namespace std::string_literals;
using ControlStreamServer::IClientConnection;
using ControlStreamServer::VClientConnectionASIO;
using ControlStreamServer::VSocketASIO;
using TestSupport::VRawClient;

static_assert(!std::is_nothrow_destructible_v<IClientConnection>);
static_assert(!std::is_nothrow_destructible_v<VClientConnectionASIO>);

using ClientConnection = VConnectionFixture;

struct VFrameCase
{
    const char* Name;
    std::string Stream;
    std::vector<std::wstring> Messages;
};

void PrintTo(const VFrameCase& frames, std::ostream* out)
{
    *out << frames.Name;
}

// Header and text are separate literals: in one, "\x00A" would be read as a single escape.
// clang-format off
const VFrameCase frameCases[] = {
    {"Nothing", "", {}},
    {"EmptyFrame", "\x00\x00\x00\x00"s, {L""}},
    {"EmptyFrames", "\x00\x00\x00\x00" "\x00\x00\x00\x00" "\x01\x00\x00\x00" "A"s, {L"", L"", L"A"}},
    {"OneFrame", "\x05\x00\x00\x00" "Hello"s, {L"Hello"}},
    {"TwoFramesInOneSegment", "\x01\x00\x00\x00" "A" "\x01\x00\x00\x00" "B"s, {L"A", L"B"}},
    {"LengthIsLittleEndian", "\x01\x01\x00\x00"s + std::string(257, 'x'), {std::wstring(257, L'x')}},
    {"LengthCountsBytes", "\x02\x00\x00\x00" "\xC3\xA9"s, {L"\u00E9"}},
    {"SupplementaryIsASurrogatePair", "\x04\x00\x00\x00" "\xF0\x9F\x98\x80"s, {L"\xD83D\xDE00"}},
    {"LastCodePoint", "\x04\x00\x00\x00" "\xF4\x8F\xBF\xBF"s, {L"\xDBFF\xDFFF"}},
    {"InvalidUtf8IsReplaced", "\x02\x00\x00\x00" "\xFF" "A"s, {L"\uFFFDA"}},
    {"CutSequenceIsReplacedOnce", "\x03\x00\x00\x00" "\xF0\x9F\x98"s, {L"\uFFFD"}},
    {"SequenceCutByAFrameIsNotJoined", "\x02\x00\x00\x00" "\xE4\xB8" "\x01\x00\x00\x00" "\x80"s, {L"\uFFFD", L"\uFFFD"}},
    {"OverlongIsReplaced", "\x02\x00\x00\x00" "\xC0\x80"s, {L"\uFFFD\uFFFD"}},
    {"EncodedSurrogateIsReplaced", "\x03\x00\x00\x00" "\xED\xA0\x80"s, {L"\uFFFD\uFFFD\uFFFD"}},
    {"GoodFrameAfterABadOne", "\x01\x00\x00\x00" "\x80" "\x01\x00\x00\x00" "A"s, {L"\uFFFD", L"A"}},
    {"ZeroByteStays", "\x03\x00\x00\x00" "A\0B"s, {L"A\0B"s}},
    {"ByteOrderMarkStays", "\x03\x00\x00\x00" "\xEF\xBB\xBF"s, {L"\uFEFF"}},
    {"HalfAHeaderIsDropped", "\x01\x00\x00\x00" "A" "\x05\x00\x00"s, {L"A"}},
    {"HalfATextIsDropped", "\x01\x00\x00\x00" "A" "\x05\x00\x00\x00" "Hell"s, {L"A"}},
    {"ClaimOfFourGigabytesIsDropped", "\x01\x00\x00\x00" "A" "\xFF\xFF\xFF\xFF" "Hello"s, {L"A"}},
};
// clang-format on

class ClientConnectionFrames : public ClientConnection,
                               public testing::WithParamInterface<VFrameCase>
{
};

TEST_P(ClientConnectionFrames, AreDeliveredInOrder)
{
    VRawClient client(socket->Port());

    client.Send(GetParam().Stream);
    client.ShutdownWrite();

    EXPECT_EQ("", client.ReadToEnd()); // the server closes once its reading has ended
    EXPECT_EQ(GetParam().Messages, messages.All());
}

TEST_P(ClientConnectionFrames, AreDeliveredByteForByte)
{
    VRawClient client(socket->Port());

    for (const char byte : GetParam().Stream) {
        client.Send(std::string(1, byte));
    }
    client.ShutdownWrite();

    EXPECT_EQ("", client.ReadToEnd());
    EXPECT_EQ(GetParam().Messages, messages.All());
}

INSTANTIATE_TEST_SUITE_P(Table, ClientConnectionFrames, testing::ValuesIn(frameCases),
                         [](const auto& parameters) { return parameters.param.Name; });

TEST_F(ClientConnection, DeliversTextsOfEverySizeAroundItsRoom)
{
    VRawClient client(socket->Port());
    std::vector<std::wstring> expected;

    for (const std::size_t size :
         {1, 65535, 65536, 65537, 7, 131072, 131073, 3, 400000, 0, 400001, 65536, 2000000}) {
        std::string text(size, 'a');
        for (std::size_t i = 0; i < size; ++i) {
            text[i] = static_cast<char>('a' + i % 26);
        }
        expected.emplace_back(text.begin(), text.end());
        client.SendFrame(text);
    }

    EXPECT_EQ(expected, messages.Wait(expected.size()));
}

TEST_F(ClientConnection, DropsMessagesThatNobodyListensToAndReadsOn)
{
    listening = false;
    VRawClient client(socket->Port());
    client.SendFrame("dropped");
    const std::shared_ptr<IClientConnection> connection = ConnectionOf(0).lock();
    ASSERT_NE(nullptr, connection);
    // The first message has been dropped by the time that two more connections have come in, one
    // after the other.
    VRawClient second(socket->Port());
    connections.Wait(2);
    VRawClient third(socket->Port());
    connections.Wait(3);

    connection->GetMessageCallback().SetDirect(
        [this](const std::shared_ptr<IClientConnection>&, const std::wstring& message) {
            messages.Add(message);
        });
    client.SendFrame("heard");

    const std::vector<std::wstring> heard = messages.Wait(1);
    EXPECT_EQ(L"heard", heard.back());
}

TEST_F(ClientConnection, HandsItselfToTheCallback)
{
    VArrivals<std::shared_ptr<IClientConnection>> senders;
    onMessage = [&](const std::shared_ptr<IClientConnection>& sender) { senders.Add(sender); };
    VRawClient client(socket->Port());

    client.SendFrame("A");

    EXPECT_EQ(ConnectionOf(0).lock(), senders.Wait(1)[0]);
    messages.Wait(1); // the callback uses what this test owns
}

TEST_F(ClientConnection, HandlesAMessageToItsEndBeforeItReadsOn)
{
    VLatch proceed;
    std::atomic<int> inside{0};
    std::atomic<int> overlapping{0};
    onMessage = [&](const std::shared_ptr<IClientConnection>& sender) {
        overlapping += inside++ != 0;
        proceed.Wait();
        sender->Send(L"reply");
        --inside;
    };
    VRawClient client(socket->Port());

    client.SendFrame("A");
    client.SendFrame("B");
    EXPECT_TRUE(BecomesTrue([&] { return inside == 1; }));
    EXPECT_TRUE(messages.All().empty());
    proceed.Open();

    EXPECT_EQ("reply", client.ReadFrame());
    EXPECT_EQ("reply", client.ReadFrame());
    EXPECT_EQ((std::vector<std::wstring>{L"A", L"B"}), messages.Wait(2));
    EXPECT_EQ(0, overlapping);
}

struct VSendCase
{
    const char* Name;
    std::wstring Message;
    std::string Bytes;
};

// clang-format off
const VSendCase sendCases[] = {
    {"Empty", L"", "\x00\x00\x00\x00"s},
    {"Ascii", L"A", "\x01\x00\x00\x00" "A"s},
    {"LengthCountsBytes", L"\u00E9", "\x02\x00\x00\x00" "\xC3\xA9"s},
    {"LengthIsLittleEndian", std::wstring(0x10203, L'x'), "\x03\x02\x01\x00"s + std::string(0x10203, 'x')},
    {"ThreeBytes", L"\u4E00", "\x03\x00\x00\x00" "\xE4\xB8\x80"s},
    {"SurrogatePair", L"\xD83D\xDE00", "\x04\x00\x00\x00" "\xF0\x9F\x98\x80"s},
    {"OneElementBeyondTheBasicPlane", L"\U0001F600", "\x04\x00\x00\x00" "\xF0\x9F\x98\x80"s},
    {"LoneSurrogates", L"\xDE00\xD83D", "\x06\x00\x00\x00" "\xEF\xBF\xBD\xEF\xBF\xBD"s},
    {"Zero", L"A\0B"s, "\x03\x00\x00\x00" "A\0B"s},
};
// clang-format on

TEST_F(ClientConnection, SendsExactlyTheseBytes)
{
    VRawClient client(socket->Port());
    const std::shared_ptr<IClientConnection> connection = ConnectionOf(0).lock();

    for (const VSendCase& sent : sendCases) {
        connection->Send(sent.Message);
        EXPECT_EQ(sent.Bytes, client.ReadBytes(sent.Bytes.size())) << sent.Name;
    }
}

/// Header and text in two writes would leave in two segments, the second of which waits for the
/// acknowledgement of the first.
TEST_F(ClientConnection, SendsHeaderAndTextInOneSegment)
{
    VRawClient client(socket->Port());
    const std::shared_ptr<IClientConnection> connection = ConnectionOf(0).lock();
    constexpr std::uint32_t count = 20;

    for (std::uint32_t i = 0; i < count; ++i) {
        connection->Send(L"a message of ordinary length");
        client.ReadFrame();
    }

    EXPECT_EQ(count, DataSegmentsReceived(client.Descriptor()));
}

/// Large enough that the system takes a frame in several parts, between which another might slip.
TEST_F(ClientConnection, SendsWholeFramesFromTwoThreads)
{
    VRawClient client(socket->Port());
    const std::shared_ptr<IClientConnection> connection = ConnectionOf(0).lock();
    constexpr int count = 40;
    const auto filling = [](int index) { return static_cast<std::size_t>(index) * 70001 % 500000; };
    const auto sendAll = [&](wchar_t name) {
        for (int i = 0; i < count; ++i) {
            connection->Send(name + std::to_wstring(i) + std::wstring(filling(i), name));
        }
    };
    std::thread first(sendAll, L'a');
    std::thread second(sendAll, L'b');

    int next[2] = {0, 0};
    for (int i = 0; i < 2 * count; ++i) {
        const std::string text = client.ReadFrame();
        const char name = text.empty() ? '?' : text[0];
        int& index = next[name == 'a' ? 0 : 1];
        EXPECT_TRUE(name + std::to_string(index) + std::string(filling(index), name) == text);
        ++index;
    }
    first.join();
    second.join();
    EXPECT_EQ(count, next[0]);
    EXPECT_EQ(count, next[1]);
}

TEST_F(ClientConnection, DiesWhenItsPeerDisconnects)
{
    VRawClient client(socket->Port());
    const std::weak_ptr<IClientConnection> connection = ConnectionOf(0);
    EXPECT_FALSE(connection.expired());

    client.Close();

    EXPECT_TRUE(BecomesTrue([&] { return connection.expired(); }));
}

TEST_F(ClientConnection, DiesWhenItsPeerResetsInTheMiddleOfAFrame)
{
    VRawClient client(socket->Port());
    const std::weak_ptr<IClientConnection> connection = ConnectionOf(0);
    client.Send("\x0A\x00\x00\x00"
                "Hello"s);

    client.Reset();

    EXPECT_TRUE(BecomesTrue([&] { return connection.expired(); }));
    EXPECT_TRUE(messages.All().empty());
}

TEST_F(ClientConnection, SendsToAPeerThatOnlyStoppedSending)
{
    VRawClient client(socket->Port());
    const std::shared_ptr<IClientConnection> connection = ConnectionOf(0).lock();
    client.SendFrame("last");
    client.ShutdownWrite();
    messages.Wait(1);

    connection->Send(L"reply");

    EXPECT_EQ("reply", client.ReadFrame());
}

TEST_F(ClientConnection, SendToAPeerThatIsGoneReturnsNormally)
{
    VRawClient client(socket->Port());
    const std::shared_ptr<IClientConnection> connection = ConnectionOf(0).lock();

    client.Reset();

    for (int i = 0; i < 100; ++i) {
        connection->Send(std::wstring(10000, L'x'));
    }
}

TEST_F(ClientConnection, ReadsOnWhereNothingCanBeWritten)
{
    VRawClient client(socket->Port());
    const std::shared_ptr<IClientConnection> connection = ConnectionOf(0).lock();
    ASSERT_EQ(0, ::shutdown(OtherEndOf(client), SHUT_WR)); // behind the connection's back

    connection->Send(L"not written");
    client.SendFrame("read");

    EXPECT_EQ(std::vector<std::wstring>{L"read"}, messages.Wait(1));
}

TEST_F(ClientConnection, CloseEndsTheConnection)
{
    VRawClient client(socket->Port());
    const std::weak_ptr<IClientConnection> connection = ConnectionOf(0);

    connection.lock()->Close();

    EXPECT_EQ("", client.ReadToEnd());
    EXPECT_TRUE(BecomesTrue([&] { return connection.expired(); }));
}

TEST_F(ClientConnection, CloseTwiceAndSendAfterwardsDoNothing)
{
    VRawClient client(socket->Port());
    const std::shared_ptr<IClientConnection> connection = ConnectionOf(0).lock();

    connection->Close();
    connection->Close();
    connection->Send(L"late");

    EXPECT_EQ("", client.ReadToEnd());
}

TEST_F(ClientConnection, CloseInTheCallbackDropsWhatFollows)
{
    onMessage = boost::bind(&IClientConnection::Close, boost::placeholders::_1);
    VRawClient client(socket->Port());

    client.SendFrame("first");
    client.SendFrame("second");

    EXPECT_EQ("", client.ReadToEnd());
    const std::weak_ptr<IClientConnection> connection = ConnectionOf(0);
    EXPECT_TRUE(BecomesTrue([&] { return connection.expired(); }));
    EXPECT_EQ(std::vector<std::wstring>{L"first"}, messages.All());
}

/// As a dispatcher does that answers after the plug-in has gone.
TEST_F(ClientConnection, OutlivesItsSocketOnceClosed)
{
    VRawClient client(socket->Port());
    std::shared_ptr<IClientConnection> connection = ConnectionOf(0).lock();

    Stop();
    connection->Send(L"late");
    connection->Close();
    connection.reset();

    EXPECT_EQ("", client.ReadToEnd());
}

TEST_F(ClientConnection, CloseThrowsWithItsLocationWhereTheSystemRefuses)
{
    VRawClient client(socket->Port());
    const std::shared_ptr<IClientConnection> connection = ConnectionOf(0).lock();
    const int descriptor = OtherEndOf(client);
    ASSERT_GE(descriptor, 0);
    ASSERT_EQ(0, ::close(descriptor)); // behind the connection's back

    try {
        connection->Close();
        FAIL() << "nothing was thrown";
    } catch (const boost::system::system_error& error) {
        EXPECT_EQ("close: Bad file descriptor", std::string(error.what()));
    }
    connection->Close(); // the second does nothing all the same
}

} // namespace
