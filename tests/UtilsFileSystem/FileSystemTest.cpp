#include "UtilsFileSystem/FileSystem.h"

#include "UtilsFileSystem/ReadFile.h"
#include "support/LogCapture.h"
#include "support/TemporaryFolder.h"

#include <gmock/gmock.h>

#include <limits>
#include <set>
#include <stdexcept>
#include <sys/stat.h>
#include <unistd.h>

using namespace UtilsFileSystem;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::StartsWith;
using TestSupport::ContentOf;
using TestSupport::VLogCapture;
using TestSupport::VTemporaryFolder;
using TestSupport::WriteFile;

namespace {

const std::string zeroPath("/tmp\0/x", 7);

TEST(FileSystem, TellsFilesFromFolders)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("file"), "x");
    ASSERT_EQ(mkfifo(folder.Path("pipe").c_str(), 0600), 0);

    EXPECT_TRUE(FileExists(folder.Path("file")));
    EXPECT_TRUE(FileExists(folder.Path("pipe")));
    EXPECT_FALSE(FileExists(folder.Path()));
    EXPECT_FALSE(FileExists(folder.Path("missing")));
    EXPECT_FALSE(FileExists(folder.Path("file/below")));
    EXPECT_TRUE(FolderExists(folder.Path()));
    EXPECT_FALSE(FolderExists(folder.Path("file")));
    EXPECT_FALSE(FolderExists(folder.Path("missing")));
    EXPECT_FALSE(FolderExists(""));
}

TEST(FileSystem, APathWithAZeroNamesNothing)
{
    const VLogCapture log;
    std::ifstream stream;

    OpenInput(stream, zeroPath, std::ios_base::in);
    EnsureFolder(zeroPath);

    EXPECT_TRUE(stream.fail());
    EXPECT_FALSE(FolderExists(std::string("/tmp\0", 5)));
    EXPECT_FALSE(FileExists(std::string("/etc/passwd\0", 12)));
    EXPECT_EQ(log.Texts("UtilsFileSystem").size(), 1U);
}

TEST(FileSystem, AFolderWithAZeroInItsNameIsNotWalked)
{
    const VTemporaryFolder folder;
    const VLogCapture log;
    WriteFile(folder.Path("file"), "");

    ForEachFile(folder.Path() + std::string("\0x", 2),
                [](const boost::filesystem::path&) { ADD_FAILURE() << "called"; });

    EXPECT_EQ(log.Texts("UtilsFileSystem").size(), 1U);
}

TEST(FileSystem, WhatCannotBeAskedForIsNeitherFileNorFolderAndIsTriedToBeMade)
{
    const VTemporaryFolder folder;
    const VLogCapture log;
    const std::string loop = folder.Path("loop");
    ASSERT_EQ(symlink("loop", loop.c_str()), 0);

    EXPECT_FALSE(FileExists(loop));
    EXPECT_FALSE(FolderExists(loop));
    EnsureFolder(loop);

    ASSERT_EQ(log.Texts("UtilsFileSystem").size(), 1U);
    EXPECT_THAT(log.Messages()[0].Text, StartsWith("Unable to create path " + loop + ": "));
}

TEST(FileSystem, OpensThroughStreams)
{
    const VTemporaryFolder folder;
    std::ofstream output;
    std::ifstream input, missing;
    std::string text;

    OpenOutput(output, folder.Path("f"), std::ios_base::out);
    output << "text";
    output.close();
    OpenInput(input, folder.Path("f"), std::ios_base::in);
    input >> text;
    OpenInput(missing, folder.Path("missing"), std::ios_base::in);

    EXPECT_EQ(text, "text");
    EXPECT_TRUE(missing.fail());
}

TEST(FileSystem, OpensInTheModeThatIsAskedFor)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("f"), "old");
    std::ofstream appending, refused;
    std::ifstream atTheEnd;

    OpenOutput(appending, folder.Path("f"), std::ios_base::app);
    appending << " and new";
    appending.close();
    OpenInput(atTheEnd, folder.Path("f"), std::ios_base::ate);
    OpenOutput(refused, folder.Path(), std::ios_base::out);

    EXPECT_EQ(ContentOf(folder.Path("f")), "old and new");
    EXPECT_EQ(atTheEnd.tellg(), std::streamoff(11));
    EXPECT_TRUE(refused.fail());
}

TEST(FileSystem, EnsuresAFolderWithItsParents)
{
    const VTemporaryFolder folder;
    const VLogCapture log;

    EnsureFolder(folder.Path("a/b/c"));
    EnsureFolder(folder.Path("a/b/c"));

    EXPECT_TRUE(FolderExists(folder.Path("a/b/c")));
    EXPECT_THAT(log.Messages(), IsEmpty());
}

TEST(FileSystem, EnsuringLeavesAFileInPeace)
{
    const VTemporaryFolder folder;
    const VLogCapture log;
    WriteFile(folder.Path("file"), "content");

    EnsureFolder(folder.Path("file"));

    EXPECT_EQ(ContentOf(folder.Path("file")), "content");
    EXPECT_THAT(log.Messages(), IsEmpty());
}

TEST(FileSystem, AFolderThatCannotBeMadeIsLogged)
{
    const VTemporaryFolder folder;
    const VLogCapture log;
    WriteFile(folder.Path("file"), "");
    const std::string path = folder.Path("file/below");

    EnsureFolder(path);

    ASSERT_EQ(log.Messages().size(), 1U);
    EXPECT_THAT(log.Messages()[0].Text, StartsWith("Unable to create path " + path + ": boost::"));
    EXPECT_EQ(log.Messages()[0].Category, "UtilsFileSystem");
    EXPECT_EQ(log.Messages()[0].Level, 2);
}

TEST(FileSystem, AFolderOfAMillionLevelsIsRefusedWithoutRecursion)
{
    for (const char* level : {"/a", "/.", "/.."}) {
        const VLogCapture log;
        std::string path = "/tmp";
        for (int i = 0; i < 1000000; ++i) {
            path += level;
        }

        EnsureFolder(path);

        EXPECT_EQ(log.Texts("UtilsFileSystem").size(), 1U);
        EXPECT_FALSE(FolderExists(path));
    }
}

TEST(FileSystem, WalksTheRegularFilesOfOneFolder)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("a"), "");
    WriteFile(folder.Path("b"), "");
    EnsureFolder(folder.Path("sub"));
    WriteFile(folder.Path("sub/c"), "");
    ASSERT_EQ(mkfifo(folder.Path("pipe").c_str(), 0600), 0);
    ASSERT_EQ(symlink("sub/c", folder.Path("link").c_str()), 0);
    ASSERT_EQ(symlink("sub", folder.Path("linkToFolder").c_str()), 0);
    ASSERT_EQ(symlink("missing", folder.Path("linkToNothing").c_str()), 0);
    WriteFile(folder.Path("line\nfeed"), "");
    std::set<std::string> names;

    ForEachFile(folder.Path(), [&](const boost::filesystem::path& file) {
        names.insert(file.filename().string());
    });

    EXPECT_EQ(names, (std::set<std::string>{"a", "b", "line\nfeed", "link"}));
}

TEST(FileSystem, AFolderThatCannotBeWalkedIsLogged)
{
    const VTemporaryFolder folder;
    const VLogCapture log;
    const std::string path = folder.Path("missing");

    ForEachFile(path, [](const boost::filesystem::path&) { FAIL(); });

    EXPECT_THAT(log.Texts("UtilsFileSystem"),
                ElementsAre("Failed finding files in folder: [" + path + "]"));
    EXPECT_EQ(log.Messages()[0].Level, 2);
}

TEST(FileSystem, AnOperationThatThrowsEndsTheWalkAndIsLogged)
{
    const VTemporaryFolder folder;
    const VLogCapture log;
    WriteFile(folder.Path("a"), "");
    WriteFile(folder.Path("b"), "");
    int calls = 0;

    ForEachFile(folder.Path(), [&](const boost::filesystem::path&) {
        ++calls;
        throw std::runtime_error("no use");
    });

    EXPECT_EQ(calls, 1);
    EXPECT_THAT(log.Texts("UtilsFileSystem"),
                ElementsAre("Failed operation on files in [" + folder.Path() + "]: [no use]"));
    EXPECT_EQ(log.Messages()[0].Level, 2);
}

TEST(FileSystem, AnOperationMayThrowAnything)
{
    const VTemporaryFolder folder;
    const VLogCapture log;
    WriteFile(folder.Path("a"), "");

    ForEachFile(folder.Path(), [](const boost::filesystem::path&) { throw 1; });

    EXPECT_THAT(
        log.Texts("UtilsFileSystem"),
        ElementsAre("Failed operation on files in [" + folder.Path() + "]: [unknown exception]"));
}

TEST(ReadFile, ReadsUpToItsLimit)
{
    const VTemporaryFolder folder;
    const std::string content = std::string("a\0b\r\n", 5) + std::string(3 << 20, 'x');
    WriteFile(folder.Path("f"), content);
    WriteFile(folder.Path("empty"), "");

    EXPECT_EQ(ReadFile(folder.Path("f"), content.size()), content);
    EXPECT_EQ(ReadFile(folder.Path("f"), content.size() - 1), std::nullopt);
    EXPECT_EQ(ReadFile(folder.Path("empty"), 0), "");
    EXPECT_EQ(ReadFile(folder.Path("f"), 0), std::nullopt);
}

TEST(ReadFile, TakesTheGreatestLimitForNone)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("f"), "content");

    EXPECT_EQ(ReadFile(folder.Path("f"), std::numeric_limits<std::size_t>::max()), "content");
}

TEST(ReadFile, GivesNothingOfAFileThatCannotBeOpenedOrRead)
{
    const VTemporaryFolder folder;
    WriteFile(folder.Path("f"), "content");

    EXPECT_EQ(ReadFile(folder.Path("f") + std::string("\0x", 2), 100), std::nullopt);
    EXPECT_EQ(ReadFile("/proc/self/mem", 100), std::nullopt); // fails at its first byte
}

TEST(ReadFile, TakesNothingButRegularFiles)
{
    const VTemporaryFolder folder;
    ASSERT_EQ(mkfifo(folder.Path("pipe").c_str(), 0600), 0);

    EXPECT_EQ(ReadFile(folder.Path("missing"), 100), std::nullopt);
    EXPECT_EQ(ReadFile(folder.Path(), 100), std::nullopt);
    EXPECT_EQ(ReadFile(folder.Path("pipe"), 100), std::nullopt);
    EXPECT_EQ(ReadFile("/dev/zero", 100), std::nullopt);
    EXPECT_EQ(ReadFile(zeroPath, 100), std::nullopt);
}

} // namespace
