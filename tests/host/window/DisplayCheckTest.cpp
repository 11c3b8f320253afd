#include "window/DisplayCheck.h"
#include "support/TestListener.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <string>
#include <sys/wait.h>

// Below no QApplication, as the check has it: the display is named by the environment.

using QuorixHost::DescribeMissingDisplay;
using testing::HasSubstr;
using testing::Optional;
using TestSupport::VTestListener;

namespace {

constexpr std::chrono::seconds generousLimit{60};

class DisplayCheck : public testing::Test
{
protected:
    DisplayCheck()
    {
        for (const char* const name : {"DISPLAY", "WAYLAND_DISPLAY", "QT_QPA_PLATFORM"}) {
            unsetenv(name);
        }
    }
};

/// Returns the name that X has for the display behind a TCP port.
std::string DisplayOfPort(std::uint16_t port)
{
    return "127.0.0.1:" + std::to_string(port - 6000);
}

} // namespace

TEST_F(DisplayCheck, HasNothingAgainstAPlatformWithoutADisplay)
{
    setenv("QT_QPA_PLATFORM", "offscreen", 1);

    EXPECT_EQ(std::nullopt, DescribeMissingDisplay(generousLimit));
}

TEST_F(DisplayCheck, TellsThatThereIsNoDisplay)
{
    EXPECT_THAT(DescribeMissingDisplay(generousLimit),
                Optional(HasSubstr("could not connect to display")));
}

TEST_F(DisplayCheck, TellsWhichDisplayIsDead)
{
    setenv("DISPLAY", ":7777", 1);

    EXPECT_THAT(DescribeMissingDisplay(generousLimit), Optional(HasSubstr(":7777")));
}

TEST_F(DisplayCheck, TellsThatTheWaylandDisplayIsDead)
{
    setenv("WAYLAND_DISPLAY", "none-such", 1);

    EXPECT_NE(std::nullopt, DescribeMissingDisplay(generousLimit));
}

TEST_F(DisplayCheck, TellsOfAPlatformThatQtLacks)
{
    setenv("QT_QPA_PLATFORM", "none-such", 1);

    EXPECT_THAT(DescribeMissingDisplay(generousLimit), Optional(HasSubstr("none-such")));
}

TEST_F(DisplayCheck, TellsThatADisplayIsDeadAlsoWhereQtIsKeptQuiet)
{
    setenv("DISPLAY", ":7777", 1);
    setenv("QT_LOGGING_RULES", "*=false", 1);

    EXPECT_NE(std::nullopt, DescribeMissingDisplay(generousLimit));

    unsetenv("QT_LOGGING_RULES");
}

TEST_F(DisplayCheck, GivesUpADisplayThatNeverAnswers)
{
    const VTestListener mute(VTestListener::listening);
    setenv("DISPLAY", DisplayOfPort(mute.Port()).c_str(), 1);

    EXPECT_THAT(DescribeMissingDisplay(std::chrono::milliseconds(100)),
                Optional(HasSubstr("does not answer")));
}

TEST_F(DisplayCheck, LeavesNoProcessBehind)
{
    setenv("DISPLAY", ":7777", 1);

    DescribeMissingDisplay(generousLimit);

    EXPECT_EQ(-1, waitpid(-1, nullptr, WNOHANG));
    EXPECT_EQ(ECHILD, errno);
}

TEST_F(DisplayCheck, TellsThemApartAlsoWhereChildrenAreIgnored)
{
    const auto before = std::signal(SIGCHLD, SIG_IGN);

    setenv("QT_QPA_PLATFORM", "offscreen", 1);
    EXPECT_EQ(std::nullopt, DescribeMissingDisplay(generousLimit));
    setenv("QT_QPA_PLATFORM", "none-such", 1);
    EXPECT_NE(std::nullopt, DescribeMissingDisplay(generousLimit));

    std::signal(SIGCHLD, before);
}
