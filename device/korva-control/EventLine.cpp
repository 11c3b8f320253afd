#include "korva-control/EventLine.h"

#include "korva-control/TerminalText.h"

#include <cstdio>
#include <ctime>

std::string EventLine(const ControlStream::VEvent& event)
{
    std::string line = ForTerminal(event.Name);
    for (const ControlStream::VParameter& parameter : event.Parameters) {
        line += " " + ForTerminal(parameter.Name) + "=" + WordForTerminal(parameter.Value);
    }
    return line;
}

bool IsAboutCamera(const ControlStream::VEvent& event, std::uint32_t camera)
{
    const std::string number = std::to_string(camera);
    const std::string selected =
        "," + ControlStream::GetValue(event.Parameters, "SelectedCameraIds") + ",";
    return ControlStream::GetValue(event.Parameters, "CameraId") == number ||
           selected.find("," + number + ",") != std::string::npos;
}

std::string TimeStamp(std::chrono::system_clock::time_point moment)
{
    const auto milliseconds =
        std::chrono::floor<std::chrono::milliseconds>(moment).time_since_epoch().count();
    const auto seconds =
        static_cast<std::time_t>((milliseconds - (milliseconds % 1000 + 1000) % 1000) / 1000);
    std::tm parts{};
    gmtime_r(&seconds, &parts);
    char text[64];
    std::snprintf(text, sizeof text, "%04d-%02d-%02dT%02d:%02d:%02d.%03dZ", parts.tm_year + 1900,
                  parts.tm_mon + 1, parts.tm_mday, parts.tm_hour, parts.tm_min, parts.tm_sec,
                  static_cast<int>((milliseconds % 1000 + 1000) % 1000));
    return text;
}
