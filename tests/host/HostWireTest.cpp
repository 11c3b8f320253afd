#include "RunningHost.h"

#include <gmock/gmock.h>

#include <string>

// What a device sees of the running host, as literal bytes.

using namespace std::string_literals;
using testing::EndsWith;
using testing::StartsWith;
using TestSupport::Connect;
using TestSupport::declaration;
using TestSupport::VRawClient;
using TestSupport::VRunningHost;

namespace {

class HostWire : public testing::Test
{
protected:
    VRunningHost host;
    VRawClient device = Connect();
};

} // namespace

TEST_F(HostWire, AnswersServerInformationByteForByte)
{
    device.Send("\x14\x00\x00\x00<ServerInformation/>"s);

    const std::string reply =
        "\x82\x00\x00\x00"
        "<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"
        "<ServerInformation><StreamVersion major=\"1\" minor=\"0\"/></ServerInformation>"s;
    EXPECT_EQ(reply, device.ReadBytes(reply.size()));
}

TEST_F(HostWire, ListsTheHostsCommandsFirstInAReplyOfTwoTopLevelElements)
{
    const std::string reply = device.Request("<Commands><Correlation>7</Correlation></Commands>");

    EXPECT_THAT(reply, StartsWith(declaration + "<Correlation>7</Correlation><Commands>"
                                                "<Command>Host.Information</Command>"
                                                "<Command>Host.Echo</Command>"));
    EXPECT_THAT(reply, EndsWith("</Commands>"));
}

TEST_F(HostWire, DescribesACommand)
{
    EXPECT_EQ(declaration + "<CommandInformation><Correlation>7</Correlation><Name>Host.Echo</Name>"
                            "<Description>Sends every parameter back as it came.</Description>"
                            "<InputParameters><Parameter><Name>*</Name>"
                            "<Value>Any number of parameters of any names.</Value></Parameter>"
                            "</InputParameters><ReplyParameters><Parameter><Name>*</Name>"
                            "<Value>Each input parameter with its value.</Value></Parameter>"
                            "</ReplyParameters></CommandInformation>",
              device.Request("<CommandInformation><Correlation>7</Correlation>"
                             "<Name>Host.Echo</Name></CommandInformation>"));
}

TEST_F(HostWire, DescribesAnUnknownCommandAsNotFound)
{
    EXPECT_EQ(declaration + "<CommandInformation><Correlation>7</Correlation><Name/>"
                            "<Description>Command not found.</Description><InputParameters/>"
                            "<ReplyParameters/></CommandInformation>",
              device.Request("<CommandInformation><Correlation>7</Correlation>"
                             "<Name>Host.Bogus</Name></CommandInformation>"));
}

TEST_F(HostWire, DescribesAnyEventAsEmpty)
{
    EXPECT_EQ(declaration + "<EventInformation><Name/><Description/><Parameters/>"
                            "</EventInformation>",
              device.Request("<EventInformation>Event.X</EventInformation>"));
}

TEST_F(HostWire, RunsEcho)
{
    EXPECT_EQ(declaration +
                  "<CommandReply><Name>Host.Echo</Name><Correlation>7</Correlation>"
                  "<Result>OK</Result><Parameters>"
                  "<Parameter><Name>a</Name><Value>1 &lt; 2</Value></Parameter>"
                  "<Parameter><Name>b</Name><Value/></Parameter></Parameters></CommandReply>",
              device.Request("<ExecuteCommand><Name>Host.Echo</Name><Correlation>7</Correlation>"
                             "<Parameters><Parameter><Name>b</Name></Parameter>"
                             "<Parameter><Name>a</Name><Value>1 &lt; 2</Value></Parameter>"
                             "</Parameters></ExecuteCommand>"));
}

TEST_F(HostWire, FailsAnUnknownCommandInWords)
{
    EXPECT_EQ(declaration + "<CommandReply><Name>host.echo</Name><Correlation>7</Correlation>"
                            "<Result>Error: Invalid command name or command not valid for the host "
                            "application.</Result><Parameters/></CommandReply>",
              device.Request("<ExecuteCommand><Name>host.echo</Name><Correlation>7</Correlation>"
                             "</ExecuteCommand>"));
}

TEST_F(HostWire, SendsAnEventToADeviceThatHasSentNothing)
{
    TestSupport::ExpectAnswersTheNextGoodFrame(); // the device connected before is in the list

    EXPECT_EQ("ok", host.Command("fire Event.X Id=7"));

    const std::string event = "\xA9\x00\x00\x00"
                              "<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"
                              "<Event><Name>Event.X</Name><Parameters><Parameter><Name>Id</Name>"
                              "<Value>7</Value></Parameter></Parameters></Event>"s;
    EXPECT_EQ(event, device.ReadBytes(event.size()));
}
