#include "LineBuffer.h"

#include <gmock/gmock.h>

#include <string>
#include <vector>

using QuorixHost::VLineBuffer;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

constexpr std::size_t maximumBytes = 5;

/// Feeds a stream in pieces of one size. @return the lines, "(too long)" for one that was
std::vector<std::string> LinesOf(const std::string& stream, std::size_t pieceSize)
{
    VLineBuffer buffer(maximumBytes);
    std::vector<std::string> lines;
    const auto add = [&](const VLineBuffer::VLine& line) {
        lines.push_back(line.tooLong ? "(too long)" : line.text);
    };
    for (std::size_t i = 0; i < stream.size(); i += pieceSize) {
        const std::string piece = stream.substr(i, pieceSize);
        buffer.Append(piece.data(), piece.size());
        while (const auto line = buffer.TakeLine()) {
            add(*line);
        }
    }
    if (const auto last = buffer.TakeLastLine()) {
        add(*last);
    }
    return lines;
}

class LineBuffer : public testing::TestWithParam<std::size_t>
{
};

} // namespace

TEST_P(LineBuffer, CutsAtLineFeeds)
{
    EXPECT_THAT(LinesOf("ab\n\nc\n", GetParam()), ElementsAre("ab", "", "c"));
}

TEST_P(LineBuffer, DropsACarriageReturnBeforeTheLineFeedOnly)
{
    EXPECT_THAT(LinesOf("a\r\nb\rc\n\r\n", GetParam()), ElementsAre("a", "b\rc", ""));
}

TEST_P(LineBuffer, TakesWhatStandsBehindTheLastLineFeed)
{
    EXPECT_THAT(LinesOf("a\nb", GetParam()), ElementsAre("a", "b"));
    EXPECT_THAT(LinesOf("", GetParam()), IsEmpty());
}

TEST_P(LineBuffer, ReportsALineThatIsTooLongAndGoesOn)
{
    EXPECT_THAT(LinesOf("12345\n123456\n12345\r\n123456\r\n1\n", GetParam()),
                ElementsAre("12345", "(too long)", "12345", "(too long)", "1"));
    EXPECT_THAT(LinesOf("1234567890123456789", GetParam()), ElementsAre("(too long)"));
}

TEST_P(LineBuffer, KeepsZeros)
{
    EXPECT_THAT(LinesOf(std::string("a\0b\n", 4), GetParam()), ElementsAre(std::string("a\0b", 3)));
}

INSTANTIATE_TEST_SUITE_P(PieceSizes, LineBuffer, testing::Values(1, 2, 3, 7, 1000));
