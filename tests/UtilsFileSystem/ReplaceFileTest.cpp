#include "UtilsFileSystem/ReplaceFile.h"

#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <sys/stat.h>
#include <unistd.h>

using TestSupport::ContentOf;
using TestSupport::VTemporaryFolder;
using TestSupport::WriteFile;
using UtilsFileSystem::ReplaceFile;

namespace {

mode_t ModeOf(const std::string& path)
{
    struct stat status
    {
    };
    return stat(path.c_str(), &status) == 0 ? status.st_mode & 07777 : 0;
}

TEST(ReplaceFile, MakesAFileWithTheModeOfANewOne)
{
    const VTemporaryFolder folder;
    const mode_t mask = umask(027);

    EXPECT_TRUE(ReplaceFile(folder.Path("file"), std::string("a\0b\r\n", 5)));

    umask(mask);
    EXPECT_EQ(ContentOf(folder.Path("file")), std::string("a\0b\r\n", 5));
    EXPECT_EQ(ModeOf(folder.Path("file")), 0640U);
    EXPECT_EQ(folder.Count(), 1U);
}

TEST(ReplaceFile, KeepsTheModeOfTheOldFile)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), "a longer old content");
    chmod(folder.Path("file").c_str(), 0604);

    EXPECT_TRUE(ReplaceFile(folder.Path("file"), "new"));

    EXPECT_EQ(ContentOf(folder.Path("file")), "new");
    EXPECT_EQ(ModeOf(folder.Path("file")), 0604U);
    EXPECT_EQ(folder.Count(), 1U);
}

TEST(ReplaceFile, KeepsTheOwnerOfTheOldFileWhereItMay)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), "old");
    if (chown(folder.Path("file").c_str(), 1234, 2345) != 0) {
        GTEST_SKIP() << "only an administrator may give files away";
    }

    EXPECT_TRUE(ReplaceFile(folder.Path("file"), "new"));

    struct stat status
    {
    };
    ASSERT_EQ(stat(folder.Path("file").c_str(), &status), 0);
    EXPECT_EQ(status.st_uid, 1234U);
    EXPECT_EQ(status.st_gid, 2345U);
    EXPECT_EQ(ContentOf(folder.Path("file")), "new");
}

TEST(ReplaceFile, TakesAnEmptyContent)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), "old");

    EXPECT_TRUE(ReplaceFile(folder.Path("file"), ""));

    EXPECT_EQ(ContentOf(folder.Path("file")), "");
}

TEST(ReplaceFile, LeavesReadersOfTheOldFileAlone)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), "old");
    std::ifstream reader(folder.Path("file"));

    EXPECT_TRUE(ReplaceFile(folder.Path("file"), "new"));

    std::string text;
    reader >> text;
    EXPECT_EQ(text, "old");
}

TEST(ReplaceFile, FollowsASymbolicLink)
{
    const VTemporaryFolder folder;
    std::filesystem::create_directories(folder.Path("elsewhere"));
    WriteFile(folder.Path("elsewhere/target"), "old");
    std::filesystem::create_symlink("elsewhere/target", folder.Path("middle"));
    std::filesystem::create_symlink(folder.Path("middle"), folder.Path("link"));

    EXPECT_TRUE(ReplaceFile(folder.Path("link"), "new"));

    EXPECT_TRUE(std::filesystem::is_symlink(folder.Path("link")));
    EXPECT_TRUE(std::filesystem::is_symlink(folder.Path("middle")));
    EXPECT_EQ(ContentOf(folder.Path("elsewhere/target")), "new");
    EXPECT_EQ(folder.Count(), 3U);
}

TEST(ReplaceFile, MakesTheFileThatALinkLeadsTo)
{
    const VTemporaryFolder folder;
    std::filesystem::create_symlink("target", folder.Path("link"));

    EXPECT_TRUE(ReplaceFile(folder.Path("link"), "new"));

    EXPECT_TRUE(std::filesystem::is_symlink(folder.Path("link")));
    EXPECT_EQ(ContentOf(folder.Path("target")), "new");
}

TEST(ReplaceFile, RefusesALinkThatLeadsNowhere)
{
    const VTemporaryFolder folder;
    std::filesystem::create_symlink("loop", folder.Path("loop"));

    EXPECT_FALSE(ReplaceFile(folder.Path("loop"), "new"));

    EXPECT_TRUE(std::filesystem::is_symlink(folder.Path("loop")));
    EXPECT_EQ(folder.Count(), 1U);
}

TEST(ReplaceFile, RefusesWhatIsNoRegularFile)
{
    const VTemporaryFolder folder;
    ASSERT_EQ(mkfifo(folder.Path("pipe").c_str(), 0600), 0);
    std::filesystem::create_directories(folder.Path("folder"));

    EXPECT_FALSE(ReplaceFile(folder.Path("pipe"), "new"));
    EXPECT_FALSE(ReplaceFile(folder.Path("folder"), "new"));
    EXPECT_FALSE(ReplaceFile("/dev/null", "new"));

    EXPECT_TRUE(std::filesystem::is_fifo(folder.Path("pipe")));
    EXPECT_TRUE(std::filesystem::is_character_file("/dev/null"));
    EXPECT_EQ(folder.Count(), 2U);
}

TEST(ReplaceFile, RefusesAPathWithAZeroOrWithoutItsFolder)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), "old");

    EXPECT_FALSE(ReplaceFile(folder.Path("file") + std::string("\0x", 2), "new"));
    EXPECT_FALSE(ReplaceFile(folder.Path("missing/file"), "new"));
    EXPECT_FALSE(ReplaceFile(folder.Path("file/file"), "new"));
    EXPECT_FALSE(ReplaceFile("", "new"));

    EXPECT_EQ(ContentOf(folder.Path("file")), "old");
    EXPECT_EQ(folder.Count(), 1U);
}

TEST(ReplaceFile, TakesANameOfTheGreatestLength)
{
    const VTemporaryFolder folder;
    const std::string name(255, 'n');

    EXPECT_TRUE(ReplaceFile(folder.Path(name), "1"));
    EXPECT_TRUE(ReplaceFile(folder.Path(name), "2"));
    EXPECT_FALSE(ReplaceFile(folder.Path(name + "n"), "3"));

    EXPECT_EQ(ContentOf(folder.Path(name)), "2");
    EXPECT_EQ(folder.Count(), 1U);
}

TEST(ReplaceFile, TakesANameWithoutAFolder)
{
    const VTemporaryFolder folder;
    const std::filesystem::path before = std::filesystem::current_path();
    std::filesystem::current_path(folder.Path());

    const bool replaced = ReplaceFile("file", "new");

    std::filesystem::current_path(before);
    EXPECT_TRUE(replaced);
    EXPECT_EQ(ContentOf(folder.Path("file")), "new");
}

} // namespace
