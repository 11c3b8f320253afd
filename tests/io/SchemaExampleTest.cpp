#include "io/SchemaExample.h"

#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

namespace {

std::string ContentOf(const std::string& path)
{
    std::ifstream file(path, std::ios::binary);
    EXPECT_TRUE(file.good()) << path;
    std::ostringstream content;
    content << file.rdbuf();
    return content.str();
}

/// Returns the fenced blocks of a language in a page.
std::vector<std::string> BlocksOf(const std::string& page, const std::string& language)
{
    const std::string begin = "```" + language + "\n";
    std::vector<std::string> blocks;
    for (std::size_t at = page.find(begin); at != std::string::npos; at = page.find(begin, at)) {
        at += begin.size();
        const std::size_t end = page.find("```", at);
        blocks.push_back(page.substr(at, end - at));
        at = end + 3;
    }
    return blocks;
}

std::string PageText()
{
    return ContentOf(std::string(QUORIX_SOURCE_FOLDER) + "/docs/schemas.md");
}

VDataValue MakeOldValue()
{
    Release1::VCalibration old;
    old.name = "Studio A";
    old.quality = -12;
    old.lens = Release1::ELens::Narrow;
    old.stale = true;
    old.residuals = {0.5f, 0.25f};
    return KVR::IO::MakeNativeValue(old);
}

} // namespace

TEST(SchemaExample, IsTheCodeOfThePage)
{
    const std::string source =
        ContentOf(std::string(QUORIX_SOURCE_FOLDER) + "/tests/io/SchemaExample.h");
    const std::vector<std::string> blocks = BlocksOf(PageText(), "cpp");

    EXPECT_EQ(5u, blocks.size());
    for (const std::string& block : blocks) {
        EXPECT_NE(std::string::npos, source.find(block)) << block;
    }
}

TEST(SchemaExample, CarriesTheOldValueOver)
{
    Release2::VCalibration calibration;
    std::vector<std::string> lines;

    EXPECT_TRUE(LoadCalibration(MakeOldValue(), calibration, lines));

    EXPECT_EQ("Studio A", calibration.name);
    EXPECT_EQ(-12, calibration.quality);
    EXPECT_EQ(Release2::ELens::Narrow, calibration.lens);
    EXPECT_EQ((std::vector<double>{0.5, 0.25}), calibration.residuals);
    EXPECT_EQ("unknown", calibration.operatorName);
}

TEST(SchemaExample, SaysWhatThePageShows)
{
    Release2::VCalibration calibration;
    std::vector<std::string> lines;
    LoadCalibration(MakeOldValue(), calibration, lines);
    std::string text;
    for (const std::string& line : lines) {
        text += line + "\n";
    }

    EXPECT_EQ((std::vector<std::string>{text}), BlocksOf(PageText(), "text"));
}

TEST(SchemaExample, DoesNotGoBackToTheOldRelease)
{
    // As the page says: the old release has no name for what the new one added.
    const VDataValue value = KVR::IO::MakeNativeValue(Release2::VCalibration());
    Release1::VCalibration calibration;

    EXPECT_FALSE(KVR::IO::ReadNativeValue(value, calibration));
}
