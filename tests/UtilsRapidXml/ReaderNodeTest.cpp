#include "UtilsRapidXml/ReaderNode.h"

#include "UtilsRapidXml/Loading.h"
#include "UtilsRapidXml/ParseXml.h"
#include "support/VirtualSlot.h"

#include <gmock/gmock.h>

#include <locale>

using namespace Loading;
using namespace UtilsRapidXml;
using testing::ElementsAre;
using testing::IsEmpty;
using TestSupport::SlotOf;

namespace {

TEST(ReaderNode, SlotsAreInOrder)
{
    EXPECT_EQ(0U, SlotOf(&INode::GetName));
    EXPECT_EQ(1U, SlotOf(&INode::SetVersion));
    EXPECT_EQ(2U, SlotOf(&INode::GetVersion));
    EXPECT_EQ(3U, SlotOf(&INode::WriterHook));
    EXPECT_EQ(4U, SlotOf(&INode::AddChildElement));
    EXPECT_EQ(5U, SlotOf(&INode::ProcessChildren));
    EXPECT_EQ(6U, SlotOf(&INode::ReadAttribute));
    EXPECT_EQ(7U, SlotOf(&INode::AddError));
    EXPECT_EQ(8U, SlotOf(&INode::AddWarning));
    EXPECT_EQ(9U, SlotOf(&INode::GetErrorCount));
}

TEST(ReaderNode, DeliversAttributesByExactName)
{
    const VFound found = Load(R"(<R A="1" a="2" e="" q='"' x="&lt;&#65;"/>)", [](INode& node) {
        std::string value = "untouched";
        EXPECT_FALSE(Read(node, "b", value));
        EXPECT_EQ(value, "untouched");
        EXPECT_TRUE(Read(node, "a", value));
        EXPECT_EQ(value, "2");
        EXPECT_TRUE(Read(node, "A", value));
        EXPECT_EQ(value, "1");
        EXPECT_TRUE(Read(node, "e", value));
        EXPECT_EQ(value, "");
        EXPECT_TRUE(Read(node, "q", value));
        EXPECT_EQ(value, "\"");
        EXPECT_TRUE(Read(node, "x", value));
        EXPECT_EQ(value, "<A");
    });

    EXPECT_THAT(found.Errors, IsEmpty());
    EXPECT_THAT(found.Warnings, IsEmpty());
}

TEST(ReaderNode, DeliversAValueThatHoldsAZeroWhole)
{
    Load(R"(<R a="x&#0;y"/>)", [](INode& node) {
        std::string value;
        EXPECT_TRUE(Read(node, "a", value));
        EXPECT_EQ(value, std::string("x\0y", 3));
    });
}

TEST(ReaderNode, DeliversTheFirstOfTwoAttributesOfOneName)
{
    Load(R"(<R a="1" a="2"/>)", [](INode& node) {
        std::string value;
        EXPECT_TRUE(Read(node, "a", value));
        EXPECT_EQ(value, "1");
    });
}

TEST(ReaderNode, AMissingRequiredAttributeIsAnError)
{
    const VFound found = Load("<R/>", [](INode& node) {
        std::string value;
        EXPECT_FALSE(Read(node, "a", value, true));
        EXPECT_FALSE(Read(node, "b", value, false));
        EXPECT_EQ(node.GetErrorCount(), 1U);
    });

    EXPECT_THAT(found.Errors, ElementsAre("R element missing required attribute a"));
    EXPECT_THAT(found.Warnings, IsEmpty());
}

TEST(ReaderNode, AnAttributeOutsideItsVersionsIsKnownButNeverDelivered)
{
    const VFound found = Load(R"(<R early="1" late="2"/>)", [](INode& node) {
        node.SetVersion(v2);
        std::string value = "untouched";
        EXPECT_FALSE(Read(node, "early", value, true, unset, v1));
        EXPECT_FALSE(Read(node, "late", value, true, v3, unset));
        EXPECT_EQ(value, "untouched");
    });

    EXPECT_THAT(found.Errors, IsEmpty());
    EXPECT_THAT(found.Warnings,
                ElementsAre("Ignoring early attribute in R element. Not supported in files with "
                            "version 2.0",
                            "Ignoring late attribute in R element. Not supported in files with "
                            "version 2.0"));
}

TEST(ReaderNode, AnAbsentAttributeOutsideItsVersionsIsNoMatter)
{
    const VFound found = Load("<R/>", [](INode& node) {
        node.SetVersion(v2);
        std::string value;
        EXPECT_FALSE(Read(node, "a", value, true, v3, unset));
    });

    EXPECT_THAT(found.Errors, IsEmpty());
    EXPECT_THAT(found.Warnings, IsEmpty());
}

TEST(ReaderNode, AnUnsetVersionPassesEveryGate)
{
    const VFound found = Load(R"(<R a="1"><C/></R>)", [](INode& node) {
        std::string value;
        EXPECT_FALSE(node.GetVersion().IsSet());
        EXPECT_TRUE(Read(node, "a", value, true, v3, v1));
        Declare(node, "C", 1, 1, v3, v1);
        EXPECT_THAT(Visit(node), ElementsAre("C"));
    });

    EXPECT_THAT(found.Errors, IsEmpty());
    EXPECT_THAT(found.Warnings, IsEmpty());
}

TEST(ReaderNode, TheVersionIsTheWholeFiles)
{
    Load("<R><C/></R>", [](INode& node) {
        Declare(node, "C");
        node.ProcessChildren([](INode& child) { child.SetVersion(v2); }, false);
        EXPECT_EQ(node.GetVersion(), v2);
    });
}

TEST(ReaderNode, ADuplicateIdentifierIsWarnedOfWithABlank)
{
    const VFound found = Load(R"(<R a="x" b="x" c="x"/>)", [](INode& node) {
        std::string value;
        EXPECT_TRUE(node.ReadAttribute("a", value, "xsd:ID", true, unset, unset));
        EXPECT_TRUE(node.ReadAttribute("b", value, "xsd:ID", true, unset, unset));
        EXPECT_TRUE(node.ReadAttribute("c", value, "xsd::ID", true, unset, unset));
        EXPECT_EQ(value, "x");
    });

    EXPECT_THAT(found.Errors, IsEmpty());
    EXPECT_THAT(found.Warnings, ElementsAre("File contains duplicate ID : x "));
}

TEST(ReaderNode, AReferenceBeforeItsIdentifierIsUnknown)
{
    const VFound found = Load(R"(<R a="x" b="x" c="x" d="y"/>)", [](INode& node) {
        std::string value;
        EXPECT_TRUE(node.ReadAttribute("a", value, "xsd:IDREF", true, unset, unset));
        EXPECT_TRUE(node.ReadAttribute("b", value, "xsd:ID", true, unset, unset));
        EXPECT_TRUE(node.ReadAttribute("c", value, "xsd:IDREF", true, unset, unset));
        EXPECT_TRUE(node.ReadAttribute("d", value, "xsd:IDREFS", true, unset, unset));
    });

    EXPECT_THAT(found.Errors, IsEmpty());
    EXPECT_THAT(found.Warnings, ElementsAre("File contains unknown IDREF : x "));
}

TEST(ReaderNode, VisitsChildrenInTheOrderOfTheDocument)
{
    const VFound found = Load("<R>text<B/><A/><!-- --><A/><B/></R>", [](INode& node) {
        Declare(node, "A");
        Declare(node, "B");
        EXPECT_THAT(Visit(node), ElementsAre("B", "A", "A", "B"));
    });

    EXPECT_THAT(found.Errors, IsEmpty());
    EXPECT_THAT(found.Warnings, IsEmpty());
}

TEST(ReaderNode, WithoutARuleNothingIsProcessed)
{
    const VFound found = Load("<R><A/></R>", [](INode& node) {
        EXPECT_THAT(Visit(node), IsEmpty());
        EXPECT_THAT(Visit(node, true), IsEmpty());
        EXPECT_NO_THROW(node.ProcessChildren(INode::ChildCallback(), false));
    });

    EXPECT_THAT(found.Errors, IsEmpty());
    EXPECT_THAT(found.Warnings, ElementsAre("Ignoring unrecognised element type: /R/A"));
}

TEST(ReaderNode, RulesAreOfOnePass)
{
    Load("<R><A/><B/></R>", [](INode& node) {
        Declare(node, "A");
        EXPECT_THAT(Visit(node), ElementsAre("A"));
        EXPECT_THAT(Visit(node), IsEmpty());
        Declare(node, "B");
        EXPECT_THAT(Visit(node), ElementsAre("B"));
    });
}

TEST(ReaderNode, AnEmptyCallbackThrowsOnceThereIsAChild)
{
    Load("<R><A/></R>", [](INode& node) {
        Declare(node, "B");
        EXPECT_NO_THROW(node.ProcessChildren(INode::ChildCallback(), false));
        Declare(node, "A");
        try {
            node.ProcessChildren(INode::ChildCallback(), false);
            ADD_FAILURE() << "nothing was thrown";
        } catch (const boost::bad_function_call& exception) {
            EXPECT_STREQ(exception.what(), "call to empty boost::function");
        }
    });
}

TEST(ReaderNode, TooManyChildrenAreAnErrorAndNotVisited)
{
    const VFound found = Load("<R><A/><A/><A/><A/></R>", [](INode& node) {
        Declare(node, "A", 0, 2);
        EXPECT_THAT(Visit(node), ElementsAre("A", "A"));
    });

    EXPECT_THAT(found.Errors, ElementsAre("/R element must have a maximum of 2 A child elements",
                                          "/R element must have a maximum of 2 A child elements"));
}

TEST(ReaderNode, AMaximumBelowOneIsNoLimit)
{
    for (const int maximum : {0, -1}) {
        const VFound found = Load("<R><A/><A/></R>", [&](INode& node) {
            Declare(node, "A", 0, maximum);
            EXPECT_EQ(Visit(node).size(), 2U);
        });
        EXPECT_THAT(found.Errors, IsEmpty());
    }
}

TEST(ReaderNode, TooFewChildrenAreAnErrorAndVisited)
{
    const VFound found = Load("<R><A/></R>", [](INode& node) {
        Declare(node, "A", 2, 5);
        Declare(node, "B", 1);
        EXPECT_THAT(Visit(node), ElementsAre("A"));
    });

    EXPECT_THAT(found.Errors, ElementsAre("/R element must have a minimum of 2 A child elements",
                                          "/R element must have a minimum of 1 B child elements"));
}

TEST(ReaderNode, NumbersFollowNoLocale)
{
    struct VGrouping : std::numpunct<char>
    {
        char do_thousands_sep() const override { return '.'; }
        std::string do_grouping() const override { return "\3"; }
    };
    const std::locale before =
        std::locale::global(std::locale(std::locale::classic(), new VGrouping));

    const VFound found = Load("<R/>", [](INode& node) {
        Declare(node, "A", 1234567);
        Visit(node);
        std::string value;
        node.SetVersion({1000, 2000});
    });

    std::locale::global(before);
    EXPECT_THAT(found.Errors,
                ElementsAre("/R element must have a minimum of 1234567 A child elements"));
}

TEST(ReaderNode, AChildOutsideItsVersionsIsIgnoredAndNotCounted)
{
    const VFound found = Load("<R><A/><B/><A/></R>", [](INode& node) {
        node.SetVersion(v2);
        Declare(node, "A", 1, 1, v3, unset);
        Declare(node, "B", 0, 0, v1, v2);
        EXPECT_THAT(Visit(node), ElementsAre("B"));
    });

    EXPECT_THAT(found.Warnings,
                ElementsAre("Ignoring /R/A element. Not supported in files with version 2.0",
                            "Ignoring /R/A element. Not supported in files with version 2.0"));
    EXPECT_THAT(found.Errors, ElementsAre("/R element must have a minimum of 1 A child elements"));
}

TEST(ReaderNode, AStrictSequenceRefusesWhatComesTooEarly)
{
    const VFound found = Load(
        "<R><B/><A/></R>",
        [](INode& node) {
            Declare(node, "A");
            Declare(node, "B");
            EXPECT_THAT(Visit(node), ElementsAre("A"));
        },
        true);

    EXPECT_THAT(found.Errors,
                ElementsAre("/R/B element did not appear in correct element sequence"));
}

TEST(ReaderNode, AStrictSequencePassesWhatIsInOrder)
{
    const VFound found = Load(
        "<R><A/><A/><B/></R>",
        [](INode& node) {
            Declare(node, "A");
            Declare(node, "B");
            EXPECT_THAT(Visit(node), ElementsAre("A", "A", "B"));
        },
        true);

    EXPECT_THAT(found.Errors, IsEmpty());
}

TEST(ReaderNode, TheSequenceGoesOnFromPassToPass)
{
    const VFound found = Load(
        "<R><B/><A/></R>",
        [](INode& node) {
            Declare(node, "A");
            EXPECT_THAT(Visit(node), ElementsAre("A"));
            Declare(node, "B");
            EXPECT_THAT(Visit(node), IsEmpty());
        },
        true);

    EXPECT_THAT(found.Errors,
                ElementsAre("/R/B element did not appear in correct element sequence"));
}

TEST(ReaderNode, AChoiceOfOneKindIsVisitedWhole)
{
    const VFound found = Load("<R><B/><B/></R>", [](INode& node) {
        Declare(node, "A", 1, 1);
        Declare(node, "B", 1, 1);
        EXPECT_THAT(Visit(node, true), ElementsAre("B", "B"));
    });

    EXPECT_THAT(found.Errors, IsEmpty());
}

TEST(ReaderNode, AChoiceRefusesASecondKind)
{
    const VFound found = Load("<R><B/><A/><B/></R>", [](INode& node) {
        Declare(node, "A");
        Declare(node, "B");
        EXPECT_THAT(Visit(node, true), ElementsAre("A"));
    });

    EXPECT_THAT(found.Errors, ElementsAre("/R element cannot have both a A and a B child element",
                                          "/R element cannot have both a A and a B child element"));
}

TEST(ReaderNode, AChoiceOfNothingNamesEveryKind)
{
    const VFound found = Load("<R/>", [](INode& node) {
        Declare(node, "A");
        Declare(node, "B");
        EXPECT_THAT(Visit(node, true), IsEmpty());
    });

    EXPECT_THAT(found.Errors,
                ElementsAre("/R element must have a one of the following child elements: A B"));
}

TEST(ReaderNode, WarnsOnceOfEachUnknownName)
{
    const VFound found = Load(R"(<R x="1" k="1" y="1"><U/><A/>text<V/><U/></R>)", [](INode& node) {
        std::string value;
        EXPECT_TRUE(Read(node, "k", value));
        Declare(node, "A");
        Visit(node);
    });

    EXPECT_THAT(found.Errors, IsEmpty());
    EXPECT_THAT(found.Warnings, ElementsAre("Ignoring unrecognised element type: /R/U",
                                            "Ignoring unrecognised element type: /R/V",
                                            "Ignoring unrecognised attribute: /R/x",
                                            "Ignoring unrecognised attribute: /R/y"));
}

TEST(ReaderNode, ReportsAChildBeforeItVisitsTheNext)
{
    const VFound found = Load(R"(<R><A u="1"/><A v="1"/></R>)", [](INode& node) {
        Declare(node, "A");
        node.ProcessChildren([](INode& child) { child.AddWarning("visited " + child.GetName()); },
                             false);
    });

    EXPECT_THAT(found.Warnings,
                ElementsAre("visited A", "Ignoring unrecognised attribute: /R/A/u", "visited A",
                            "Ignoring unrecognised attribute: /R/A/v"));
}

TEST(ReaderNode, KeepsALoadersOwnMessagesInOrder)
{
    const VFound found = Load("<R/>", [](INode& node) {
        node.AddError("one");
        node.AddWarning("two");
        node.AddError("three");
        node.WriterHook();
        EXPECT_EQ(node.GetErrorCount(), 2U);
    });

    EXPECT_THAT(found.Errors, ElementsAre("one", "three"));
    EXPECT_THAT(found.Warnings, ElementsAre("two"));
}

TEST(ReaderNode, ARootElementHasItsNameForPath)
{
    std::string text = "<R/>";
    rapidxml::xml_document<char> document;
    ASSERT_TRUE(ParseXml<0>(document, text.data()));
    VReaderNode root(*document.first_node(), false);
    VReaderNode whole(document, false);
    Texts errors{"kept"};

    Declare(root, "A", 1);
    Visit(root);
    root.GetErrors(errors);

    EXPECT_THAT(errors,
                ElementsAre("kept", "/R element must have a minimum of 1 A child elements"));
    EXPECT_EQ(root.GetName(), "R");
    EXPECT_EQ(whole.GetName(), "");
}

TEST(ReaderNode, AMessageBeyondTheRoomIsCountedOnly)
{
    const std::string great(VMessageList::GreatestSize, 'x');

    const VFound found = Load("<R/>", [&](INode& node) {
        node.AddError("first");
        node.AddError(great);
        node.AddError("lost");
        std::string value;
        Read(node, "lost", value, true);
        EXPECT_EQ(node.GetErrorCount(), 4U);
    });

    EXPECT_THAT(found.Errors, ElementsAre("first", great, "And 2 more messages of this kind"));
}

TEST(ReaderNode, MessagesWithoutTextTakeRoomToo)
{
    constexpr std::size_t most = VMessageList::GreatestSize / sizeof(std::string);
    VMessageList messages;
    for (std::size_t each = 0; each < most + 2; ++each) {
        messages.Add("");
    }
    Texts kept;
    messages.AppendTo(kept);

    EXPECT_EQ(messages.Count(), most + 2);
    EXPECT_EQ(kept.size(), most + 1);
    EXPECT_EQ(kept.back(), "And 2 more messages of this kind");
}

} // namespace
