#include "device/ChildProgram.h"
#include "device/ScriptedHost.h"

#include <gmock/gmock.h>

#include <string>
#include <vector>

// The list of cameras from hosts that answer as a real one seldom does.

namespace {

const char* const noAccess = "<Result>Error: Unable to access requested data.</Result>";
const char* const noSetting = "<Result>Error: Invalid Parameter Name</Result>";

std::string Ok(const std::string& name, const std::string& value)
{
    return "<Result>OK</Result><Parameters><Parameter><Name>" + name + "</Name><Value>" + value +
           "</Value></Parameter></Parameters>";
}

/// Answers one command after the other.
VScriptedHost::Script Answers(const std::vector<std::string>& bodies)
{
    return [bodies](VPeer& peer) {
        int correlation = 0;
        for (const std::string& body : bodies) {
            peer.ReadFrame();
            peer.SendFrame(Declaration + std::string("<CommandReply><Correlation>") +
                           std::to_string(++correlation) + "</Correlation>" + body +
                           "</CommandReply>");
        }
        peer.ReadToEnd();
    };
}

VOutcome ListCameras(const std::vector<std::string>& bodies)
{
    VScriptedHost host(Answers(bodies));
    return RunProgram({"--port", std::to_string(host.Port()), "cameras"});
}

} // namespace

TEST(ProgramCameras, ACameraThatGoesMeanwhileIsLeftOut)
{
    const VOutcome outcome =
        ListCameras({Ok("Cameras", "1,2"), Ok("Param_CameraSelection", "1,2"), noAccess, noAccess,
                     noAccess, noAccess, noSetting, noSetting, noSetting, noAccess});

    EXPECT_EQ("Camera 2: GreyscaleMode=? (selected)\n", outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
}

TEST(ProgramCameras, ACameraWithoutAnySettingIsListed)
{
    const VOutcome outcome =
        ListCameras({Ok("Cameras", "4294967295"), Ok("Param_CameraSelection", "1"), noSetting,
                     noSetting, noSetting, noSetting});

    EXPECT_EQ("Camera 4294967295:\n", outcome.Output);
}

TEST(ProgramCameras, AHostThatTellsTheModeIsBelievedAndItsTextMadeHarmless)
{
    const VOutcome outcome = ListCameras({Ok("Cameras", "7"), Ok("Param_CameraSelection", ""),
                                          Ok("Param_StrobeIntensity", "\x1B"),
                                          "<Result>Error: An unknown error occurred.</Result>",
                                          noSetting, Ok("Param_GreyscaleMode", "No Edges")});

    EXPECT_EQ("Camera 7: StrobeIntensity=\\x1B Threshold=? GreyscaleMode=\"No Edges\"\n",
              outcome.Output);
}

TEST(ProgramCameras, AHostThatDoesNotKnowTheCommandIsOne)
{
    const VOutcome outcome = ListCameras({"<Result>Error: Invalid command name</Result>"});

    EXPECT_EQ("", outcome.Output);
    EXPECT_EQ("korva-control: Host.Information: Error: Invalid command name\n", outcome.Errors);
    EXPECT_EQ(1, outcome.ExitCode);
}

TEST(ProgramCameras, AListThatIsNoneIsOne)
{
    for (const char* const list : {"x", "1,", ",1", "1,,2", "1 2", "-1", "4294967296", "1,2x"}) {
        const VOutcome outcome = ListCameras({Ok("Cameras", list)});

        EXPECT_EQ("", outcome.Output);
        EXPECT_EQ(std::string("korva-control: the host's list of cameras is unreadable: \"") +
                      list + "\"\n",
                  outcome.Errors);
        EXPECT_EQ(1, outcome.ExitCode);
    }
}
