#include "DebugServices/Log.h"

#include "support/LogCapture.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <atomic>
#include <sstream>
#include <thread>
#include <vector>

using testing::ElementsAre;
using testing::MatchesRegex;

namespace {

/// Returns what the log of the process writes to standard error for one message.
std::string Written(const std::string& text, const std::string& category, int level)
{
    KVR::ILogCategory* const where = KVR::GlobalLog().GetCategory(category);
    testing::internal::CaptureStderr();
    KVR::GlobalLog().Log(text, where, level, "src/File.cpp", 12);
    return testing::internal::GetCapturedStderr();
}

/// Forwards what a replacement must and counts the rest.
class VCountingLog : public KVR::ILogCategorised
{
public:
    KVR::ILogCategory* GetCategory(const std::string& name) override
    {
        return Replaced->GetCategory(name);
    }
    void Log(const std::string&, const KVR::ILogCategory*, int, const char*, int) override
    {
        ++Count;
    }

    KVR::ILogCategorised* Replaced = nullptr;
    std::atomic<int> Count{0};
};

/// Makes a log that is never destroyed, as every log wants it, and that no leak check misses.
VCountingLog& MakeLog()
{
    static std::vector<VCountingLog*>& logs = *new std::vector<VCountingLog*>;
    logs.push_back(new VCountingLog);
    return *logs.back();
}

/// Puts a counting log in place for its own lifetime.
class VScopedReplacement
{
public:
    VScopedReplacement() : Log(MakeLog())
    {
        // Known before it can be asked.
        Log.Replaced = &KVR::GlobalLog();
        Returned = DebugServices::SetGlobalLog(&Log);
    }
    ~VScopedReplacement() { DebugServices::SetGlobalLog(Returned); }

    VCountingLog& Log;
    KVR::ILogCategorised* Returned = nullptr;
};

} // namespace

TEST(Log, GivesTheSameCategoryForTheSameName)
{
    KVR::ILogCategory* const first = KVR::GlobalLog().GetCategory("LogTest.Same");
    KVR::ILogCategory* const second = KVR::GlobalLog().GetCategory("LogTest.Same");
    KVR::ILogCategory* const other = KVR::GlobalLog().GetCategory("LogTest.same");

    EXPECT_NE(nullptr, first);
    EXPECT_EQ(first, second);
    EXPECT_NE(first, other);
}

TEST(Log, TakesFreeTextAsNameOfACategory)
{
    for (const std::string name :
         {"Config", "Preferences", "DataStore", "CommandProviderCameraSettings", "UtilsFileSystem",
          "Qt Korva", "", "a \xC3\xA9 %1% {}"}) {
        EXPECT_EQ(name, KVR::GlobalLog().GetCategory(name)->GetName());
    }
}

TEST(Log, StartsACategoryAtLevelFour)
{
    EXPECT_EQ(4, KVR::GlobalLog().GetCategory("LogTest.Fresh")->GetLevel());
}

TEST(Log, AppliesALevelThatWasSetBeforeTheCategoryWasFetched)
{
    DebugServices::SetLogLevel("LogTest.Early", 6);

    EXPECT_EQ(6, KVR::GlobalLog().GetCategory("LogTest.Early")->GetLevel());
}

TEST(Log, ChangesTheLevelOfOneCategoryAtOnce)
{
    KVR::ILogCategory* const changed = KVR::GlobalLog().GetCategory("LogTest.Changed");
    KVR::ILogCategory* const other = KVR::GlobalLog().GetCategory("LogTest.Unchanged");

    DebugServices::SetLogLevel("LogTest.Changed", 2);

    EXPECT_EQ(2, changed->GetLevel());
    EXPECT_EQ(4, other->GetLevel());
}

TEST(Log, WritesTimeLevelCategoryAndTextAsOneLine)
{
    EXPECT_THAT(Written("Took 5ms", "Qt Korva", 3),
                MatchesRegex("[0-9]{4}-[0-9]{2}-[0-9]{2} [0-9]{2}:[0-9]{2}:[0-9]{2}\\.[0-9]{3} "
                             "warning \\[Qt Korva\\] Took 5ms\n"));
}

TEST(Log, NamesTheLevels)
{
    EXPECT_THAT(Written("x", "Config", 1), MatchesRegex(".* critical \\[Config\\] x\n"));
    EXPECT_THAT(Written("x", "Config", 2), MatchesRegex(".* error \\[Config\\] x\n"));
    EXPECT_THAT(Written("x", "Config", 3), MatchesRegex(".* warning \\[Config\\] x\n"));
    EXPECT_THAT(Written("x", "Config", 4), MatchesRegex(".* info \\[Config\\] x\n"));
    EXPECT_THAT(Written("x", "Config", 5), MatchesRegex(".* debug \\[Config\\] x\n"));
    EXPECT_THAT(Written("x", "Config", 6), MatchesRegex(".* trace \\[Config\\] x\n"));
}

TEST(Log, WritesAMessageWithoutAskingTheLevel)
{
    const TestSupport::VLogLevel level("LogTest.Silent", 2);

    EXPECT_THAT(Written("traced", "LogTest.Silent", 6), testing::HasSubstr("traced"));
}

TEST(Log, WritesAMessageWithoutCategoryOrFile)
{
    testing::internal::CaptureStderr();
    KVR::GlobalLog().Log("x", nullptr, 2, nullptr, 0);

    EXPECT_THAT(testing::internal::GetCapturedStderr(), MatchesRegex(".* error \\[\\] x\n"));
}

TEST(Log, DoesNotReadPlaceholdersInAText)
{
    EXPECT_THAT(Written("%1% %s {} %v", "Config", 2), testing::EndsWith("] %1% %s {} %v\n"));
}

TEST(Log, WritesControlCharactersOut)
{
    // A device's text must neither begin a line of the log nor command the terminal.
    EXPECT_THAT(Written("a\r\nb\x1B[2J\x7F\tc\xC3\xA9", "Config", 2),
                testing::EndsWith("] a\\x0D\\nb\\x1B[2J\\x7F\tc\xC3\xA9\n"));
    EXPECT_THAT(Written(std::string("a\0b", 3), "Config", 2), testing::EndsWith("] a\\x00b\n"));
    EXPECT_THAT(Written("x", "Two\nlines", 2), testing::EndsWith("[Two\\nlines] x\n"));
}

TEST(Log, WritesControlCharactersBeyondAsciiOut)
{
    EXPECT_THAT(Written("a\xC2\x9B"
                        "2Jb\xC2\x80\xC2\x9F",
                        "Config", 2),
                testing::EndsWith("] a\\xC2\\x9B2Jb\\xC2\\x80\\xC2\\x9F\n"));
    EXPECT_THAT(Written("\xC2\xA0\xC3\x9B\xE2\x80\x9B\xC2", "Config", 2),
                testing::EndsWith("] \xC2\xA0\xC3\x9B\xE2\x80\x9B\xC2\n"));
}

TEST(Log, IsReplacedAndBroughtBack)
{
    KVR::ILogCategorised& before = KVR::GlobalLog();
    VCountingLog& log = MakeLog();

    EXPECT_EQ(&before, DebugServices::SetGlobalLog(&log));
    EXPECT_EQ(&log, &KVR::GlobalLog());
    KVR::GlobalLog().Log("x", nullptr, 2, "", 0);
    EXPECT_EQ(1, log.Count);

    EXPECT_EQ(&log, DebugServices::SetGlobalLog(nullptr));
    EXPECT_THAT(Written("back", "Config", 2), testing::HasSubstr("back"));
    EXPECT_EQ(1, log.Count);
    DebugServices::SetGlobalLog(&before);
}

TEST(Log, KeepsCategoriesAndLevelsWhenItIsReplaced)
{
    KVR::ILogCategory* const before = KVR::GlobalLog().GetCategory("LogTest.Kept");
    const VScopedReplacement replacement;

    DebugServices::SetLogLevel("LogTest.Kept", 6);

    EXPECT_EQ(before, KVR::GlobalLog().GetCategory("LogTest.Kept"));
    EXPECT_EQ(6, before->GetLevel());
}

TEST(Log, ServesManyThreadsAtOnce)
{
    constexpr int threadCount = 8;
    constexpr int linesPerThread = 50;
    std::vector<KVR::ILogCategory*> found(threadCount);
    testing::internal::CaptureStderr();

    std::vector<std::thread> threads;
    threads.reserve(threadCount);
    for (int i = 0; i < threadCount; ++i) {
        threads.emplace_back([i, &found] {
            found[i] = KVR::GlobalLog().GetCategory("LogTest.Many");
            for (int line = 0; line < linesPerThread; ++line) {
                DebugServices::SetLogLevel("LogTest.Many", 2 + line % 5);
                EXPECT_GE(found[i]->GetLevel(), 2);
                KVR::GlobalLog().Log("whole", found[i], 2, "", 0);
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }

    std::istringstream output(testing::internal::GetCapturedStderr());
    int lines = 0;
    for (std::string line; std::getline(output, line); ++lines) {
        EXPECT_THAT(line, MatchesRegex("[-0-9]+ [:.0-9]+ error \\[LogTest\\.Many\\] whole"));
    }
    EXPECT_EQ(threadCount * linesPerThread, lines);
    EXPECT_EQ(threadCount, std::count(found.begin(), found.end(), found[0]));
}

TEST(Log, IsReplacedWhileOthersLog)
{
    const VScopedReplacement outer;
    VCountingLog& inner = MakeLog();
    inner.Replaced = outer.Log.Replaced;
    constexpr int messages = 2000;

    std::thread logging([] {
        for (int i = 0; i < messages; ++i) {
            KVR::ILogCategorised& log = KVR::GlobalLog();
            log.Log("x", log.GetCategory("LogTest.Replaced"), 2, "", 0);
        }
    });
    for (int i = 0; i < messages; ++i) {
        DebugServices::SetGlobalLog(i % 2 == 0 ? &inner : &outer.Log);
    }
    logging.join();

    EXPECT_EQ(messages, inner.Count + outer.Log.Count);
}

TEST(Log, IsCapturedByTests)
{
    const TestSupport::VLogCapture capture;
    KVR::ILogCategorised& log = KVR::GlobalLog();
    log.Log("first", log.GetCategory("Config"), 2, "src/File.cpp", 12);
    {
        const TestSupport::VLogCapture inner;
        log.Log("hidden", log.GetCategory("Config"), 2, "", 0);
    }
    log.Log("other", log.GetCategory("DataStore"), 3, "", 0);

    EXPECT_THAT(capture.Texts("Config"), ElementsAre("first"));
    ASSERT_EQ(2u, capture.Messages().size());
    EXPECT_EQ("src/File.cpp", capture.Messages()[0].File);
    EXPECT_EQ(12, capture.Messages()[0].Line);
    EXPECT_EQ(3, capture.Messages()[1].Level);
}
