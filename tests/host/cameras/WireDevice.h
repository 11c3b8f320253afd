#pragma once

#include "host/RunningHost.h"

#include <deque>
#include <string>
#include <utility>
#include <vector>

namespace CameraTest {

using TestSupport::declaration;

/// Parameters in the order in which they stand in a message.
using Parameters = std::vector<std::pair<std::string, std::string>>;

/// The text of parameters as messages hold them, for values that need no entities.
inline std::string ParametersText(const Parameters& parameters)
{
    if (parameters.empty()) {
        return "<Parameters/>";
    }
    std::string text = "<Parameters>";
    for (const auto& [name, value] : parameters) {
        text += "<Parameter><Name>" + name + "</Name>";
        text += value.empty() ? "<Value/>" : "<Value>" + value + "</Value>";
        text += "</Parameter>";
    }
    return text + "</Parameters>";
}

/// The reply to `VWireDevice::Run`.
inline std::string Reply(const std::string& command, const std::string& result,
                         const Parameters& parameters = {})
{
    return declaration + "<CommandReply><Name>" + command +
           "</Name><Correlation>7</Correlation><Result>" + result + "</Result>" +
           ParametersText(parameters) + "</CommandReply>";
}

inline std::string Event(const std::string& name, const Parameters& parameters)
{
    return declaration + "<Event><Name>" + name + "</Name>" + ParametersText(parameters) +
           "</Event>";
}

inline std::string SettingChanged(const std::string& camera, const std::string& setting,
                                  const std::string& value)
{
    return Event("Event.Cameras.SettingChanged",
                 {{"CameraId", camera}, {"SettingName", setting}, {"SettingValue", value}});
}

/// A device that keeps the events which come between the replies. Threads: one at a time.
class VWireDevice
{
public:
    /// @param receiveBuffer  as of VRawClient
    explicit VWireDevice(int receiveBuffer = 0) : client(TestSupport::Connect(receiveBuffer))
    {
        client.Request("<ServerInformation/>"); // the host has it on its list
    }

    /// Runs a command. @return the reply's whole text
    std::string Run(const std::string& command, const Parameters& parameters = {})
    {
        client.SendFrame("<ExecuteCommand><Name>" + command +
                         "</Name><Correlation>7</Correlation>" + ParametersText(parameters) +
                         "</ExecuteCommand>");
        for (;;) {
            std::string text = client.ReadFrame();
            if (text.compare(0, declaration.size() + 7, declaration + "<Event>") != 0) {
                return text;
            }
            events.push_back(std::move(text));
        }
    }

    /// Returns the whole text of the next event, waiting for it where none is kept.
    std::string NextEvent()
    {
        if (events.empty()) {
            return client.ReadFrame();
        }
        std::string text = std::move(events.front());
        events.pop_front();
        return text;
    }

    TestSupport::VRawClient client;

private:
    std::deque<std::string> events;
};

} // namespace CameraTest
