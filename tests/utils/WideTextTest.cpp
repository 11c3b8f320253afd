#include "utils/WideText.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <vector>

using KVR::Utf8ToWide;
using KVR::WideToUtf8;
using namespace std::string_literals;

namespace {

/// Encodes as the standard's table of bit patterns says, surrogates included.
std::string BytesOf(std::uint32_t codePoint)
{
    const auto byte = [](std::uint32_t value) { return static_cast<char>(value); };
    const auto tail = [&](unsigned shift) { return byte(0x80 | (codePoint >> shift & 0x3F)); };
    if (codePoint < 0x80) {
        return {byte(codePoint)};
    }
    if (codePoint < 0x800) {
        return {byte(0xC0 | codePoint >> 6), tail(0)};
    }
    if (codePoint < 0x10000) {
        return {byte(0xE0 | codePoint >> 12), tail(6), tail(0)};
    }
    return {byte(0xF0 | codePoint >> 18), tail(12), tail(6), tail(0)};
}

std::wstring UnitsOf(std::uint32_t codePoint)
{
    if (codePoint < 0x10000) {
        return {static_cast<wchar_t>(codePoint)};
    }
    return {static_cast<wchar_t>(0xD800 + ((codePoint - 0x10000) >> 10)),
            static_cast<wchar_t>(0xDC00 + ((codePoint - 0x10000) & 0x3FF))};
}

bool IsSurrogate(std::uint32_t codePoint)
{
    return codePoint >= 0xD800 && codePoint <= 0xDFFF;
}

struct VRange
{
    int First;
    int Last;
};

/// The well-formed sequences: ranges of the first byte and of those behind it.
struct VWellFormedRow
{
    VRange Lead;
    std::vector<VRange> Tails;
};

// clang-format off
const VWellFormedRow wellFormedRows[] = {
    {{0x00, 0x7F}, {}},
    {{0xC2, 0xDF}, {{0x80, 0xBF}}},
    {{0xE0, 0xE0}, {{0xA0, 0xBF}, {0x80, 0xBF}}},
    {{0xE1, 0xEC}, {{0x80, 0xBF}, {0x80, 0xBF}}},
    {{0xED, 0xED}, {{0x80, 0x9F}, {0x80, 0xBF}}},
    {{0xEE, 0xEF}, {{0x80, 0xBF}, {0x80, 0xBF}}},
    {{0xF0, 0xF0}, {{0x90, 0xBF}, {0x80, 0xBF}, {0x80, 0xBF}}},
    {{0xF1, 0xF3}, {{0x80, 0xBF}, {0x80, 0xBF}, {0x80, 0xBF}}},
    {{0xF4, 0xF4}, {{0x80, 0x8F}, {0x80, 0xBF}, {0x80, 0xBF}}},
};
// clang-format on

bool Contains(const VRange& range, unsigned char byte)
{
    return byte >= range.First && byte <= range.Last;
}

/// Decodes by that table: a well-formed sequence is a character, and the longest beginning of one
/// that does not go on is a single U+FFFD, as is a byte that begins none.
std::wstring Expected(const std::string& bytes)
{
    std::wstring text;
    std::size_t i = 0;
    while (i < bytes.size()) {
        const auto lead = static_cast<unsigned char>(bytes[i]);
        const auto row =
            std::find_if(std::begin(wellFormedRows), std::end(wellFormedRows),
                         [lead](const VWellFormedRow& each) { return Contains(each.Lead, lead); });
        ++i;
        if (row == std::end(wellFormedRows)) {
            text += L'\uFFFD';
            continue;
        }
        std::size_t taken = 0;
        std::uint32_t codePoint = row->Tails.empty() ? lead : lead & (0x3Fu >> row->Tails.size());
        while (taken < row->Tails.size() && i < bytes.size() &&
               Contains(row->Tails[taken], static_cast<unsigned char>(bytes[i]))) {
            codePoint = codePoint << 6 | (static_cast<unsigned char>(bytes[i]) & 0x3F);
            ++taken;
            ++i;
        }
        text += taken == row->Tails.size() ? UnitsOf(codePoint) : L"\uFFFD"s;
    }
    return text;
}

struct VDecodeCase
{
    const char* Name;
    std::string Bytes;
    std::wstring Text;
};

// Bytes and text behind them are separate literals: in one, "\xFF" "A" would be a single escape.
// clang-format off
const VDecodeCase decodeCases[] = {
    {"Empty", "", L""},
    {"Ascii", "Quorix", L"Quorix"},
    {"Zero", "a\0b"s, L"a\0b"s},
    {"TwoBytes", "\xC3\xA9", L"\u00E9"},
    {"ThreeBytes", "\xE4\xB8\x80", L"\u4E00"},
    {"FourBytesAreTwoUnits", "\xF0\x9F\x98\x80", {wchar_t(0xD83D), wchar_t(0xDE00)}},
    {"LastCodePoint", "\xF4\x8F\xBF\xBF", {wchar_t(0xDBFF), wchar_t(0xDFFF)}},
    {"NoncharactersStay", "\xEF\xBF\xBE\xEF\xBF\xBF", {wchar_t(0xFFFE), wchar_t(0xFFFF)}},
    {"ByteOrderMarkStays", "\xEF\xBB\xBF" "a", L"\uFEFFa"},
    {"ByteOrderMarkAlone", "\xEF\xBB\xBF", L"\uFEFF"},
    {"FourBytesCutToThree", "\xF0\x9F\x98", L"\uFFFD"},
    {"FourBytesCutToTwo", "\xF0\x9F", L"\uFFFD"},
    {"FourBytesCutToOne", "\xF0", L"\uFFFD"},
    {"ThreeBytesCutToTwo", "\xE2\x82", L"\uFFFD"},
    {"CutInsideAText", "\xE2\x82" "A", L"\uFFFDA"},
    {"CutBeforeAnotherCut", "\xE2\x82\xE2\x82", L"\uFFFD\uFFFD"},
    {"OverlongZero", "\xC0\x80", L"\uFFFD\uFFFD"},
    {"OverlongSlash", "\xC0\xAF", L"\uFFFD\uFFFD"},
    {"OverlongTwoBytes", "\xC1\xBF", L"\uFFFD\uFFFD"},
    {"OverlongThreeBytes", "\xE0\x80\x80", L"\uFFFD\uFFFD\uFFFD"},
    {"OverlongFourBytes", "\xF0\x80\x80\x80", L"\uFFFD\uFFFD\uFFFD\uFFFD"},
    {"InvalidByte", "\xFF", L"\uFFFD"},
    {"InvalidByteBeforeText", "\xFF" "A", L"\uFFFDA"},
    {"LoneContinuation", "\x80", L"\uFFFD"},
    {"LoneContinuations", "\x80\xBF", L"\uFFFD\uFFFD"},
    {"ContinuationBehindACharacter", "\xC3\xA9\x80", L"\u00E9\uFFFD"},
    {"EncodedSurrogate", "\xED\xA0\x80", L"\uFFFD\uFFFD\uFFFD"},
    {"EncodedSurrogatePair", "\xED\xA0\xBD\xED\xB8\x80", L"\uFFFD\uFFFD\uFFFD\uFFFD\uFFFD\uFFFD"},
    {"AboveTheLastCodePoint", "\xF4\x90\x80\x80", L"\uFFFD\uFFFD\uFFFD\uFFFD"},
    {"FiveBytes", "\xF8\x88\x80\x80\x80", L"\uFFFD\uFFFD\uFFFD\uFFFD\uFFFD"},
    {"SixBytes", "\xFC\x84\x80\x80\x80\x80", L"\uFFFD\uFFFD\uFFFD\uFFFD\uFFFD\uFFFD"},
    {"StandardsExample", "a\xF1\x80\x80\xE1\x80\xC2" "b\x80" "c\x80\xBF" "d",
        L"a\uFFFD\uFFFD\uFFFD" L"b\uFFFD" L"c\uFFFD\uFFFD" L"d"},
};

struct VEncodeCase
{
    const char* Name;
    std::wstring Text;
    std::string Bytes;
};

const VEncodeCase encodeCases[] = {
    {"Empty", L"", ""},
    {"Zero", L"a\0b"s, "a\0b"s},
    {"SurrogatePair", {wchar_t(0xD83D), wchar_t(0xDE00)}, "\xF0\x9F\x98\x80"},
    {"LoneLead", {wchar_t(0xD83D)}, "\xEF\xBF\xBD"},
    {"LoneTrail", {wchar_t(0xDE00)}, "\xEF\xBF\xBD"},
    {"LeadBeforeText", {wchar_t(0xD83D), L'a'}, "\xEF\xBF\xBD" "a"},
    {"TrailBehindText", {L'a', wchar_t(0xDE00)}, "a\xEF\xBF\xBD"},
    {"SwappedPair", {wchar_t(0xDE00), wchar_t(0xD83D)}, "\xEF\xBF\xBD\xEF\xBF\xBD"},
    {"TwoLeadsAndATrail", {wchar_t(0xD83D), wchar_t(0xD83D), wchar_t(0xDE00)},
        "\xEF\xBF\xBD\xF0\x9F\x98\x80"},
    {"LeadAndTwoTrails", {wchar_t(0xD83D), wchar_t(0xDE00), wchar_t(0xDE00)},
        "\xF0\x9F\x98\x80\xEF\xBF\xBD"},
    {"LeadBeforeAWholeCharacter", {wchar_t(0xD83D), wchar_t(0x1F600)},
        "\xEF\xBF\xBD\xF0\x9F\x98\x80"},
    {"NoncharactersStay", {wchar_t(0xFFFE), wchar_t(0xFFFF)}, "\xEF\xBF\xBE\xEF\xBF\xBF"},
    {"ByteOrderMarkStays", L"\uFEFFa", "\xEF\xBB\xBF" "a"},
    {"LiteralOfThisCompiler", L"\U0001F600", "\xF0\x9F\x98\x80"},
    {"ElementJustAboveSixteenBits", {wchar_t(0x10000)}, "\xF0\x90\x80\x80"},
    {"LastCodePoint", {wchar_t(0x10FFFF)}, "\xF4\x8F\xBF\xBF"},
    {"AboveTheLastCodePoint", {wchar_t(0x110000)}, "\xEF\xBF\xBD"},
    {"GreatestElement", {wchar_t(0x7FFFFFFF)}, "\xEF\xBF\xBD"},
    {"NegativeElement", {wchar_t(-1)}, "\xEF\xBF\xBD"},
    {"LeastElement", {wchar_t(-0x7FFFFFFF - 1)}, "\xEF\xBF\xBD"},
};
// clang-format on

class DecodeCases : public testing::TestWithParam<VDecodeCase>
{
};

class EncodeCases : public testing::TestWithParam<VEncodeCase>
{
};

} // namespace

TEST_P(DecodeCases, GiveTheirText)
{
    EXPECT_EQ(GetParam().Text, Utf8ToWide(GetParam().Bytes));
}

INSTANTIATE_TEST_SUITE_P(WideText, DecodeCases, testing::ValuesIn(decodeCases),
                         [](const auto& information) { return information.param.Name; });

TEST_P(EncodeCases, GiveTheirBytes)
{
    EXPECT_EQ(GetParam().Bytes, WideToUtf8(GetParam().Text));
}

INSTANTIATE_TEST_SUITE_P(WideText, EncodeCases, testing::ValuesIn(encodeCases),
                         [](const auto& information) { return information.param.Name; });

TEST(WideText, ConvertsEveryCodePointBothWays)
{
    for (std::uint32_t codePoint = 0; codePoint <= 0x10FFFF; ++codePoint) {
        if (IsSurrogate(codePoint)) {
            continue;
        }
        const std::string bytes = BytesOf(codePoint);
        const std::wstring units = UnitsOf(codePoint);
        ASSERT_EQ(units, Utf8ToWide(bytes)) << codePoint;
        ASSERT_EQ(bytes, WideToUtf8(units)) << codePoint;
    }
}

TEST(WideText, EncodesEverySingleElement)
{
    // Units of 16 bits, whole code points and what lies beyond them.
    for (std::uint32_t element = 0; element <= 0x120000; ++element) {
        const bool isCharacter = element <= 0x10FFFF && !IsSurrogate(element);
        const std::string expected = isCharacter ? BytesOf(element) : "\xEF\xBF\xBD";
        ASSERT_EQ(expected, WideToUtf8(std::wstring(1, static_cast<wchar_t>(element)))) << element;
    }
}

TEST(WideText, ReplacesEveryEncodedSurrogate)
{
    for (std::uint32_t surrogate = 0xD800; surrogate <= 0xDFFF; ++surrogate) {
        ASSERT_EQ(L"\uFFFD\uFFFD\uFFFD", Utf8ToWide(BytesOf(surrogate))) << surrogate;
    }
}

TEST(WideText, DecodesEveryByteAndPairOfBytes)
{
    for (int first = 0; first < 256; ++first) {
        const std::string one(1, static_cast<char>(first));
        ASSERT_EQ(Expected(one), Utf8ToWide(one)) << first;
        for (int second = 0; second < 256; ++second) {
            const std::string two = one + static_cast<char>(second);
            ASSERT_EQ(Expected(two), Utf8ToWide(two)) << first << " " << second;
        }
    }
}

TEST(WideText, DecodesEverySequenceOfThreeBytesAtTheEdges)
{
    // The first and last byte of every range in which sequences begin or go on, and the neighbours.
    const std::vector<int> edges = {0x00, 0x41, 0x7F, 0x80, 0x8F, 0x90, 0x9F, 0xA0, 0xBF,
                                    0xC0, 0xC1, 0xC2, 0xDF, 0xE0, 0xE1, 0xEC, 0xED, 0xEE,
                                    0xEF, 0xF0, 0xF1, 0xF3, 0xF4, 0xF5, 0xF8, 0xFF};
    for (const int first : edges) {
        for (const int second : edges) {
            for (const int third : edges) {
                const std::string three = {static_cast<char>(first), static_cast<char>(second),
                                           static_cast<char>(third)};
                ASSERT_EQ(Expected(three), Utf8ToWide(three))
                    << first << " " << second << " " << third;
                for (const int fourth : edges) {
                    const std::string four = three + static_cast<char>(fourth);
                    ASSERT_EQ(Expected(four), Utf8ToWide(four))
                        << first << " " << second << " " << third << " " << fourth;
                }
            }
        }
    }
}

TEST(WideText, DecodesEverySequenceOfThreeBytesThatBeginsLikeOne)
{
    for (int first = 0xE0; first <= 0xEF; ++first) {
        for (int second = 0; second < 256; ++second) {
            for (int third = 0; third < 256; ++third) {
                const std::string three = {static_cast<char>(first), static_cast<char>(second),
                                           static_cast<char>(third)};
                ASSERT_EQ(Expected(three), Utf8ToWide(three))
                    << first << " " << second << " " << third;
            }
        }
    }
}

TEST(WideText, ConvertsAPartOfAText)
{
    EXPECT_EQ(L"ab", Utf8ToWide("abc", 2));
    EXPECT_EQ(L"\uFFFD", Utf8ToWide("\xE4\xB8\x80", 2));
    EXPECT_EQ(L"", Utf8ToWide(nullptr, 0));
    EXPECT_EQ("ab", WideToUtf8(L"abc", 2));
    EXPECT_EQ("", WideToUtf8(nullptr, 0));

    const wchar_t pair[] = {wchar_t(0xD83D), wchar_t(0xDE00)};
    EXPECT_EQ("\xEF\xBF\xBD", WideToUtf8(pair, 1));
}

TEST(WideText, ConvertsALongText)
{
    std::string bytes;
    std::wstring text;
    for (std::uint32_t codePoint = 1; codePoint <= 0x10FFFF; codePoint += 37) {
        if (!IsSurrogate(codePoint)) {
            bytes += BytesOf(codePoint);
            text += UnitsOf(codePoint);
        }
    }

    EXPECT_EQ(text, Utf8ToWide(bytes));
    EXPECT_EQ(bytes, WideToUtf8(text));
}
