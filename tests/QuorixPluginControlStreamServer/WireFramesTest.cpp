#include "WireText.h"

#include <gtest/gtest.h>

#include <string>

// Whole frames as literal bytes, and streams that are cut anywhere.

namespace {

using namespace std::string_literals;
using TestSupport::VFakeControlSystem;
using TestSupport::VRawClient;

struct VFrameExchange
{
    const char* Name;
    std::string Request;
    std::string Reply;
};

// Header and text are separate literals: in one, "\x31<" might be read on as an escape.
// clang-format off
const VFrameExchange frameExchanges[] = {
    {"ServerInformation", "\x14\x00\x00\x00" "<ServerInformation/>"s,
        "\x82\x00\x00\x00" DECLARATION
        "<ServerInformation><StreamVersion major=\"1\" minor=\"0\"/></ServerInformation>"s},
    {"Commands", "\x31\x00\x00\x00" "<Commands><Correlation>1</Correlation></Commands>"s,
        "\x7C\x00\x00\x00" DECLARATION
        "<Correlation>1</Correlation><Commands><Command>C</Command></Commands>"s},
    {"CommandInformation", "\x53\x00\x00\x00"
        "<CommandInformation><Correlation>1</Correlation><Name>X</Name></CommandInformation>"s,
        "\xD4\x00\x00\x00" DECLARATION
        "<CommandInformation><Correlation>1</Correlation><Name/><Description>Command not found.</Description>"
        "<InputParameters/><ReplyParameters/></CommandInformation>"s},
    {"EventInformation", "\x26\x00\x00\x00" "<EventInformation>E</EventInformation>"s,
        "\x7E\x00\x00\x00" DECLARATION
        "<EventInformation><Name/><Description/><Parameters/></EventInformation>"s},
    {"Events", "\x09\x00\x00\x00" "<Events/>"s,
        "\x58\x00\x00\x00" DECLARATION "<Events><Event>E</Event></Events>"s},
    {"ExecuteCommand", "\x9A\x00\x00\x00"
        "<ExecuteCommand><Name>C</Name><Correlation>1</Correlation><Parameters><Parameter><Name>n</Name>"
        "<Value>\xC3\xA9</Value></Parameter></Parameters></ExecuteCommand>"s,
        "\xE0\x00\x00\x00" DECLARATION
        "<CommandReply><Name>C</Name><Correlation>1</Correlation><Result>OK</Result><Parameters><Parameter>"
        "<Name>n</Name><Value>\xC3\xA9</Value></Parameter></Parameters></CommandReply>"s},
};
// clang-format on

TEST(WireFrames, AreTheseBytesForEachMessage)
{
    VRunningServer running;
    running.Dispatcher->CommandNames = {L"C"};
    running.Dispatcher->EventNames = {L"E"};
    running.Dispatcher->Commands[L"C"] = &VFakeControlSystem::Echo;
    VRawClient client(running.Socket->Port());

    for (const VFrameExchange& exchange : frameExchanges) {
        client.Send(exchange.Request);
        EXPECT_EQ(exchange.Reply, client.ReadBytes(exchange.Reply.size())) << exchange.Name;
    }
}

TEST(WireFrames, AreTheseBytesForAnEvent)
{
    VRunningServer running;
    VRawClient client = running.Connect();

    running.Fire(L"E");
    running.Dispatcher->FireEvent(L"E", ControlSystem::IParameters());

    EXPECT_EQ("\xA2\x00\x00\x00" DECLARATION
              "<Event><Name>E</Name><Parameters><Parameter><Name>P</Name><Value>1</Value>"
              "</Parameter></Parameters></Event>"
              "\x61\x00\x00\x00" DECLARATION "<Event><Name>E</Name><Parameters/></Event>"s,
              client.ReadBytes(4 + 162 + 4 + 97));
}

/// The server answers the same wherever the stream is cut into segments.
TEST(WireFrames, MayBeCutAtEveryByte)
{
    VRunningServer running;
    running.Dispatcher->CommandNames = {L"C"};
    running.Dispatcher->EventNames = {L"E"};
    running.Dispatcher->Commands[L"C"] = &VFakeControlSystem::Echo;
    std::string stream;
    std::string replies;
    for (const VFrameExchange& exchange : frameExchanges) {
        stream += exchange.Request;
        replies += exchange.Reply;
    }
    VRawClient other = running.Connect();

    for (std::size_t cut = 0; cut <= stream.size(); ++cut) {
        VRawClient client(running.Socket->Port());
        client.Send(stream.substr(0, cut));
        VRunningServer::Fence(other); // the first part has been read by now
        client.Send(stream.substr(cut));
        ASSERT_EQ(replies, client.ReadBytes(replies.size())) << "cut at " << cut;
    }
}

TEST(WireFrames, MayComeOneByteAtATime)
{
    VRunningServer running;
    running.Dispatcher->CommandNames = {L"C"};
    running.Dispatcher->EventNames = {L"E"};
    running.Dispatcher->Commands[L"C"] = &VFakeControlSystem::Echo;
    VRawClient client(running.Socket->Port());

    for (const VFrameExchange& exchange : frameExchanges) {
        for (const char byte : exchange.Request) {
            client.Send(std::string(1, byte));
        }
        EXPECT_EQ(exchange.Reply, client.ReadBytes(exchange.Reply.size())) << exchange.Name;
    }
}

} // namespace
