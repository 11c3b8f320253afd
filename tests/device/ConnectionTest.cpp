#include "ControlStreamClient/Connection.h"

#include "device/ClientSupport.h"
#include "device/FullListener.h"

#include <gmock/gmock.h>

namespace {

using ControlStream::EErrorKind;
using ControlStream::EWaited;
using ControlStream::LookUp;
using ControlStream::VConnection;
using ControlStream::VDeadline;
using ControlStream::VLookUpResult;
using namespace std::chrono_literals;

constexpr std::uint32_t Loopback = INADDR_LOOPBACK;
constexpr std::uint32_t NextLoopback = INADDR_LOOPBACK + 1;

/// A name that has these addresses, in this order.
LookUp Addresses(std::uint32_t first, std::uint32_t second)
{
    return [first, second](const std::string&) {
        return VLookUpResult{{in_addr{htonl(first)}, in_addr{htonl(second)}}, ""};
    };
}

void GreetAndWait(VPeer& peer)
{
    peer.SendFrame("hello");
    peer.ReadToEnd();
}

TEST(Connection, IsMadeToTheNextAddressWhereOneRefuses)
{
    VScriptedHost host(&GreetAndWait);
    VConnection connection(100, false);

    connection.Open("stage", host.Port(), VDeadline(Patient), Addresses(NextLoopback, Loopback));

    std::string text;
    EXPECT_EQ(EWaited::Ready, connection.Receive(text, VDeadline(Patient)));
    EXPECT_EQ("hello", text);
}

TEST(Connection, IsMadeToTheNextAddressWhereOneDoesNotAnswer)
{
    VScriptedHost host(&GreetAndWait);
    const VFullListener silent(NextLoopback, host.Port());
    VConnection connection(100, false);

    const VDeadline deadline(2s);
    connection.Open("stage", host.Port(), deadline, Addresses(NextLoopback, Loopback));

    EXPECT_TRUE(connection.IsOpen());
    EXPECT_FALSE(deadline.IsOver()) << "the silent address had more than its share";
}

TEST(Connection, LastAddressDecidesWhatIsSaidOfTheFailure)
{
    const VFullListener silent(Loopback);
    const std::string place = "stage:" + std::to_string(silent.Port());

    VConnection connection(100, false);
    EXPECT_EQ((VThrown{EErrorKind::TimedOut,
                       "timed out after 0.1 s, waiting for a connection to " + place}),
              ThrownBy([&] {
                  connection.Open("stage", silent.Port(), VDeadline(100ms),
                                  Addresses(NextLoopback, Loopback));
              }));
    EXPECT_EQ(
        (VThrown{EErrorKind::NoConnection, "no connection to " + place + ": Connection refused"}),
        ThrownBy([&] {
            connection.Open("stage", silent.Port(), VDeadline(100ms),
                            Addresses(Loopback, NextLoopback));
        }));
    EXPECT_FALSE(connection.IsOpen());
}

} // namespace
