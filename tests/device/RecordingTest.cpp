#include "FakeHost/Recording.h"

#include "device/ClientSupport.h"

#include <sstream>

#include <gmock/gmock.h>

namespace {

using namespace FakeHost;
using namespace std::string_literals;

std::vector<VRecordedMoment> Read(const std::string& text)
{
    std::istringstream input(text);
    return ReadRecording(input, "file");
}

TEST(Recording, KeepsEveryByte)
{
    const std::string texts[] = {"<a>\xD0\xBC\"\\\n</a>", "\xFF\0\x80"s, ""};
    std::string file = HeadLine("host:803") + "\n";
    for (const std::string& text : texts) {
        file += ToLine({1.25, 2, ERecorded::Device, text}) + "\n";
    }

    const std::vector<VRecordedMoment> moments = Read(file);

    ASSERT_EQ(3U, moments.size());
    for (std::size_t i = 0; i < moments.size(); ++i) {
        EXPECT_EQ(texts[i], moments[i].Text);
        EXPECT_EQ(1.25, moments[i].Seconds);
        EXPECT_EQ(2U, moments[i].Connection);
        EXPECT_EQ(ERecorded::Device, moments[i].Kind);
    }
}

TEST(Recording, IsLinesOfJson)
{
    EXPECT_EQ(R"({"recording":"korva-control recording","version":1,"host":"h:803"})",
              HeadLine("h:803"));
    EXPECT_EQ(R"({"seconds":0.5,"connection":1,"what":"host","text":"<Events/>"})",
              ToLine({0.5, 1, ERecorded::Host, "<Events/>"}));
    EXPECT_EQ(R"({"seconds":0.123457,"connection":1,"what":"device","hex":"ff00"})",
              ToLine({0.12345678, 1, ERecorded::Device, "\xFF\0"s}));
    EXPECT_EQ(R"({"seconds":0.0,"connection":3,"what":"connected"})",
              ToLine({0, 3, ERecorded::Connected, ""}));
    EXPECT_EQ(R"({"seconds":0.0,"connection":3,"what":"closed"})",
              ToLine({0, 3, ERecorded::Closed, ""}));
}

struct VFaultyRecording
{
    const char* Name;
    std::string Text;
    std::string Reason;
};

class FaultyRecording : public testing::TestWithParam<VFaultyRecording>
{
};

TEST_P(FaultyRecording, IsRefusedWithItsLine)
{
    const VThrown thrown = ThrownBy([&] { Read(GetParam().Text); });

    EXPECT_EQ((VThrown{ControlStream::EErrorKind::Usage, GetParam().Reason}), thrown);
}

const std::string head = HeadLine("h") + "\n";

// clang-format off
const VFaultyRecording faultyRecordings[] = {
    {"Empty", "", "file holds nothing that was recorded"},
    {"OnlyAHead", head, "file holds nothing that was recorded"},
    {"NoHead", R"({"seconds":0,"connection":1,"what":"closed"})", "file, line 1: it is not the head of a recording"},
    {"OtherVersion", R"({"recording":"korva-control recording","version":2})", "file, line 1: it is not the head of a recording"},
    {"NoJson", head + "x", "file, line 2: it is no JSON object"},
    {"AnArray", head + "[]", "file, line 2: it is no JSON object"},
    {"NotUtf8", head + "{\"what\":\"\xFF\"}", "file, line 2: it is no JSON object"},
    {"NoSeconds", head + R"({"connection":1,"what":"closed"})", "file, line 2: \"seconds\" must be a number from 0 on"},
    {"NegativeSeconds", head + R"({"seconds":-1,"connection":1,"what":"closed"})", "file, line 2: \"seconds\" must be a number from 0 on"},
    {"NoConnection", head + R"({"seconds":1,"what":"closed"})", "file, line 2: \"connection\" must be a whole number above 0"},
    {"ConnectionZero", head + R"({"seconds":1,"connection":0,"what":"closed"})", "file, line 2: \"connection\" must be a whole number above 0"},
    {"NoKind", head + R"({"seconds":1,"connection":1})", "file, line 2: \"what\" must be \"connected\", \"device\", \"host\" or \"closed\""},
    {"OtherKind", head + R"({"seconds":1,"connection":1,"what":5})", "file, line 2: \"what\" must be \"connected\", \"device\", \"host\" or \"closed\""},
    {"NoText", head + R"({"seconds":1,"connection":1,"what":"host"})", "file, line 2: a frame needs its \"text\", or its bytes as \"hex\""},
    {"OddHex", head + R"({"seconds":1,"connection":1,"what":"host","hex":"f"})", "file, line 2: a frame needs its \"text\", or its bytes as \"hex\""},
    {"NoHex", head + R"({"seconds":1,"connection":1,"what":"host","hex":"zz"})", "file, line 2: a frame needs its \"text\", or its bytes as \"hex\""},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, FaultyRecording, testing::ValuesIn(faultyRecordings),
                         [](const auto& named) { return std::string(named.param.Name); });

} // namespace
