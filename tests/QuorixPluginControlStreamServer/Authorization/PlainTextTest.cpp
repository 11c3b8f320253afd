#include "QuorixPluginControlStreamServer/Authorization/PlainText.h"

#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <string>
#include <sys/stat.h>

namespace {

struct VTextCase
{
    const char* name;
    std::string richText;
    std::string plainText;
};

// clang-format off
const VTextCase textCases[] = {
    {"Empty",           "",                             ""},
    {"Plain",           "Phone of Ann",                 "Phone of Ann"},
    {"Bold",            "<b>Bo</b>ld",                  "Bold"},
    {"Entities",        "A &amp; B &lt;b&gt;",          "A & B <b>"},
    {"LineBreak",       "Foo<br>victim;y",              "Foo\nvictim;y"},
    {"Paragraphs",      "<p>a</p><p>b</p>",             "a\nb"},
    {"Link",            "<a href='x'>phone</a>",        "phone"},
    {"Style",           "<style>p{color:red}</style>x", "x"},
    {"Comment",         "a<!-- b -->c",                 "ac"},
    {"Unfinished",      "a<b",                          "a"},
    {"Umlaut",          "<i>\xC3\xA9t\xC3\xA9</i>",     "\xC3\xA9t\xC3\xA9"},
    {"Emoji",           "<i>\xF0\x9F\x98\x80</i>",      "\xF0\x9F\x98\x80"},
    {"ByteOrderMark",   "\xEF\xBB\xBFx",                "\xEF\xBB\xBFx"},
    {"Semicolons",      "a;b",                          "a;b"},
};
// clang-format on

class PlainTextCases : public testing::TestWithParam<VTextCase>
{
};

/// A pipe without a writer: whoever opens it to read from it waits for ever.
class VSilentPipe
{
public:
    VSilentPipe() { mkfifo(Path().c_str(), 0600); }
    ~VSilentPipe() { std::filesystem::remove_all(folder); }

    VSilentPipe(const VSilentPipe&) = delete;
    VSilentPipe& operator=(const VSilentPipe&) = delete;

    std::string Path() const { return folder + "/pipe"; }

private:
    static std::string MakeFolder()
    {
        std::string name = std::filesystem::temp_directory_path().string() + "/plain-XXXXXX";
        return mkdtemp(name.data());
    }

    const std::string folder = MakeFolder();
};

std::string Repeated(const std::string& text, std::size_t count)
{
    std::string repeated;
    for (std::size_t i = 0; i < count; ++i) {
        repeated += text;
    }
    return repeated;
}

} // namespace

TEST_P(PlainTextCases, AreWhatAReaderSees)
{
    EXPECT_EQ(GetParam().plainText, RichTextToPlainText(GetParam().richText));
}

INSTANTIATE_TEST_SUITE_P(Cases, PlainTextCases, testing::ValuesIn(textCases),
                         [](const auto& test) { return test.param.name; });

// One that is opened holds up the test to its time limit.
TEST(PlainText, OpensNothingThatTheTextNames)
{
    const VSilentPipe pipe;
    const std::string path = pipe.Path();
    const std::string url = "file://" + path;
    const std::string head = "<html><head>";
    const std::string body = "</head><body>a</body></html>";

    EXPECT_EQ("a",
              RichTextToPlainText(head + "<link rel='stylesheet' href='" + path + "'>" + body));
    EXPECT_EQ("a", RichTextToPlainText(head + "<link rel='stylesheet' type='text/css' href='" +
                                       url + "'>" + body));
    EXPECT_EQ("a", RichTextToPlainText("<style>@import url(" + path + ");</style>a"));
    EXPECT_EQ("a", RichTextToPlainText("<style>@import '" + url + "';</style>a"));
    EXPECT_EQ("\xEF\xBF\xBC", RichTextToPlainText("<img src='" + path + "'>"));
    EXPECT_EQ("a", RichTextToPlainText("<body background='" + path + "'>a</body>"));
    EXPECT_EQ("\na\n", RichTextToPlainText("<table background='" + url + "'><tr><td>a</table>"));
    EXPECT_EQ("a", RichTextToPlainText("<p style='background-image: url(" + path + ")'>a</p>"));
    EXPECT_EQ("a", RichTextToPlainText("<ul style='list-style-image: url(" + path + ")'><li>a"));
}

TEST(PlainText, WithoutWindowsNoAttributeIsRead)
{
    // Each of these would ask for the colours of windows, and end this process.
    EXPECT_EQ("a", RichTextToPlainText("<a href>a"));
    EXPECT_EQ("a", RichTextToPlainText("<a &#104;ref=x>a"));
    EXPECT_EQ("a", RichTextToPlainText("< a HREF=x>a"));
}

TEST(PlainText, MarkupBeyondAllNamesIsCutOff)
{
    EXPECT_EQ(std::string(4093, 'x'), RichTextToPlainText("<b>" + std::string(4093, 'x')));
    EXPECT_EQ(std::string(4093, 'x'), RichTextToPlainText("<b>" + std::string(4094, 'x')));
}

TEST(PlainText, ALongNameWithoutMarkupStaysWholeUpToAMebi)
{
    const std::string name(100000, 'x');

    EXPECT_TRUE(name == RichTextToPlainText(name)); // too long to be shown
    EXPECT_EQ(1048576U, RichTextToPlainText(std::string(3000000, 'x')).size());
}

TEST(PlainText, DeepMarkupEndsSoon)
{
    // Uncut, each takes minutes.
    for (const char* const tag :
         {"<b>", "<div>", "<img src=x>", "<table><tr><td>", "<ul><li>", "<style>p{}</style>"}) {
        const auto begin = std::chrono::steady_clock::now();
        RichTextToPlainText(Repeated(tag, 100000));
        EXPECT_LT(std::chrono::steady_clock::now() - begin, std::chrono::seconds(60)) << tag;
    }
}
