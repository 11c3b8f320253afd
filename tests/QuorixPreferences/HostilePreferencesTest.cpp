#include "PreferencesFixture.h"
#include "support/ChildProcess.h"
#include "support/Sanitizers.h"

#include <sys/resource.h>

using namespace PreferencesTest;
using testing::HasSubstr;
using testing::SizeIs;
using testing::StartsWith;

// Files that were made to harm. Whatever they hold, loading ends, the memory is bounded, and the
// defaults stand where there is nothing better.

namespace {

std::string Repeated(const std::string& text, std::size_t count)
{
    std::string all;
    all.reserve(text.size() * count);
    for (; count > 0; --count) {
        all += text;
    }
    return all;
}

class HostilePreferencesTest : public PreferencesFixture
{
protected:
    HostilePreferencesTest() { host.Features = {}; }

    void LoadUser(const std::string& content)
    {
        TestSupport::WriteFile(UserFile(), content);
        Load();
    }

    /// Loads in a process of its own. @return the most memory that it took, in MiB
    long MemoryOfLoading(const std::string& content)
    {
        TestSupport::WriteFile(UserFile(), content);
        int pipeEnds[2];
        EXPECT_EQ(pipe(pipeEnds), 0);
        EXPECT_EQ(TestSupport::RunInChild([&] {
                      Load();
                      rusage usage{};
                      getrusage(RUSAGE_SELF, &usage);
                      const long megabytes = usage.ru_maxrss / 1024;
                      return write(pipeEnds[1], &megabytes, sizeof megabytes) > 0 ? 0 : 1;
                  }),
                  0);
        long megabytes = 0;
        EXPECT_EQ(read(pipeEnds[0], &megabytes, sizeof megabytes),
                  static_cast<ssize_t>(sizeof megabytes));
        close(pipeEnds[0]);
        close(pipeEnds[1]);
        return megabytes;
    }

    void ExpectUnreadable() const
    {
        EXPECT_EQ(Logged().back(), "Config 2 Error loading preferences " + UserFile() +
                                       ", failed parsing xml file contents.");
        EXPECT_EQ(SwitchOf("Preferences.User.AltToSelect"), "true");
    }
};

const std::string start = "<Configuration version=\"2.0\"><Node name=\"Preferences\"><Node "
                          "name=\"User\">";
const std::string end = "</Node></Node></Configuration>";

TEST_F(HostilePreferencesTest, ElementsNestedAHundredThousandDeepAreUnreadable)
{
    LoadUser(start + Repeated("<Node name='n'>", 100000) + Repeated("</Node>", 100000) + end);
    ExpectUnreadable();

    LoadUser(Repeated("<a>", 100000));
    ExpectUnreadable();
}

TEST_F(HostilePreferencesTest, ElementsNestedAsDeepAsIsAllowedAreLoaded)
{
    // Three levels around them, and one for the item.
    LoadUser(start + Repeated("<Node name='n'>", 996) +
             "<Item name='i' format='{\"Type\":\"Bool\"}' value-verified='true'/>" +
             Repeated("</Node>", 996) + end);

    std::vector<VDataToken> tokens;
    VDataReader(store).FindTokens(VDataPath("Preferences.User.n.*"), tokens);
    EXPECT_THAT(tokens, SizeIs(1));
    EXPECT_THAT(Logged(), SizeIs(1));
}

TEST_F(HostilePreferencesTest, AFileTruncatedAtAnyByteLoadsOrIsUnreadable)
{
    std::string content = start;
    for (int number = 0; content.size() < 2000; ++number) {
        content += StringItem("Key" + std::to_string(number), "<value>");
    }
    content += end;
    ASSERT_GE(content.size(), 2000U);

    for (std::size_t size = 0; size < content.size(); ++size) {
        const TestSupport::VLogCapture ownLog;
        std::filesystem::remove(UserFile()); // cutting it would wait for the disk
        LoadUser(content.substr(0, size));
        // No part of this file is whole but the empty one.
        EXPECT_EQ(ownLog.Messages().size(), size == 0 ? 1U : 2U) << size;
    }
    LoadUser(content);
    EXPECT_EQ(Logged().back(), "Config 4 Loading preferences " + UserFile());
    EXPECT_TRUE(Exists("Preferences.User.Key5"));
}

TEST_F(HostilePreferencesTest, AZeroEndsTheFile)
{
    const std::string zero(1, '\0');

    LoadUser(zero + start + end);
    EXPECT_THAT(Logged(), SizeIs(1)); // an empty file is one that says nothing

    LoadUser(start + zero + end);
    ExpectUnreadable();

    LoadUser(start + StringItem("Kept", "x") + end + zero + "<<<<");
    EXPECT_EQ(TextOf("Preferences.User.Kept"), "x");
}

TEST_F(HostilePreferencesTest, BytesThatAreNoUtf8AreKept)
{
    LoadUser(start + StringItem("A\xFF", "\xC0\x80\xED\xA0\x80\xFE") + end);

    EXPECT_EQ(TextOf("Preferences.User.A\xFF"), "\xC0\x80\xED\xA0\x80\xFE");
}

TEST_F(HostilePreferencesTest, UnknownNamesByTheThousandAreReportedEach)
{
    std::string content = start;
    for (int number = 0; number < 5000; ++number) {
        content += "<u" + std::to_string(number) + "/>";
    }
    content += "<Item name='A' ";
    for (int number = 0; number < 5000; ++number) {
        content += "a" + std::to_string(number) + "='' ";
    }

    LoadUser(content + "/>" + Repeated("<u0/>", 5000) + end);

    const Texts lines = Logged();
    EXPECT_EQ(lines.size(), 1U + 10000U + 3U);
    EXPECT_EQ(lines[1], "DataStore 3 Ignoring unrecognised attribute: "
                        "/Configuration/Node/Node/Item/a0");
}

TEST_F(HostilePreferencesTest, MessagesThatWouldFillTheMemoryAreOnlyCounted)
{
    // A path of half a megabyte, in each of five hundred messages.
    const std::string longName(1000, 'n');
    std::string content = start + Repeated("<Node name='" + longName + "'>", 500) +
                          Repeated("<Item/>", 500) + Repeated("</Node>", 500) + end;

    LoadUser(content);

    std::size_t size = 0;
    for (const std::string& line : Logged()) {
        size += line.size();
    }
    EXPECT_LT(size, 20U << 20);
    EXPECT_THAT(Logged().back(), testing::ContainsRegex("And [0-9]+ more messages of this kind"));
}

TEST_F(HostilePreferencesTest, PathsThatWouldFillTheMemoryAreRefused)
{
    // A path of a megabyte, which each of a thousand items would have in the store.
    const std::string longName(2000, 'n');
    std::string items;
    for (int number = 0; number < 1000; ++number) {
        items += "<Item name='" + std::to_string(number) +
                 "' format='{\"Type\":\"Bool\"}' value-verified='true'/>";
    }
    const std::string content = start + Repeated("<Node name='" + longName + "'>", 500) + items +
                                Repeated("</Node>", 500) + end;

    const long megabytes = MemoryOfLoading(content);

    EXPECT_GT(megabytes, 0);
    if (!TestSupport::isSanitized) {
        EXPECT_LT(megabytes, 600);
    }
}

TEST_F(HostilePreferencesTest, AFileOfAttributesTakesABoundedAmountOfMemory)
{
    std::string content = "<Configuration version='2.0' ";
    for (int number = 0; content.size() < GreatestPreferenceFile / 4; ++number) {
        content += "a" + std::to_string(number) + "='' ";
    }

    const long megabytes = MemoryOfLoading(content + "/>");

    EXPECT_GT(megabytes, 0);
    if (!TestSupport::isSanitized) {
        EXPECT_LT(megabytes, 400);
    }
}

TEST_F(HostilePreferencesTest, SchemasThatNestOrRepeatAreRefusedOrCheap)
{
    const std::string deep =
        Repeated("{\"Type\":\"Tuple\",\"SubSchemas\":[[\"\",", 1000) + "{}" + Repeated("]]}", 1000);
    const std::string wide = "{\"Type\":\"Array\",\"Count\":4294967295,\"SubSchemas\":[[\"\","
                             "{\"Type\":\"Tuple\"}]]}";

    LoadUser(start + "<Item name='Deep' format='" + deep + "' value-verified='[]'/>" +
             "<Item name='Wide' format='" + wide + "' value-verified='[]'/>" + end);

    EXPECT_THAT(Logged(), SizeIs(4));
    EXPECT_THAT(Logged()[1], HasSubstr("with invalid 'format' attribute value"));
    EXPECT_THAT(Logged()[2], HasSubstr("with invalid 'value-verified' attribute value '[]', "));
    EXPECT_THAT(Logged()[3], HasSubstr("with invalid 'value-verified' attribute value '[]', "));
}

} // namespace
