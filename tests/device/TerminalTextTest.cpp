#include "korva-control/TerminalText.h"

#include <gmock/gmock.h>

namespace {

struct VTextCase
{
    const char* Name;
    std::string Text;
    std::string Shown;
};

class TerminalText : public testing::TestWithParam<VTextCase>
{
};

TEST_P(TerminalText, IsMadeHarmlessAndOtherwiseKept)
{
    EXPECT_EQ(GetParam().Shown, ForTerminal(GetParam().Text));
}

// clang-format off
const VTextCase textCases[] = {
    {"Controls", "\x01\x1F\x7F\xC2\x80\xC2\x9F", R"(\x01\x1F\x7F\x80\x9F)"},
    {"BesideTheControls", " ~\xC2\xA0\xC2\xAC\xC2\xAE", " ~\xC2\xA0\xC2\xAC\xC2\xAE"},
    {"SoftHyphen", "a\xC2\xAD" "b", R"(a\xADb)"},
    {"ArabicLetterMark", "\xD8\x9C", R"(\u061C)"},
    {"BesideTheArabicLetterMark", "\xD8\x9B\xD8\x9D", "\xD8\x9B\xD8\x9D"},
    {"MongolianSeparator", "\xE1\xA0\x8E", R"(\u180E)"},
    {"BlankWithoutWidth", "\xE2\x80\x8B", R"(\u200B)"},
    {"JoinersAreWritten", "\xE2\x80\x8C\xE2\x80\x8D", "\xE2\x80\x8C\xE2\x80\x8D"},
    {"MarksOfDirection", "\xE2\x80\x8E\xE2\x80\x8F", R"(\u200E\u200F)"},
    {"BeforeTheSeparators", "\xE2\x80\xA7", "\xE2\x80\xA7"},
    {"Separators", "\xE2\x80\xA8\xE2\x80\xA9", R"(\u2028\u2029)"},
    {"Overrides", "\xE2\x80\xAA\xE2\x80\xAE", R"(\u202A\u202E)"},
    {"NarrowBlankAndWideOne", "\xE2\x80\xAF\xE2\x81\x9F", "\xE2\x80\xAF\xE2\x81\x9F"},
    {"SignsWithoutWidth", "\xE2\x81\xA0\xE2\x81\xA4", R"(\u2060\u2064)"},
    {"Isolates", "\xE2\x81\xA6\xE2\x81\xA9", R"(\u2066\u2069)"},
    {"ControlsOfOld", "\xE2\x81\xAA\xE2\x81\xAF\xE2\x81\xB0", "\\u206A\\u206F\xE2\x81\xB0"},
    {"ByteOrderMark", "\xEF\xBB\xBF", R"(\uFEFF)"},
    {"NotesBetweenLines", "\xEF\xBF\xB8\xEF\xBF\xB9\xEF\xBF\xBB\xEF\xBF\xBC", "\xEF\xBF\xB8\\uFFF9\\uFFFB\xEF\xBF\xBC"},
    {"NotUtf8", "\xC3(", "\xEF\xBF\xBD("},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, TerminalText, testing::ValuesIn(textCases),
                         [](const auto& named) { return std::string(named.param.Name); });

TEST(TerminalText, OfSeveralLinesKeepsThem)
{
    EXPECT_EQ("a\n\tb\\r", LinesForTerminal("a\n\tb\r"));
}

TEST(TerminalText, OfAWordIsQuotedWhereItWouldNotStandOut)
{
    EXPECT_EQ("a", WordForTerminal("a"));
    EXPECT_EQ("\"\"", WordForTerminal(""));
    EXPECT_EQ("\"a b\"", WordForTerminal("a b"));
    EXPECT_EQ("\"a\\\"b\"", WordForTerminal("a\"b"));
}

} // namespace
