#include "utils/SplitTokens.h"

#include <gtest/gtest.h>

namespace {

struct VSplitCase
{
    const char* Name;
    std::wstring Text;
    std::vector<std::wstring> Tokens;
};

// clang-format off
const VSplitCase splitCases[] = {
    {"Single", L"1", {L"1"}},
    {"Several", L"1,2,3", {L"1", L"2", L"3"}},
    {"Empty", L"", {L""}},
    {"SeparatorAlone", L",", {L"", L""}},
    {"EmptyBetween", L"1,,2", {L"1", L"", L"2"}},
    {"EmptyAtTheEnd", L"1,2,", {L"1", L"2", L""}},
    {"EmptyAtTheStart", L",1", {L"", L"1"}},
    {"WhiteSpaceAround", L" \t1\r\n, 2 ", {L"1", L"2"}},
    {"WhiteSpaceAlone", L" \t\r\n", {L""}},
    {"WhiteSpaceBetweenSeparators", L" , ", {L"", L""}},
    {"WhiteSpaceInside", L" 1 2 ,3", {L"1 2", L"3"}},
    {"SeveralBlanksInside", L"1 \t 2", {L"1 \t 2"}},
    {"OtherBlanksAreText", L"\v1\f,\u00A02", {L"\v1\f", L"\u00A02"}},
    {"QuotesAreDropped", L"\"1\",2", {L"1", L"2"}},
    {"SeparatorInQuotes", L"\"1,2\",3", {L"1,2", L"3"}},
    {"WhiteSpaceInQuotes", L" \" 1 \" ,2", {L" 1 ", L"2"}},
    {"QuotesInsideAToken", L"a\"b,c\"d", {L"ab,cd"}},
    {"EmptyQuotes", L"\"\",1", {L"", L"1"}},
    {"BlankBehindEmptyQuotes", L"\"\" a", {L" a"}},
    {"DoubledQuotes", L"\"a\"\"b\"", {L"ab"}},
    {"UnterminatedQuote", L"1,\"2,3 ", {L"1", L"2,3 "}},
    {"QuoteAlone", L"\"", {L""}},
    {"QuoteAtTheEnd", L"1,2\"", {L"1", L"2"}},
    {"ZeroIsText", std::wstring(L"1\0,2", 4), {std::wstring(L"1\0", 2), L"2"}},
    {"WideText", L"\u043C,\u4E00", {L"\u043C", L"\u4E00"}},
};
// clang-format on

class SplitTokensCases : public testing::TestWithParam<VSplitCase>
{
};

} // namespace

TEST_P(SplitTokensCases, GiveTheirTokens)
{
    EXPECT_EQ(GetParam().Tokens, KVR::SplitTokens(GetParam().Text, L',', L'"', L" \t\n\r"));
}

INSTANTIATE_TEST_SUITE_P(SplitTokens, SplitTokensCases, testing::ValuesIn(splitCases),
                         [](const auto& information) { return information.param.Name; });

TEST(SplitTokens, TakesOtherCharacters)
{
    EXPECT_EQ((std::vector<std::wstring>{L"a", L"b;c", L" d"}),
              KVR::SplitTokens(L"_a_;'b;c'; d", L';', L'\'', L"_"));
    EXPECT_EQ((std::vector<std::wstring>{L" a "}), KVR::SplitTokens(L" a ", L';', L'\'', L""));
}
