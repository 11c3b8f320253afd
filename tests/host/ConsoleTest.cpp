#include "Console.h"

#include "ConsoleCommands.h"
#include "ConsoleLine.h"
#include "ControlSystem.h"

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include <memory>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

using QuorixHost::VConsole;
using QuorixHost::VConsoleError;
using QuorixHost::VConsoleLine;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::StartsWith;

namespace {

/// A console with `fire`, and what was fired by it.
class ConsoleFire : public testing::Test
{
public:
    ConsoleFire()
    {
        QuorixHost::AddEventCommands(console, controlSystem);
        controlSystem->GetEventNotification().Add(
            [this](const std::wstring& name, const ControlSystem::IParameters& parameters) {
                std::vector<std::pair<std::wstring, std::wstring>> pairs(parameters.begin(),
                                                                         parameters.end());
                fired.emplace_back(name, std::move(pairs));
            });
    }

protected:
    using VFired = std::pair<std::wstring, std::vector<std::pair<std::wstring, std::wstring>>>;

    std::shared_ptr<QuorixHost::VControlSystem> controlSystem =
        std::make_shared<QuorixHost::VControlSystem>();
    VConsole console;
    std::vector<VFired> fired;
};

} // namespace

TEST(ConsoleLine, TakesWordsAndTheRest)
{
    VConsoleLine line(" \t one  two\tthe \"rest\" = as is ");

    EXPECT_EQ("one", line.TakeWord("a word"));
    EXPECT_EQ("two", line.TakeWord("a word"));
    EXPECT_EQ("the \"rest\" = as is ", line.TakeRest());
    EXPECT_NO_THROW(line.ExpectEnd());
    EXPECT_THROW(line.TakeWord("a word"), VConsoleError);
}

TEST(ConsoleLine, TellsWhetherMoreThanBlanksIsLeft)
{
    VConsoleLine line(" one \t");

    EXPECT_TRUE(line.HasMore());
    line.TakeWord("a word");
    EXPECT_FALSE(line.HasMore());
}

TEST(ConsoleLine, AQuotedWordHoldsBlanksQuotesAndBackslashes)
{
    VConsoleLine line(R"("a b" "\"\\\n" "")");

    EXPECT_EQ("a b", line.TakeWord("a word"));
    EXPECT_EQ("\"\\\\n", line.TakeWord("a word"));
    EXPECT_EQ("", line.TakeWord("a word"));
    EXPECT_NO_THROW(line.ExpectEnd());
}

TEST(ConsoleLine, AQuoteInsideAWordIsAnOrdinaryCharacter)
{
    EXPECT_EQ("5\"", VConsoleLine("5\" x").TakeWord("a word"));
    EXPECT_EQ("<>&'\"", VConsoleLine("a=<>&'\"").TakeAssignment()->second);
}

TEST(ConsoleLine, QuotesThatDoNotEndAreAnError)
{
    for (const char* const text : {"\"", "\"a", "\"a\\\"", "\"a\"b"}) {
        EXPECT_THROW(VConsoleLine(text).TakeWord("a word"), VConsoleError) << text;
    }
    EXPECT_THROW(VConsoleLine("a=\"b").TakeAssignment(), VConsoleError);
}

TEST(ConsoleLine, TakesAssignments)
{
    VConsoleLine line(R"(a=1 b= c="x y" d==e)");
    using VPair = std::pair<std::string, std::string>;

    EXPECT_EQ(VPair("a", "1"), line.TakeAssignment());
    EXPECT_EQ(VPair("b", ""), line.TakeAssignment());
    EXPECT_EQ(VPair("c", "x y"), line.TakeAssignment());
    EXPECT_EQ(VPair("d", "=e"), line.TakeAssignment());
    EXPECT_EQ(std::nullopt, line.TakeAssignment());
}

TEST(ConsoleLine, AnAssignmentWithoutNameOrEqualsSignIsAnError)
{
    for (const char* const text : {"a", "=b", "=", "a =b"}) {
        EXPECT_THROW(VConsoleLine(text).TakeAssignment(), VConsoleError) << text;
    }
}

TEST(Console, AnswersUnknownAndMalformedLinesWithAnError)
{
    VConsole console;

    EXPECT_EQ("error: expected a command", console.Answer(""));
    EXPECT_EQ("error: expected a command", console.Answer(" \t "));
    EXPECT_EQ("error: unknown command 'bogus'", console.Answer("bogus 1 2"));
    EXPECT_EQ("error: unknown command 'STATE'", console.Answer("STATE"));
    EXPECT_EQ("error: unexpected 'x'", console.Answer("state x"));
}

TEST(Console, RefusesBytesThatAreNoText)
{
    VConsole console;

    for (const char* const line : {"state \xff", "\xc3", "state \xed\xa0\x80", "\xc0\x80"}) {
        EXPECT_EQ("error: the line is not valid UTF-8", console.Answer(line)) << line;
    }
    EXPECT_EQ("error: the line holds a control character",
              console.Answer(std::string("state\0", 6)));
    EXPECT_EQ("error: the line holds a control character", console.Answer("state\x1b[2J"));
}

TEST(Console, AnswersWhatACommandReturns)
{
    VConsole console;
    console.AddCommand("nothing", [](VConsoleLine&) { return std::string(); });
    console.AddCommand("json", [](VConsoleLine& line) { return "\"" + line.TakeRest() + "\""; });

    EXPECT_EQ("ok", console.Answer("nothing"));
    EXPECT_EQ("ok \"a b\"", console.Answer("json a b"));
}

TEST(Console, AnswersWhatACommandThrowsInOneLine)
{
    VConsole console;
    console.AddCommand(
        "fail", [](VConsoleLine&) -> std::string { throw std::runtime_error("two\nlines"); });
    console.AddCommand("odd", [](VConsoleLine&) -> std::string { throw 7; });

    EXPECT_EQ("error: two lines", console.Answer("fail"));
    EXPECT_THAT(console.Answer("odd"), StartsWith("error: "));
}

TEST(Console, ALaterCommandReplacesTheEarlierOne)
{
    VConsole console;
    console.AddCommand("x", [](VConsoleLine&) { return std::string("1"); });
    console.AddCommand("x", [](VConsoleLine&) { return std::string("2"); });

    EXPECT_EQ("ok 2", console.Answer("x"));
}

TEST(Console, StateIsMadeOfItsParts)
{
    VConsole console;
    EXPECT_EQ("ok {}", console.Answer("state"));

    console.AddStatePart([](nlohmann::json& state) { state["dialog"] = nullptr; });
    console.AddStatePart([](nlohmann::json& state) { state["name"] = "a\xff"; });

    EXPECT_EQ("ok {\"dialog\":null,\"name\":\"a\xEF\xBF\xBD\"}", console.Answer("state"));
}

TEST_F(ConsoleFire, PublishesAnEventBeforeItAnswers)
{
    EXPECT_EQ("ok", console.Answer("fire Event.X b=2 a=1"));

    EXPECT_THAT(fired, ElementsAre(VFired(L"Event.X", {{L"a", L"1"}, {L"b", L"2"}})));
}

TEST_F(ConsoleFire, TakesQuotedValuesAndAnyText)
{
    EXPECT_EQ("ok", console.Answer("fire Event.X text=\"a b\" \xD0\xBC=\xF0\x9F\x98\x80 xml=<&>"));

    // The emoji is two code units.
    EXPECT_THAT(fired, ElementsAre(VFired(
                           L"Event.X",
                           {{L"text", L"a b"}, {L"xml", L"<&>"}, {L"\u043C", {0xD83D, 0xDE00}}})));
}

TEST_F(ConsoleFire, ANameGivenTwiceKeepsTheLaterValue)
{
    EXPECT_EQ("ok", console.Answer("fire Event.X a=1 a=2"));

    EXPECT_THAT(fired, ElementsAre(VFired(L"Event.X", {{L"a", L"2"}})));
}

TEST_F(ConsoleFire, PublishesNothingOfAMalformedLine)
{
    EXPECT_EQ("error: expected the event's name", console.Answer("fire"));
    EXPECT_EQ("error: the event's name is empty", console.Answer("fire \"\""));
    EXPECT_EQ("error: expected NAME=VALUE, not 'a'", console.Answer("fire Event.X b=1 a"));
    EXPECT_EQ("error: expected NAME=VALUE, not '=1'", console.Answer("fire Event.X =1"));
    EXPECT_EQ("error: a quoted text does not end", console.Answer("fire Event.X a=\"b"));

    EXPECT_THAT(fired, IsEmpty());
}

TEST_F(ConsoleFire, TellsAListenersException)
{
    controlSystem->GetEventNotification().Add(
        [](const std::wstring&, const ControlSystem::IParameters&) {
            throw std::runtime_error("not heard");
        });

    EXPECT_EQ("error: not heard", console.Answer("fire Event.X"));
}

TEST(Console, QuitAsksForTheStopAndTakesNoMoreWords)
{
    VConsole console;
    int asked = 0;
    QuorixHost::AddStopCommand(console, [&] { ++asked; });

    EXPECT_EQ("error: unexpected 'now'", console.Answer("quit now"));
    EXPECT_EQ(0, asked);
    EXPECT_EQ("ok", console.Answer(" quit "));
    EXPECT_EQ(1, asked);
}
