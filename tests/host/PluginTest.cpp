#include "Plugin.h"

#include "QuorixPluginInterface/IPlugin.h"

#include <gmock/gmock.h>

#include <filesystem>
#include <fstream>
#include <string>

using QuorixHost::VPlugin;
using QuorixHost::VPluginError;
using testing::HasSubstr;

namespace {

/// @return why the library cannot be used as a plug-in; empty when it can
std::string WhyNot(const std::string& path)
{
    try {
        VPlugin plugin(path);
        return std::string();
    } catch (const VPluginError& error) {
        return error.what();
    }
}

} // namespace

TEST(Plugin, ThePluginOfThisBuildCanBeUsed)
{
    EXPECT_EQ("", WhyNot(QUORIX_PLUGIN_LIBRARY));
    EXPECT_EQ(108131, VPlugin(QUORIX_PLUGIN_LIBRARY)->GetInterfaceVersion());
}

TEST(Plugin, IsFoundBesideTheProgram)
{
    EXPECT_EQ(QUORIX_PLUGIN_LIBRARY, QuorixHost::FindOwnPlugin());
}

TEST(Plugin, AMissingLibraryIsAnError)
{
    EXPECT_THAT(WhyNot("/no/such/plugin.so"), HasSubstr("/no/such/plugin.so"));
}

TEST(Plugin, AFileThatIsNoLibraryIsAnError)
{
    const std::string path = testing::TempDir() + "no-library.so";
    std::ofstream(path) << "text";

    EXPECT_THAT(WhyNot(path), HasSubstr("no-library.so"));
    std::filesystem::remove(path);
}

TEST(Plugin, ALibraryWithoutTheFunctionsIsAnError)
{
    EXPECT_THAT(WhyNot(QUORIX_PLUGIN_EMPTY), HasSubstr("it has no function CreatePlugin"));
}

TEST(Plugin, AnotherInterfaceVersionIsAnErrorAndTheObjectIsDestroyed)
{
    EXPECT_THAT(WhyNot(QUORIX_PLUGIN_OTHER_VERSION),
                HasSubstr("has interface version 108130, this host needs 108131"));
    EXPECT_EQ("destroyed", std::string(getenv("QUORIX_TEST_PLUGIN")));
}

TEST(Plugin, ALibraryThatMakesNoObjectIsAnError)
{
    EXPECT_THAT(WhyNot(QUORIX_PLUGIN_NO_OBJECT), HasSubstr("made no plug-in object"));
}

TEST(Plugin, ANameWithoutAFolderIsMeantInTheWorkingFolder)
{
    // The system's own libraries would be found by name.
    EXPECT_THAT(WhyNot("libc.so.6"), HasSubstr(std::filesystem::current_path().string()));
}
