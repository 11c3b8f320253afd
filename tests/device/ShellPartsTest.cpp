#include "korva-control/ShellInbox.h"
#include "korva-control/ShellNames.h"
#include "korva-control/ShellWords.h"

#include "ControlStreamClient/Error.h"

#include <gmock/gmock.h>

#include <functional>

#include <poll.h>

namespace {

using ControlStream::VParameterInformation;
using testing::ElementsAre;
using testing::IsEmpty;

using Words = std::vector<std::string>;

struct VWordsCase
{
    const char* Name;
    std::string Line;
    Words Expected;
};

class ShellWords : public testing::TestWithParam<VWordsCase>
{
};

TEST_P(ShellWords, AreCutAtBlanks)
{
    EXPECT_EQ(GetParam().Expected, SplitWords(GetParam().Line));
}

// clang-format off
const VWordsCase wordsCases[] = {
    {"Nothing", "", {}},
    {"Blanks", " \t ", {}},
    {"Plain", " run  Go a=1 ", {"run", "Go", "a=1"}},
    {"Quoted", R"(a="b c"d)", {"a=b cd"}},
    {"EmptyQuotes", R"(a "")", {"a", ""}},
    {"Escaped", R"(a\ b \"c \\)", {"a b", "\"c", "\\"}},
    {"EscapedInQuotes", R"("a\"b")", {"a\"b"}},
    {"BackslashAtTheEnd", "a\\", {"a\\"}},
    {"NotAscii", "\xD0\xBC \xE4\xB8\x80", {"\xD0\xBC", "\xE4\xB8\x80"}},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, ShellWords, testing::ValuesIn(wordsCases),
                         [](const auto& named) { return std::string(named.param.Name); });

TEST(ShellWord, IsQuotedSoThatItIsReadAsItWas)
{
    for (const std::string word : {"plain", "a b", "\"", "\\", "a\tb"}) {
        EXPECT_THAT(SplitWords("x " + QuotedWord(word)), ElementsAre("x", word));
    }
}

TEST(ShellWord, NeedsItsClosingQuote)
{
    EXPECT_THROW(SplitWords("a \"b"), ControlStream::VError);
}

/// The words of candidates, with "+" behind those that a blank may follow.
Words Shown(const std::vector<VCandidate>& candidates)
{
    Words shown;
    for (const VCandidate& candidate : candidates) {
        shown.push_back(candidate.Word + (candidate.IsWhole ? "+" : ""));
    }
    return shown;
}

class ShellNames : public testing::Test
{
protected:
    ShellNames()
    {
        names.SetCommands({"Camera_Get", "Camera_Set", "Host.Echo"});
        names.SetEvents({"Event.A", "Event.B"});
    }

    std::vector<VParameterInformation> Describe(const std::string& command)
    {
        described.push_back(command);
        if (command == "Host.Echo") {
            return {{"*", ""}};
        }
        return {{"Id", ""}, {"Index", ""}, {"Value", ""}};
    }

    std::vector<std::string> described;
    VShellNames names{std::bind(&ShellNames::Describe, this, std::placeholders::_1)};
};

TEST_F(ShellNames, CompleteTheFirstWordToItsOwnAndTheHostsCommands)
{
    EXPECT_THAT(Shown(names.Complete({"Camera_"})), ElementsAre("Camera_Get+", "Camera_Set+"));
    EXPECT_THAT(Shown(names.Complete({"desc"})), ElementsAre("describe+", "describe-event+"));
    EXPECT_THAT(Shown(names.Complete({"nothing"})), IsEmpty());
    EXPECT_THAT(names.Complete({""}).size(), ShellWordList().size() + 3);
    EXPECT_THAT(names.Complete({}), IsEmpty());
}

TEST_F(ShellNames, CompleteEventsWhereEventsBelong)
{
    EXPECT_THAT(Shown(names.Complete({"describe-event", ""})), ElementsAre("Event.A+", "Event.B+"));
    EXPECT_THAT(Shown(names.Complete({"watch", "Event.A", "Event.B"})), ElementsAre("Event.B+"));
}

TEST_F(ShellNames, CompleteParametersByTheHostsDescription)
{
    EXPECT_THAT(Shown(names.Complete({"run", "Camera_Set", "I"})), ElementsAre("Id=", "Index="));
    EXPECT_THAT(Shown(names.Complete({"Camera_Set", "Id=1", ""})), ElementsAre("Index=", "Value="));
    EXPECT_THAT(Shown(names.Complete({"Camera_Set", "Id=1", "Id"})), IsEmpty());
    EXPECT_THAT(described, ElementsAre("Camera_Set")) << "the host is asked once";
    EXPECT_THAT(names.Complete({"Host.Echo", ""}), IsEmpty()) << "any name is no name";
    EXPECT_THAT(names.Complete({"Unknown", ""}), IsEmpty());
    EXPECT_THAT(names.Complete({"describe", "Camera_Get", ""}), IsEmpty());
}

TEST_F(ShellNames, ForgetWhatAnotherHostMayNotHave)
{
    names.Forget();

    EXPECT_FALSE(names.IsCommand("Camera_Get"));
    EXPECT_THAT(names.Complete({"watch", ""}), IsEmpty());
}

TEST(ShellNamesStart, IsWhatAllHaveInCommon)
{
    EXPECT_EQ("", VShellNames::CommonStart({}));
    EXPECT_EQ("ab", VShellNames::CommonStart({{"abc", true}, {"abd", true}, {"ab", true}}));
    EXPECT_EQ("", VShellNames::CommonStart({{"a", true}, {"b", true}}));
}

TEST(ShellNamesStart, EndsWithAWholeCharacter)
{
    EXPECT_EQ("a", VShellNames::CommonStart({{"a\u00E9", true}, {"a\u00E8", true}}));
    EXPECT_EQ("", VShellNames::CommonStart({{"\U0001F600", true}, {"\U0001F601", true}}));
    EXPECT_EQ("\u00E9", VShellNames::CommonStart({{"\u00E9", true}, {"\u00E9x", true}}));
}

bool IsReadable(int descriptor)
{
    pollfd readable{descriptor, POLLIN, 0};
    return poll(&readable, 1, 0) > 0;
}

TEST(ShellInbox, RunsAPartAtOnceAndKeepsTellingOfTheRest)
{
    VShellInbox inbox;
    int runs = 0;
    for (int i = 0; i < 150; ++i) {
        inbox.Post([&runs, i] { EXPECT_EQ(i, runs++); });
    }

    inbox.RunSome();
    EXPECT_EQ(100, runs);
    EXPECT_TRUE(IsReadable(inbox.Descriptor()));
    inbox.RunSome();

    EXPECT_EQ(150, runs);
    EXPECT_FALSE(IsReadable(inbox.Descriptor()));
}

TEST(ShellInbox, LeavesEventsOutFromItsLimitOnUntilAllHaveRun)
{
    VShellInbox inbox;
    std::vector<std::string> done;
    inbox.LimitEvents(101, [&](std::size_t leftOut) { done.push_back(std::to_string(leftOut)); });
    for (int i = 0; i < 103; ++i) {
        inbox.PostEvent([&] { done.emplace_back("event"); });
    }
    inbox.Post([&] { done.emplace_back("other"); });

    inbox.RunSome();
    inbox.PostEvent([&] { done.emplace_back("event"); });
    inbox.RunSome();
    inbox.PostEvent([&] { done.emplace_back("event"); });
    inbox.RunSome();

    done.erase(done.begin(), done.begin() + 100);
    EXPECT_THAT(done, ElementsAre("event", "other", "3", "event"));
}

} // namespace
