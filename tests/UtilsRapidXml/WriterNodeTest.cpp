#include "UtilsRapidXml/WriterNode.h"

#include <gmock/gmock.h>

using namespace UtilsRapidXml;
using testing::ElementsAre;

namespace {

const IVersion unset;
const std::string declaration = R"(<?xml version="1.0" encoding="UTF-8" standalone="no"?>)";

std::string Print(const rapidxml::xml_document<char>& document)
{
    std::string text;
    rapidxml::print(std::back_inserter(text), document, rapidxml::print_no_indenting);
    return text;
}

TEST(WriterNode, BeginsWithADeclaration)
{
    rapidxml::xml_document<char> document;

    const VWriterNode root(document, {2, 0});

    EXPECT_EQ(Print(document), declaration);
}

TEST(WriterNode, WritesElementsAndAttributesInOrder)
{
    rapidxml::xml_document<char> document;
    VWriterNode root(document, {2, 0});

    root.AddChildElement("A", [](VWriterNode& node) {
        EXPECT_TRUE(node.WriteAttribute("x", "1", unset, unset));
        EXPECT_TRUE(node.WriteAttribute("y", "", unset, unset));
        node.AddChildElement("B", [](VWriterNode&) {});
        node.AddChildElement("C", [](VWriterNode&) {});
    });

    EXPECT_EQ(Print(document), declaration + R"(<A x="1" y=""><B/><C/></A>)");
}

TEST(WriterNode, CopiesTheTexts)
{
    rapidxml::xml_document<char> document;
    VWriterNode root(document, {2, 0});

    {
        std::string name(100, 'n');
        std::string value(100, 'v');
        root.AddChildElement(
            name, [&](VWriterNode& node) { node.WriteAttribute(name, value, unset, unset); });
        name.assign(100, '?');
        value.assign(100, '?');
    }

    EXPECT_EQ(Print(document), declaration + "<" + std::string(100, 'n') + " " +
                                   std::string(100, 'n') + "=\"" + std::string(100, 'v') + "\"/>");
}

TEST(WriterNode, EscapesMarkupAndChoosesItsQuotes)
{
    rapidxml::xml_document<char> document;
    VWriterNode root(document, {2, 0});

    root.AddChildElement("A", [](VWriterNode& node) {
        node.WriteAttribute("x", "<&>'", unset, unset);
        node.WriteAttribute("y", "{\"a\"}'", unset, unset);
    });

    EXPECT_EQ(Print(document), declaration + R"(<A x="&lt;&amp;&gt;'" y='{"a"}&apos;'/>)");
}

TEST(WriterNode, LeavesOutWhatTheVersionDoesNotHave)
{
    rapidxml::xml_document<char> document;
    VWriterNode root(document, {2, 0});

    root.AddChildElement("A", [](VWriterNode& node) {
        EXPECT_FALSE(node.WriteAttribute("late", "", {3, 0}, unset));
        EXPECT_FALSE(node.WriteAttribute("early", "", unset, {1, 0}));
        EXPECT_TRUE(node.WriteAttribute("now", "", {2, 0}, {2, 0}));
    });
    std::vector<std::string> errors;
    root.GetErrors(errors);

    EXPECT_EQ(Print(document), declaration + R"(<A now=""/>)");
    EXPECT_TRUE(errors.empty());
}

TEST(WriterNode, AnUnsetVersionLeavesOutNothing)
{
    rapidxml::xml_document<char> document;
    VWriterNode root(document, unset);

    root.AddChildElement("A", [](VWriterNode& node) {
        EXPECT_TRUE(node.WriteAttribute("a", "", {3, 0}, {1, 0}));
    });
}

TEST(WriterNode, SharesItsErrors)
{
    rapidxml::xml_document<char> document;
    VWriterNode root(document, {2, 0});
    root.AddError("one");

    root.AddChildElement("A", [](VWriterNode& node) { node.AddError("two"); });
    std::vector<std::string> errors{"kept"};
    root.GetErrors(errors);

    EXPECT_THAT(errors, ElementsAre("kept", "one", "two"));
}

TEST(WriterNode, AnEmptyCallbackThrows)
{
    rapidxml::xml_document<char> document;
    VWriterNode root(document, {2, 0});

    EXPECT_THROW(root.AddChildElement("A", VWriterNode::ChildCallback()), boost::bad_function_call);
}

} // namespace
