#include "ControlStreamClient/Discovery.h"

#include "ControlStreamClient/Error.h"
#include "device/ChildProgram.h"

#include <gmock/gmock.h>

// No D-Bus daemon is in reach of these tests, and so no DNS-SD service.

namespace {

using testing::HasSubstr;
using testing::StartsWith;

TEST(NoDiscoveryService, IsAFailureOfDiscovery)
{
    try {
        const ControlStream::VDiscovery discovery;
        FAIL() << "a service answered";
    } catch (const ControlStream::VError& error) {
        EXPECT_EQ(ControlStream::EErrorKind::NoConnection, error.Kind());
        EXPECT_THAT(error.what(), StartsWith("no DNS-SD service is running here: "));
    }
}

TEST(NoDiscoveryService, EndsDiscoverWithoutAConnection)
{
    const VOutcome outcome = RunProgram({"discover"});

    EXPECT_EQ("", outcome.Output);
    EXPECT_THAT(outcome.Errors, StartsWith("korva-control: no DNS-SD service is running here: "));
    EXPECT_EQ(3, outcome.ExitCode);
}

TEST(NoDiscoveryService, IsSaidWhereAHostIsNamedByItsService)
{
    const VOutcome outcome = RunProgram({"--host", "Quorix on studio", "info"});

    EXPECT_THAT(outcome.Errors,
                StartsWith("korva-control: a host that advertises itself as 'Quorix on studio' "
                           "cannot be looked for, as no DNS-SD service is running here: "));
    EXPECT_EQ(3, outcome.ExitCode);
}

TEST(NoDiscoveryService, IsTheDoctorsFirstFindingAndTheRestGoesOn)
{
    const VOutcome outcome = RunProgram({"--host", "127.0.0.1", "--port", "1", "doctor"});

    EXPECT_THAT(outcome.Output,
                StartsWith("problem  DNS-SD service: no DNS-SD service is running here: "));
    EXPECT_THAT(outcome.Output, HasSubstr("problem  port: 127.0.0.1:1 is closed: "));
    EXPECT_EQ(std::string::npos, outcome.Output.find("advertisement"));
    EXPECT_EQ(3, outcome.ExitCode);
}

} // namespace
