#include "korva-control/Commands.h"
#include "korva-control/Session.h"
#include "korva-control/TerminalText.h"

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <optional>
#include <vector>

#include <CLI/CLI.hpp>

namespace {

using ControlStream::EErrorKind;
using ControlStream::VClient;
using ControlStream::VCommandReply;
using ControlStream::VError;

/// How a host refuses to tell a setting.
constexpr const char* NoSuchSetting = "Error: Invalid Parameter Name";
constexpr const char* NoAccess = "Error: Unable to access requested data.";

/// A setting, with the command and the parameter by which it is read.
struct VSettingName
{
    const char* Name; ///< the host's own, also the key in JSON
    const char* Command;
    const char* Parameter;
};

constexpr VSettingName SettingNames[] = {
    {"StrobeIntensity", "CameraSettings_GetStrobeIntensity", "Param_StrobeIntensity"},
    {"Threshold", "CameraSettings_GetCentroidThreshold", "Param_CentroidThreshold"},
    {"ShutterDuration", "CameraSettings_GetShutterDuration", "Param_ShutterDuration"},
    // Hosts refuse to tell a mode that is in order, and so it is never known which.
    {"GreyscaleMode", "CameraSettings_GetGreyscaleMode", "Param_GreyscaleMode"},
};

/// A setting that a camera has.
struct VSetting
{
    const char* Name;
    std::optional<std::string> Value; ///< empty where the host does not tell
};

struct VCamera
{
    std::uint32_t Number;
    bool Selected;
    std::vector<VSetting> Settings;
};

/// Reads numbers between commas; an empty text holds none.
std::vector<std::uint32_t> ParseNumbers(const std::string& text)
{
    std::vector<std::uint32_t> numbers;
    const char* position = text.data();
    const char* const end = position + text.size();
    while (position != end) {
        std::uint32_t number = 0;
        const auto [stop, error] = std::from_chars(position, end, number);
        if (error != std::errc() || (stop != end && (*stop != ',' || stop + 1 == end))) {
            throw VError(EErrorKind::Protocol,
                         "the host's list of cameras is unreadable: \"" + text + "\"");
        }
        numbers.push_back(number);
        position = stop == end ? end : stop + 1;
    }
    return numbers;
}

/// Reads what a command tells of the cameras. Throws VError where the host does not know it.
std::vector<std::uint32_t> QueryNumbers(VClient& client, const char* command, const char* parameter)
{
    const VCommandReply reply = client.ExecuteCommand(command);
    if (!reply.Ok) {
        throw VError(EErrorKind::Protocol, std::string(command) + ": " + reply.Result);
    }
    return ParseNumbers(ControlStream::GetValue(reply.Parameters, parameter));
}

/// Asks for the settings of a camera. @return empty where the camera has gone meanwhile
std::optional<VCamera> QueryCamera(VClient& client, std::uint32_t number)
{
    VCamera camera{number, false, {}};
    bool isPresent = false;
    for (const VSettingName& setting : SettingNames) {
        const VCommandReply reply = client.ExecuteCommand(
            setting.Command, {{"Param_CameraDeviceId", std::to_string(number)}});
        if (reply.Ok) {
            camera.Settings.push_back(
                {setting.Name, ControlStream::GetValue(reply.Parameters, setting.Parameter)});
        } else if (reply.Result != NoSuchSetting) {
            camera.Settings.push_back({setting.Name, std::nullopt});
        }
        isPresent = isPresent || reply.Result != NoAccess;
    }
    return isPresent ? std::optional<VCamera>(camera) : std::nullopt;
}

VJson ToJson(const VCamera& camera)
{
    VJson object = {{"id", camera.Number}, {"selected", camera.Selected}};
    for (const VSetting& setting : camera.Settings) {
        object[setting.Name] = setting.Value ? VJson(*setting.Value) : VJson();
    }
    return object;
}

std::string ToLine(const VCamera& camera)
{
    std::string line = "Camera " + std::to_string(camera.Number) + ":";
    for (const VSetting& setting : camera.Settings) {
        line += std::string(" ") + setting.Name + "=" +
                (setting.Value ? WordForTerminal(*setting.Value) : "?");
    }
    return line + (camera.Selected ? " (selected)" : "");
}

class VCommandCameras : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        CLI::App* command = program.add_subcommand("cameras", "List the host's cameras");
        command->footer("Shows the settings that each camera has. A \"?\", or null with --json, is "
                        "one that the "
                        "host does not tell, as every greyscale mode that is in order.");
        return command;
    }

    EExitCode Run(VSession& session) override
    {
        VClient& client = session.Connect();
        const auto numbers = QueryNumbers(client, "Host.Information", "Cameras");
        const auto selected =
            QueryNumbers(client, "CameraSettings_GetSelection", "Param_CameraSelection");

        for (const std::uint32_t number : numbers) {
            if (std::optional<VCamera> camera = QueryCamera(client, number)) {
                camera->Selected =
                    std::find(selected.begin(), selected.end(), number) != selected.end();
                Print(session.Output(), *camera);
            }
        }
        return EExitCode::Done;
    }

private:
    static void Print(VOutput& output, const VCamera& camera)
    {
        if (output.IsJson()) {
            output.PrintJson(ToJson(camera));
        } else {
            output.PrintLine(ToLine(camera));
        }
    }
};

} // namespace

std::unique_ptr<ICommand> MakeCommandCameras()
{
    return std::make_unique<VCommandCameras>();
}
