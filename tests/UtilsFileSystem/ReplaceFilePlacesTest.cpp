#include "UtilsFileSystem/ReplaceFile.h"
#include "support/ChildProcess.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <sys/stat.h>

using TestSupport::ContentOf;
using TestSupport::RunOnSmallDisk;
using TestSupport::RunWithoutPrivileges;
using TestSupport::VTemporaryFolder;
using TestSupport::WriteFile;
using UtilsFileSystem::ReplaceFile;

// Places that do not let themselves be written to. Each runs in a process of its own, and tells by
// its code what it found.

namespace {

constexpr int good = 0;
constexpr int wronglyTrue = 1;
constexpr int wronglyFalse = 2;
constexpr int contentLost = 3;
constexpr int filesLeft = 4;

#define SKIP_IF_NOT_ALLOWED(code)                                                                  \
    if ((code) == TestSupport::notAllowed) {                                                       \
        GTEST_SKIP() << "the kernel forbids namespaces here";                                      \
    }

TEST(ReplaceFilePlaces, AFullDiskLeavesTheOldFileAndNothingElse)
{
    const VTemporaryFolder folder;

    const int code = RunOnSmallDisk(folder.Path(), "size=64k", [&] {
        const std::string content(20000, 'o');
        WriteFile(folder.Path("file"), content);
        if (ReplaceFile(folder.Path("file"), std::string(100000, 'n'))) {
            return wronglyTrue;
        }
        if (ContentOf(folder.Path("file")) != content) {
            return contentLost;
        }
        return folder.Count() == 1 ? good : filesLeft;
    });

    SKIP_IF_NOT_ALLOWED(code);
    EXPECT_EQ(code, good);
}

TEST(ReplaceFilePlaces, ADiskWithoutRoomForANameLeavesTheOldFile)
{
    const VTemporaryFolder folder;

    const int code = RunOnSmallDisk(folder.Path(), "size=64k,nr_inodes=2", [&] {
        WriteFile(folder.Path("file"), "old");
        if (ReplaceFile(folder.Path("file"), "new")) {
            return wronglyTrue;
        }
        return ContentOf(folder.Path("file")) == "old" ? good : contentLost;
    });

    SKIP_IF_NOT_ALLOWED(code);
    EXPECT_EQ(code, good);
}

TEST(ReplaceFilePlaces, AFolderThatAllowsNoNewFileHasItsFileReplacedInPlace)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), "old");
    chmod(folder.Path().c_str(), 0555);

    const int code = RunWithoutPrivileges([&] {
        if (!ReplaceFile(folder.Path("file"), "new")) {
            return wronglyFalse;
        }
        return ReplaceFile(folder.Path("another"), "new") ? wronglyTrue : good;
    });

    chmod(folder.Path().c_str(), 0755);
    SKIP_IF_NOT_ALLOWED(code);
    EXPECT_EQ(code, good);
    EXPECT_EQ(ContentOf(folder.Path("file")), "new");
    EXPECT_EQ(folder.Count(), 1U);
}

TEST(ReplaceFilePlaces, AFileThatOnlyItsOwnerMayMoveIsReplacedInPlace)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), "old");
    constexpr uid_t somebodyElse = 1234;
    if (chown(folder.Path("file").c_str(), somebodyElse, somebodyElse) != 0 ||
        chown(folder.Path().c_str(), somebodyElse, somebodyElse) != 0) {
        GTEST_SKIP() << "only an administrator may give files away";
    }
    chmod(folder.Path("file").c_str(), 0666);
    chmod(folder.Path().c_str(), 01777); // as a folder for everybody's temporary files is

    const int code = RunWithoutPrivileges([&] {
        if (!ReplaceFile(folder.Path("file"), "new")) {
            return wronglyFalse;
        }
        return folder.Count() == 1 ? good : filesLeft;
    });

    SKIP_IF_NOT_ALLOWED(code);
    EXPECT_EQ(code, good);
    EXPECT_EQ(ContentOf(folder.Path("file")), "new");
}

TEST(ReplaceFilePlaces, AFileThatMayNotBeWrittenStaysInAFolderThatWouldAllowIt)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), "old");
    chmod(folder.Path("file").c_str(), 0444);

    const int code = RunWithoutPrivileges(
        [&] { return ReplaceFile(folder.Path("file"), "new") ? wronglyTrue : good; });

    SKIP_IF_NOT_ALLOWED(code);
    EXPECT_EQ(code, good);
    EXPECT_EQ(ContentOf(folder.Path("file")), "old");
    EXPECT_EQ(folder.Count(), 1U);
}

TEST(ReplaceFilePlaces, AFolderThatMayNotBeSearchedIsRefused)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), "old");
    chmod(folder.Path().c_str(), 0000);

    const int code = RunWithoutPrivileges(
        [&] { return ReplaceFile(folder.Path("file"), "new") ? wronglyTrue : good; });

    chmod(folder.Path().c_str(), 0755);
    SKIP_IF_NOT_ALLOWED(code);
    EXPECT_EQ(code, good);
    EXPECT_EQ(ContentOf(folder.Path("file")), "old");
}

TEST(ReplaceFilePlaces, AFolderThatMayNotBeListedIsNoHindrance)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), "old");
    chmod(folder.Path().c_str(), 0333);

    const int code = RunWithoutPrivileges(
        [&] { return ReplaceFile(folder.Path("file"), "new") ? good : wronglyFalse; });

    chmod(folder.Path().c_str(), 0755);
    SKIP_IF_NOT_ALLOWED(code);
    EXPECT_EQ(code, good);
    EXPECT_EQ(ContentOf(folder.Path("file")), "new");
}

TEST(ReplaceFilePlaces, AFileOnAMountOfItsOwnIsReplacedInPlace)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("source"), "old");
    WriteFile(folder.Path("mounted"), "");

    const int code = TestSupport::RunInChild([&] {
        if (!TestSupport::EnterUserNamespace(0, CLONE_NEWNS) ||
            mount(folder.Path("source").c_str(), folder.Path("mounted").c_str(), nullptr, MS_BIND,
                  nullptr) != 0) {
            return TestSupport::notAllowed;
        }
        return ReplaceFile(folder.Path("mounted"), "new") ? good : wronglyFalse;
    });

    SKIP_IF_NOT_ALLOWED(code);
    EXPECT_EQ(code, good);
    EXPECT_EQ(ContentOf(folder.Path("source")), "new");
    EXPECT_EQ(folder.Count(), 2U);
}

} // namespace
