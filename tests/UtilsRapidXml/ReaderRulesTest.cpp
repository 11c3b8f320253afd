#include "UtilsRapidXml/ReaderNode.h"

#include "UtilsRapidXml/Loading.h"

#include <gmock/gmock.h>

using namespace Loading;
using testing::ElementsAre;
using testing::IsEmpty;

// Where several checks meet: which comes first, and what one leaves for the next.

namespace {

TEST(ReaderRules, AChildAboveItsMaximumMovesTheSequenceOn)
{
    const VFound found = Load(
        "<R><A/><B/><A/></R>",
        [](INode& node) {
            Declare(node, "A", 0, 1);
            Declare(node, "B");
            EXPECT_THAT(Visit(node), ElementsAre("A"));
        },
        true);

    EXPECT_THAT(found.Errors,
                ElementsAre("/R element must have a maximum of 1 A child elements",
                            "/R/B element did not appear in correct element sequence"));
}

TEST(ReaderRules, AChildOutsideItsVersionsDoesNotMoveTheSequenceOn)
{
    const VFound found = Load(
        "<R><B/><A/></R>",
        [](INode& node) {
            node.SetVersion(v2);
            Declare(node, "A", 0, 0, v3, unset);
            Declare(node, "B");
            EXPECT_THAT(Visit(node), ElementsAre("B"));
        },
        true);

    EXPECT_THAT(found.Errors, IsEmpty());
    EXPECT_THAT(found.Warnings,
                ElementsAre("Ignoring /R/A element. Not supported in files with version 2.0"));
}

TEST(ReaderRules, VersionsAreCheckedBeforeTheSequence)
{
    const VFound found = Load(
        "<R><B/><A/></R>",
        [](INode& node) {
            node.SetVersion(v2);
            Declare(node, "A");
            Declare(node, "B", 0, 0, unset, v1);
            EXPECT_THAT(Visit(node), ElementsAre("A"));
        },
        true);

    EXPECT_THAT(found.Errors, IsEmpty());
    EXPECT_THAT(found.Warnings,
                ElementsAre("Ignoring /R/B element. Not supported in files with version 2.0"));
}

TEST(ReaderRules, TheSequenceIsCheckedBeforeNumbersAndChoices)
{
    const Loader counting = [](INode& node) {
        Declare(node, "A");
        Declare(node, "B", 1, 1);
        EXPECT_THAT(Visit(node), ElementsAre("A", "B"));
    };
    const Loader choosing = [](INode& node) {
        Declare(node, "A");
        Declare(node, "B");
        EXPECT_THAT(Visit(node, true), ElementsAre("A"));
    };

    EXPECT_THAT(Load("<R><B/><A/><B/></R>", counting, true).Errors,
                ElementsAre("/R/B element did not appear in correct element sequence"));
    EXPECT_THAT(Load("<R><B/><A/></R>", choosing, true).Errors,
                ElementsAre("/R/B element did not appear in correct element sequence"));
}

TEST(ReaderRules, AChoiceOfWhatItsVersionLacksIsAChoiceOfNothing)
{
    const VFound found = Load("<R><A/></R>", [](INode& node) {
        node.SetVersion(v2);
        Declare(node, "A", 0, 0, v3, unset);
        EXPECT_THAT(Visit(node, true), IsEmpty());
    });

    EXPECT_THAT(found.Errors,
                ElementsAre("/R element must have a one of the following child elements: A"));
}

TEST(ReaderRules, IdentifiersAreThoseOfTheWholeFile)
{
    const VFound found = Load(R"(<R><A id="x"/><A id="x"/><B ref="x"/></R>)", [](INode& node) {
        Declare(node, "A");
        Declare(node, "B");
        node.ProcessChildren(
            [](INode& child) {
                std::string value;
                child.ReadAttribute("id", value, "xsd:ID", false, unset, unset);
                child.ReadAttribute("ref", value, "xsd:IDREF", false, unset, unset);
            },
            false);
    });

    EXPECT_THAT(found.Errors, IsEmpty());
    EXPECT_THAT(found.Warnings, ElementsAre("File contains duplicate ID : x "));
}

TEST(ReaderRules, NamesOfAnEarlierPassStayKnown)
{
    const VFound found = Load("<R><A/><B/></R>", [](INode& node) {
        Declare(node, "A");
        Visit(node);
        Declare(node, "B");
        Visit(node);
    });

    EXPECT_THAT(found.Warnings, IsEmpty());
}

TEST(ReaderRules, AnAttributeIsNoKnownElementNorTheOtherWayRound)
{
    const VFound found = Load(R"(<R a="1" B="1"><a/><B/></R>)", [](INode& node) {
        std::string value;
        EXPECT_TRUE(Read(node, "a", value));
        Declare(node, "B");
        Visit(node);
    });

    EXPECT_THAT(found.Warnings, ElementsAre("Ignoring unrecognised element type: /R/a",
                                            "Ignoring unrecognised attribute: /R/B"));
}

TEST(ReaderRules, TwoOfOneNameVisitTheirChildrenTwiceWhichIsKept)
{
    const VFound found = Load("<R><A/><B/></R>", [](INode& node) {
        Declare(node, "A", 1, 1);
        Declare(node, "B");
        Declare(node, "A", 2);
        EXPECT_THAT(Visit(node), ElementsAre("A", "A", "B"));
    });

    EXPECT_THAT(found.Errors, ElementsAre("/R element must have a minimum of 2 A child elements"));
}

} // namespace
