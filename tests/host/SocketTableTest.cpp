#include "SocketTable.h"

#include "StalledPeers.h"
#include "support/TestListener.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <sstream>
#include <string>
#include <unistd.h>

using QuorixHost::VSocketRow;
using testing::HasSubstr;
using testing::IsEmpty;

TEST(SocketTable, ReadsTheSystemsForm)
{
    std::istringstream table("  sl  local_address rem_address   st tx_queue rx_queue tr tm->when "
                             "retrnsmt   uid  timeout "
                             "inode                                                     \n"
                             "   0: 00000000:0323 00000000:0000 0A 00000000:00000003 00:00000000 "
                             "00000000  1000        0 "
                             "12345 1 0000000000000000 100 0 0 10 0                     \n"
                             "  10: 0100007F:0323 0200A8C0:D431 01 0000FFFE:00000010 01:00000014 "
                             "00000000     0        0 "
                             "67890 2 0000000000000000 20 4 30 10 -1\n");

    const std::vector<VSocketRow> rows = QuorixHost::ReadSocketTable(table);

    ASSERT_EQ(2U, rows.size());
    EXPECT_EQ("0.0.0.0", rows[0].localAddress);
    EXPECT_EQ(803, rows[0].localPort);
    EXPECT_EQ(QuorixHost::socketStateListening, rows[0].state);
    EXPECT_EQ(3U, rows[0].receiveQueue);
    EXPECT_EQ(1000U, rows[0].userId);
    EXPECT_EQ(12345U, rows[0].inode);
    EXPECT_EQ("127.0.0.1", rows[1].localAddress);
    EXPECT_EQ("192.168.0.2", rows[1].remoteAddress);
    EXPECT_EQ(54321, rows[1].remotePort);
    EXPECT_EQ(1U, rows[1].state);
    EXPECT_EQ(65534U, rows[1].sendQueue);
    EXPECT_EQ(16U, rows[1].receiveQueue);
}

TEST(SocketTable, ReadsAddressesOfIPv6)
{
    std::istringstream table("   0: 00000000000000000000000001000000:0323 "
                             "B80D0120000000000000000001000000:0000 0A 00000000:00000000 "
                             "00:00000000 00000000     0        0 77 1 0 100 0 0 10 0\n");

    const std::vector<VSocketRow> rows = QuorixHost::ReadSocketTable(table);

    ASSERT_EQ(1U, rows.size());
    EXPECT_EQ("::1", rows[0].localAddress);
    EXPECT_EQ("2001:db8::1", rows[0].remoteAddress);
}

TEST(SocketTable, SkipsLinesOfAnotherForm)
{
    std::istringstream table("\n"
                             "nonsense\n"
                             "  0: 0100007F 00000000:0000 0A 00000000:00000000 00:0 0 0 0 1\n"
                             "  0: 0100007:0323 00000000:0000 0A 00000000:00000000 00:0 0 0 0 1\n"
                             "  0: 0100007G:0323 00000000:0000 0A 00000000:00000000 00:0 0 0 0 1\n"
                             "  0: 0100007F:0323 00000000:0000 0A 00000000\n");

    EXPECT_THAT(QuorixHost::ReadSocketTable(table), IsEmpty());
}

TEST(SocketTable, FindsAnOwnListenerByItsInode)
{
    const TestSupport::VTestListener listener;

    const auto own = QuorixHost::OwnSockets();
    const auto rows = QuorixHost::ReadSocketTables();

    const auto found = std::find_if(rows.begin(), rows.end(), [&](const VSocketRow& row) {
        return row.localPort == listener.Port() && row.state == QuorixHost::socketStateListening;
    });
    ASSERT_NE(rows.end(), found);
    ASSERT_EQ(1U, own.count(found->inode));
    EXPECT_EQ(listener.Descriptor(), own.at(found->inode));
    EXPECT_THAT(QuorixHost::DescribeHolder(found->inode),
                HasSubstr("process " + std::to_string(getpid()) + " ("));
}

TEST(SocketTable, AnInodeOfNobodyHasNoHolder)
{
    EXPECT_EQ("", QuorixHost::DescribeHolder(~std::uint64_t{0}));
}

TEST(StalledPeers, NamesAPeerThatDoesNotReadAndNoOther)
{
    TestSupport::VTestListener listener;
    TestSupport::VRawClient reading(listener.Port());
    const int toReading = listener.Accept();
    TestSupport::VRawClient stalled(listener.Port(), 4096);
    const int toStalled = listener.Accept();
    EXPECT_THAT(QuorixHost::DescribeStalledPeers(listener.Port()),
                "No device has a full send queue.");

    const std::string block(65536, 'x');
    while (send(toStalled, block.data(), block.size(), MSG_DONTWAIT) > 0) {
    }

    EXPECT_THAT(
        QuorixHost::DescribeStalledPeers(listener.Port()),
        testing::MatchesRegex("Devices that do not read what they are sent: 127\\.0\\.0\\.1:" +
                              std::to_string(TestSupport::LocalPort(stalled.Descriptor())) +
                              " \\([0-9]+ bytes unsent\\)\\."));
    close(toReading);
    close(toStalled);
}
