#include "UtilsRapidXml/ParseXml.h"

#include <gtest/gtest.h>

#include <boost/filesystem.hpp>

#include <fstream>
#include <string>
#include <vector>

namespace {

using rapidxml::parse_default;
using rapidxml::parse_non_destructive;
using UtilsRapidXml::ParseXml;

/// Units whose low byte means something to XML: "<", ">", "&", quotes, blanks, "/", "=", "?", "!"
/// and zero, on several planes of the table, with both halves of surrogate pairs among them.
std::vector<wchar_t> UnitsThatLookLikeMarkup()
{
    std::vector<wchar_t> units;
    for (const wchar_t page : {0x0100, 0x0400, 0x4E00, 0xD800, 0xDE00, 0xFF00}) {
        for (const char low : {'<', '>', '&', '"', '\'', ' ', '\t', '\n', '\r', '/', '=', '?', '!',
                               '\0', 'a', ';', '-', '[', ']'}) {
            units.push_back(page + low);
        }
    }
    return units;
}

template <int Flags>
void ExpectOrdinary(wchar_t unit)
{
    const std::wstring name = std::wstring(L"n") + unit + L"n";
    std::wstring text = L"<" + name + L" " + name + L"=\"" + name + L"\" b='" + name + L"'>" +
                        unit + L" " + unit + L"</" + name + L">";
    rapidxml::xml_document<wchar_t> document;

    ASSERT_TRUE(ParseXml<Flags>(document, text.data())) << std::hex << int(unit);

    const rapidxml::xml_node<wchar_t>* root = document.first_node(name.data(), name.size());
    ASSERT_NE(nullptr, root) << std::hex << int(unit);
    EXPECT_EQ(std::wstring(1, unit) + L" " + unit, std::wstring(root->value(), root->value_size()));
    const rapidxml::xml_attribute<wchar_t>* first = root->first_attribute();
    EXPECT_EQ(name, std::wstring(first->name(), first->name_size()));
    EXPECT_EQ(name, std::wstring(first->value(), first->value_size()));
    const rapidxml::xml_attribute<wchar_t>* second = first->next_attribute();
    EXPECT_EQ(name, std::wstring(second->value(), second->value_size()));
}

TEST(WideRapidXml, TakesEveryUnitAboveLatin1ForAnOrdinaryCharacter)
{
    for (const wchar_t unit : UnitsThatLookLikeMarkup()) {
        ExpectOrdinary<parse_non_destructive>(unit);
        ExpectOrdinary<parse_default>(unit);
    }
}

TEST(WideRapidXml, ReadsEveryUnitOfSixteenBitsAsText)
{
    for (int unit = 1; unit <= 0xFFFF; ++unit) {
        if (unit == '<') {
            continue;
        }
        std::wstring text = std::wstring(L"<a>x") + wchar_t(unit) + L"</a>";
        rapidxml::xml_document<wchar_t> document;
        ASSERT_TRUE(ParseXml<parse_non_destructive>(document, text.data())) << std::hex << unit;
        ASSERT_EQ(std::wstring(L"x") + wchar_t(unit),
                  std::wstring(document.first_node()->value(), document.first_node()->value_size()))
            << std::hex << unit;
    }
}

TEST(WideRapidXml, NeverTakesAUnitAboveLatin1ForWhiteSpace)
{
    std::wstring text = L"<a>\u0420\u0120\u0109\u010A\u010D</a>"; // low bytes of blanks
    rapidxml::xml_document<wchar_t> document;

    ASSERT_TRUE(ParseXml<rapidxml::parse_trim_whitespace>(document, text.data()));

    EXPECT_STREQ(L"\u0420\u0120\u0109\u010A\u010D", document.first_node()->value());
}

TEST(WideRapidXml, NormalizesBlanksAroundUnitsAboveLatin1)
{
    std::wstring text = L"<a>\u0420 \t \u013C</a>";
    rapidxml::xml_document<wchar_t> document;

    ASSERT_TRUE(ParseXml<rapidxml::parse_normalize_whitespace>(document, text.data()));

    EXPECT_STREQ(L"\u0420 \u013C", document.first_node()->value());
}

/// Up to 0xFF the wide parser has to read a text as the narrow one does.
TEST(WideRapidXml, ReadsLatin1AsTheNarrowParserDoes)
{
    for (int unit = 1; unit <= 0xFF; ++unit) {
        for (const std::string pattern : {"<a>#</a>", "<a#b/>", "<a x#='1'/>", "<a x='#'/>",
                                          "<a x=\"#\"/>", "<a>b#</a>", "#<a/>", "<a>&#;</a>"}) {
            std::string narrow = pattern;
            narrow[narrow.find('#')] = char(unit);
            std::wstring wide;
            for (const char c : narrow) {
                wide += wchar_t(static_cast<unsigned char>(c));
            }
            rapidxml::xml_document<char> narrowDocument;
            rapidxml::xml_document<wchar_t> wideDocument;

            const bool accepted = ParseXml<parse_default>(narrowDocument, narrow.data());

            ASSERT_EQ(accepted, ParseXml<parse_default>(wideDocument, wide.data()))
                << pattern << " " << std::hex << unit;
            if (accepted && narrowDocument.first_node() != nullptr) {
                std::string narrowPrint;
                print(std::back_inserter(narrowPrint), narrowDocument, 0);
                std::wstring widePrint;
                print(std::back_inserter(widePrint), wideDocument, 0);
                std::wstring widened;
                for (const char c : narrowPrint) {
                    widened += wchar_t(static_cast<unsigned char>(c));
                }
                ASSERT_EQ(widened, widePrint) << pattern << " " << std::hex << unit;
            }
        }
    }
}

TEST(RapidXml, IsIncludedByItsWrapperOnly)
{
    const boost::filesystem::path root = QUORIX_SOURCE_FOLDER;
    std::vector<std::string> including;
    std::size_t read = 0;
    for (const char* folder : {"src", "host", "device", "tools", "tests", "fuzz", "benchmarks"}) {
        if (!boost::filesystem::is_directory(root / folder)) {
            continue;
        }
        for (const auto& entry : boost::filesystem::recursive_directory_iterator(root / folder)) {
            const std::string extension = entry.path().extension().string();
            if (extension != ".h" && extension != ".cpp" && extension != ".in") {
                continue;
            }
            std::ifstream file(entry.path().string());
            ++read;
            for (std::string line; std::getline(file, line);) {
                const std::size_t at = line.find_first_not_of(" \t");
                if (at != std::string::npos && line[at] == '#' &&
                    line.find("include") != std::string::npos &&
                    line.find("rapidxml") != std::string::npos) {
                    including.push_back(entry.path().lexically_relative(root).string());
                }
            }
        }
    }

    EXPECT_GT(read, 20U);
    EXPECT_EQ(std::vector<std::string>(2, "src/UtilsRapidXml/RapidXml.h"), including);
}

} // namespace
