#include "UtilsFileSystem/ReplaceFile.h"
#include "support/ChildProcess.h"
#include "support/TemporaryFolder.h"
#include "support/TracedProcess.h"

#include <gmock/gmock.h>

#include <filesystem>
#include <functional>
#include <sys/stat.h>

using TestSupport::ContentOf;
using TestSupport::VTemporaryFolder;
using TestSupport::WriteFile;
using UtilsFileSystem::ReplaceFile;

namespace {

// Greater than a stream's buffer, so that it is written in its own system call.
const std::string oldContent(100000, 'o');
const std::string newContent(120000, 'n');

TEST(ReplaceFileCrash, LeavesTheOldOrTheNewFileWhole)
{
    const VTemporaryFolder folder;
    const std::string path = folder.Path("file");
    std::size_t oldFound = 0;
    std::size_t newFound = 0;

    const std::size_t kills = TestSupport::KillAtEachStep(
        [&] { WriteFile(path, oldContent); }, [&] { ReplaceFile(path, newContent); },
        [&] {
            const std::string found = ContentOf(path);
            oldFound += found == oldContent ? 1 : 0;
            newFound += found == newContent ? 1 : 0;
            EXPECT_TRUE(found == oldContent || found == newContent) << found.size();
        });

    EXPECT_GT(kills, 10U);
    EXPECT_EQ(oldFound + newFound, kills);
    EXPECT_GT(oldFound, 0U);
    EXPECT_GT(newFound, 0U);
}

TEST(ReplaceFileCrash, LeavesNoFileOrTheNewOneWhereThereWasNone)
{
    const VTemporaryFolder folder;
    const std::string path = folder.Path("file");

    const std::size_t kills = TestSupport::KillAtEachStep(
        [&] { std::filesystem::remove(path); }, [&] { ReplaceFile(path, newContent); },
        [&] {
            const std::string found = ContentOf(path);
            EXPECT_TRUE(found == "(no file)" || found == newContent) << found.size();
        });

    EXPECT_GT(kills, 10U);
}

TEST(ReplaceFileCrash, DoesNotHinderTheNextOne)
{
    const VTemporaryFolder folder;
    const std::string path = folder.Path("file");

    TestSupport::KillAtEachStep([&] { WriteFile(path, oldContent); },
                                [&] { ReplaceFile(path, newContent); },
                                [&] {
                                    EXPECT_TRUE(ReplaceFile(path, "next"));
                                    EXPECT_EQ(ContentOf(path), "next");
                                });
}

#ifdef __x86_64__
/// Runs the work to its end. @return its writes, waits for the disk and moves of files, in order
std::string CallsOf(const std::function<void()>& work)
{
    TestSupport::VTracedProcess process(work);
    std::string calls;
    while (process.Step()) {
        if (process.IsBeforeWrite()) {
            calls += "write ";
        } else if (process.IsBefore() && process.Call() == SYS_fsync) {
            calls += "wait ";
        } else if (process.IsBefore() && process.Call() == SYS_rename) {
            calls += "move ";
        }
    }
    return process.HasSucceeded() ? calls : calls + "and failed";
}

TEST(ReplaceFileCrash, WaitsForTheDiskBeforeTheFileTakesItsPlaceAndAfterwards)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), oldContent);

    EXPECT_EQ(CallsOf([&] { ReplaceFile(folder.Path("file"), newContent); }),
              "write wait move wait ");
}

TEST(ReplaceFileCrash, WaitsForTheDiskWhereItReplacesInPlace)
{
    if (TestSupport::RunWithoutPrivileges([] { return 0; }) != 0) {
        GTEST_SKIP() << "the kernel forbids namespaces here";
    }
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), oldContent);
    chmod(folder.Path().c_str(), 0555);

    const std::string calls = CallsOf([&] {
        if (!TestSupport::GiveUpPrivileges() || !ReplaceFile(folder.Path("file"), newContent)) {
            _exit(1);
        }
    });

    chmod(folder.Path().c_str(), 0755);
    EXPECT_THAT(calls, testing::EndsWith("write wait ")); // what comes before is the namespace's
    EXPECT_EQ(ContentOf(folder.Path("file")), newContent);
}
#endif

} // namespace
