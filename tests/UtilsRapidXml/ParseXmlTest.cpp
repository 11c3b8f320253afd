#include "UtilsRapidXml/ParseXml.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using rapidxml::parse_default;
using rapidxml::parse_non_destructive;
using UtilsRapidXml::IsNestedWithin;
using UtilsRapidXml::MaximumNesting;
using UtilsRapidXml::ParseXml;

/// How deep the elements of a parsed document really lie. By links, since the limit under test is
/// what would keep a recursion from overflowing.
template <typename Ch>
std::size_t DepthOf(const rapidxml::xml_document<Ch>& document)
{
    std::size_t deepest = 0;
    std::size_t depth = 0;
    const rapidxml::xml_node<Ch>* node = &document;
    while (node != nullptr) {
        if (node->first_node() != nullptr) {
            node = node->first_node();
            depth += 1;
        } else {
            while (node->parent() != nullptr && node->next_sibling() == nullptr) {
                node = node->parent();
                depth -= 1;
            }
            node = node->parent() != nullptr ? node->next_sibling() : nullptr;
        }
        if (node != nullptr && node->type() == rapidxml::node_element) {
            deepest = std::max(deepest, depth);
        }
    }
    return deepest;
}

template <typename Ch>
std::basic_string<Ch> Repeat(const std::basic_string<Ch>& text, std::size_t count)
{
    std::basic_string<Ch> result;
    for (std::size_t i = 0; i < count; ++i) {
        result += text;
    }
    return result;
}

bool Parses(std::string text)
{
    rapidxml::xml_document<char> document;
    return ParseXml<parse_default>(document, text.data());
}

bool Parses(std::wstring text)
{
    rapidxml::xml_document<wchar_t> document;
    return ParseXml<parse_non_destructive>(document, text.data());
}

TEST(ParseXml, ReadsNarrowTextInPlace)
{
    std::string text = "<?xml version=\"1.0\"?><a b='c'>d&lt;e</a>";
    rapidxml::xml_document<char> document;

    ASSERT_TRUE(ParseXml<parse_default>(document, text.data()));

    const rapidxml::xml_node<char>* root = document.first_node("a");
    ASSERT_NE(nullptr, root);
    EXPECT_STREQ("d<e", root->value());
    EXPECT_STREQ("c", root->first_attribute("b")->value());
}

TEST(ParseXml, ReadsWideTextWithoutChangingIt)
{
    const std::wstring original = L"<a b='c'>d&lt;e</a>";
    std::wstring text = original;
    rapidxml::xml_document<wchar_t> document;

    ASSERT_TRUE(ParseXml<parse_non_destructive>(document, text.data()));

    const rapidxml::xml_node<wchar_t>* root = document.first_node(L"a");
    ASSERT_NE(nullptr, root);
    EXPECT_EQ(L"d&lt;e", std::wstring(root->value(), root->value_size()));
    EXPECT_EQ(original, text);
}

struct VRefusedCase
{
    const char* name;
    std::string text;
    bool accepted;
};

void PrintTo(const VRefusedCase& refused, std::ostream* out)
{
    *out << refused.name;
}

class ParseXmlAcceptance : public testing::TestWithParam<VRefusedCase>
{
};

TEST_P(ParseXmlAcceptance, IsThatOfTheParserInBothWidths)
{
    const std::string& text = GetParam().text;

    EXPECT_EQ(GetParam().accepted, Parses(text));
    EXPECT_EQ(GetParam().accepted, Parses(std::wstring(text.begin(), text.end())));
}

// clang-format off
const VRefusedCase acceptanceCases[] = {
    {"Empty", "", true},
    {"WhiteSpaceOnly", " \t\r\n", true},
    {"TwoRoots", "<a/><b/>", true},
    {"MismatchedEndTag", "<a>1</b>", true},
    {"ShortForm", "<a/>", true},
    {"ShortFormWithAttribute", "<a b=\"/>\"/>", true},
    {"CommentAndInstruction", "<!-- <a> --><?pi <a> ?><a/>", true},
    {"Doctype", "<!DOCTYPE a [<!ELEMENT a (b)> [x] ]><a/>", true},
    {"UnknownDeclaration", "<!WHATEVER <a><a/>", true},
    {"EndsAtTheFirstZero", std::string("<a/>\0<", 6), true},
    {"TextAtTopLevel", "text<a/>", false},
    {"UnclosedElement", "<a>", false},
    {"UnclosedTag", "<a", false},
    {"EndTagAlone", "</a>", false},
    {"ZeroInsideAnElement", std::string("<a>\0</a>", 8), false},
    {"NoName", "< a/>", false},
    {"SlashInsideATag", "<a/b>", false},
    {"AttributeWithoutValue", "<a b/>", false},
    {"AttributeWithoutQuotes", "<a b=c/>", false},
    {"UnclosedAttribute", "<a b=\"c/>", false},
    {"UnclosedComment", "<!-- <a/>", false},
    {"UnclosedCdata", "<a><![CDATA[</a>", false},
    {"UnclosedDoctype", "<!DOCTYPE a [<a/>", false},
    {"UnclosedInstruction", "<?a <a/>", false},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Texts, ParseXmlAcceptance, testing::ValuesIn(acceptanceCases),
                         [](const auto& parameters) { return parameters.param.name; });

TEST(ParseXml, PassesAByteOrderMark)
{
    std::string text = "\xEF\xBB\xBF<?xml version=\"1.0\"?><a/>";
    rapidxml::xml_document<char> document;

    ASSERT_TRUE(ParseXml<0>(document, text.data()));

    EXPECT_STREQ("a", document.first_node()->name());
}

TEST(ParseXml, LeavesAnEmptyDocumentAfterAFault)
{
    std::wstring text = L"<a/><b/><c";
    rapidxml::xml_document<wchar_t> document;

    ASSERT_FALSE(ParseXml<parse_non_destructive>(document, text.data()));

    EXPECT_EQ(nullptr, document.first_node());
}

TEST(ParseXml, LeavesAnEmptyDocumentWhenTheTextIsNestedTooDeep)
{
    std::wstring text = L"<before/>";
    rapidxml::xml_document<wchar_t> document;
    ASSERT_TRUE(ParseXml<parse_non_destructive>(document, text.data()));
    std::wstring deep = Repeat<wchar_t>(L"<a>", MaximumNesting + 1);

    ASSERT_FALSE(ParseXml<parse_non_destructive>(document, deep.data()));

    EXPECT_EQ(nullptr, document.first_node());
}

TEST(ParseXml, AcceptsExactlyTheMaximumNesting)
{
    const auto nested = [](std::size_t levels) {
        return Repeat<char>("<a>", levels) + Repeat<char>("</a>", levels);
    };
    const auto wide = [](const std::string& text) {
        return std::wstring(text.begin(), text.end());
    };

    EXPECT_TRUE(Parses(nested(MaximumNesting)));
    EXPECT_TRUE(Parses(wide(nested(MaximumNesting))));
    EXPECT_FALSE(Parses(nested(MaximumNesting + 1)));
    EXPECT_FALSE(Parses(wide(nested(MaximumNesting + 1))));
}

TEST(ParseXml, RefusesThreeHundredThousandLevelsWithoutOverflow)
{
    EXPECT_FALSE(Parses(Repeat<char>("<a>", 300000)));
    EXPECT_FALSE(Parses(Repeat<wchar_t>(L"<a>", 300000)));
    EXPECT_FALSE(Parses(Repeat<char>("<a>", 300000) + Repeat<char>("</a>", 300000)));
}

TEST(ParseXml, AcceptsAnyNumberOfSiblings)
{
    EXPECT_TRUE(Parses("<a>" + Repeat<char>("<b>1</b><c/>", 5000) + "</a>"));
    EXPECT_TRUE(Parses(Repeat<wchar_t>(L"<b>1</b><c/>", 5000)));
}

struct VHiddenCase
{
    const char* name;
    std::string text;
};

void PrintTo(const VHiddenCase& hidden, std::ostream* out)
{
    *out << hidden.name;
}

class NestingScan : public testing::TestWithParam<VHiddenCase>
{
};

/// Whatever the scan takes for the end of a construct, elements behind it have to be counted.
TEST_P(NestingScan, SeesElementsThatTheParserSees)
{
    const std::string deep = GetParam().text + Repeat<char>("<e>", MaximumNesting + 1);

    EXPECT_FALSE(IsNestedWithin(deep.c_str(), MaximumNesting));
    EXPECT_FALSE(IsNestedWithin(std::wstring(deep.begin(), deep.end()).c_str(), MaximumNesting));
}

// clang-format off
const VHiddenCase hiddenCases[] = {
    {"Nothing", ""},
    {"QuoteInAnElementName", "<a\">"},
    {"ApostropheInAnElementName", "<a'></a'>"},
    {"LessThanInAnElementName", "<a<b>"},
    {"EqualsInAnElementName", "<a=\">"},
    {"QuoteInAnAttributeName", "<a b\"='c'>"},
    {"OtherQuoteInAValue", "<a b='\"'>"},
    {"GreaterThanInAValue", "<a b='>' c=\">\">"},
    {"SlashBeforeTheEndOfAValue", "<a b='/'>"},
    {"AttributesWithoutBlanks", "<a b='1'c='2'>"},
    {"BlanksAroundEquals", "<a b = \t'1' >"},
    {"QuoteInAText", "<a>\""},
    {"GreaterThanInAText", "<a> > "},
    {"ShortestComment", "<!---->"},
    {"CommentWithDashes", "<!--- -- --->"},
    {"CommentWithQuote", "<!-- ' -->"},
    {"EmptyCdata", "<a><![CDATA[]]>"},
    {"CdataWithBrackets", "<a><![CDATA[ ]]]]>"},
    {"CdataWithQuote", "<a><![CDATA[ ' ]]>"},
    {"CdataInWrongCaseEndsAtItsFirstBracket", "<![cdata[>"},
    {"DoctypeWithQuote", "<!DOCTYPE a '>"},
    {"DoctypeWithBrackets", "<!DOCTYPE [ ' [ ] > ]>"},
    {"DoctypeWithoutBlankEndsAtItsFirstBracket", "<!DOCTYPE[[>"},
    {"InstructionWithQuote", "<?a ' ?>"},
    {"InstructionWithQuestionMarks", "<???" "?>"},
    {"Declaration", "<?xml version='1.0' ?>"},
    {"EndTagWithQuote", "<a></a\">"},
    {"EndTagWithBlank", "<a></a \n>"},
    {"EndTagWithoutName", "<a></>"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Texts, NestingScan, testing::ValuesIn(hiddenCases),
                         [](const auto& parameters) { return parameters.param.name; });

/// A declaration of which the parser, where it is to keep it, reads attributes: their values do not
/// end it, and what looks like a comment in them hides no elements.
TEST(NestingScan, SeesElementsBehindADeclarationThatIsKept)
{
    constexpr int keepDeclaration = rapidxml::parse_declaration_node;
    for (const std::string declaration : {"<?xml a='?><!--'?>", "<?XmL\ta = \"?><![CDATA[\" ?>"}) {
        const std::string deep =
            declaration + Repeat<char>("<e>", 300000) + Repeat<char>("</e>", 300000);
        std::string text = deep + "-->]]>";
        rapidxml::xml_document<char> document;

        EXPECT_FALSE(IsNestedWithin(deep.c_str(), MaximumNesting, true));
        EXPECT_FALSE(ParseXml<keepDeclaration>(document, text.data()));
    }
    std::string proper = "<?xml version='1.0'?><!-- <a> --><a b='?>'/>";
    rapidxml::xml_document<char> document;

    EXPECT_TRUE(ParseXml<keepDeclaration>(document, proper.data()));
    EXPECT_EQ(rapidxml::node_declaration, document.first_node()->type());
    EXPECT_TRUE(IsNestedWithin("<?xml a='?><b><b>'?><a/>", 1, true));
    EXPECT_TRUE(IsNestedWithin("<?xmlb a='?><a/>'?>", 1, true));
}

class NestingScanSkips : public testing::TestWithParam<VHiddenCase>
{
};

/// What the parser does not read as elements does not count, so that no proper text is refused.
TEST_P(NestingScanSkips, WhatHoldsNoElements)
{
    EXPECT_TRUE(IsNestedWithin(GetParam().text.c_str(), 1));
    EXPECT_TRUE(Parses(GetParam().text));
}

// clang-format off
const VHiddenCase skippedCases[] = {
    {"Comment", "<a><!-- <b><c> > --></a>"},
    {"CommentThatBeginsLikeItsEnd", "<a><!--><b><c>--></a>"},
    {"Cdata", "<a><![CDATA[<b><c>]]></a>"},
    {"Instruction", "<a><?b <c><d>?></a>"},
    {"Doctype", "<!DOCTYPE a [<!ELEMENT a <b><c>]><a/>"},
    {"QuotedValue", "<a b=\"<b><c>\" c='<b><c>'/>"},
    {"ClosedSiblings", "<a></a><b></b><c/><d/>"},
    {"BehindTheFirstZero", std::string("<a/>\0<b><c>", 11)},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Texts, NestingScanSkips, testing::ValuesIn(skippedCases),
                         [](const auto& parameters) { return parameters.param.name; });

/// Parses every short text over the characters that matter, each in a frame: whatever the parser
/// accepts has to lie exactly as deep as the scan says. @return how many were accepted
template <int Flags>
std::size_t CompareShortTexts(const std::string& front, std::size_t length, const std::string& end)
{
    const std::string alphabet = "<>/a\"'=!?- ";
    constexpr bool readsDeclaration = (Flags & rapidxml::parse_declaration_node) != 0;
    std::vector<std::size_t> digits(length, 0);
    std::size_t accepted = 0;
    std::size_t place = 0;
    rapidxml::xml_document<char> document; // one for all: it is too large to be made so often
    while (place < length) {
        std::string text = front;
        for (const std::size_t digit : digits) {
            text += alphabet[digit];
        }
        text += end;
        std::string parsed = text;
        document.clear();
        if (ParseXml<Flags>(document, parsed.data())) {
            const std::size_t depth = DepthOf(document);
            EXPECT_TRUE(IsNestedWithin(text.c_str(), depth, readsDeclaration)) << text;
            EXPECT_FALSE(IsNestedWithin(text.c_str(), depth - 1, readsDeclaration)) << text;
            ++accepted;
        }
        for (place = 0; place < length && ++digits[place] == alphabet.size(); ++place) {
            digits[place] = 0;
        }
    }
    return accepted;
}

TEST(NestingScan, AgreesWithTheParserOnEveryShortText)
{
    EXPECT_GT(CompareShortTexts<parse_non_destructive>("<a>", 5, "b></b></a>"), 1000U);
}

TEST(NestingScan, AgreesWithTheParserOnEveryShortDeclaration)
{
    constexpr int flags = parse_non_destructive | rapidxml::parse_declaration_node;

    EXPECT_GT(CompareShortTexts<flags>("<?xml a='", 4, "'?><b><c/></b>"), 1000U);
}

} // namespace
