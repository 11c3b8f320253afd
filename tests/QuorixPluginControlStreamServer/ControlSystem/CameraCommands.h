#pragma once

#include "QuorixDataStoreTypes/GreyscaleMode.h"
#include "QuorixPluginControlStreamServer/ControlSystem/CommandProviderCameraSettings.h"
#include "io/Values.h"
#include "support/FakeCameras.h"
#include "support/LogCapture.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <memory>
#include <string>
#include <utility>
#include <vector>

using Parameters = std::vector<std::pair<std::wstring, std::wstring>>;

/// A provider on two fake sources: camera 7 with all settings, camera 8 with none, the system
/// device.
class CameraCommands : public testing::Test
{
protected:
    CameraCommands()
    {
        VFakeDevice& camera = settings->Add("Device", "qx:7");
        camera.Add("StrobeIntensity", MakeDoubleValue(0.5));
        camera.Add("Threshold", MakeDoubleValue(0.25));
        camera.Add("ShutterDuration", MakeDoubleValue(0.01));
        camera.Add("GreyscaleMode", MakeEnumValue(GreyscaleModeSchema(), 2));
        settings->Add("Device", "qx:8");
        settings->Add("System", "Gen6System").Add("EnableTapToSelect", MakeBoolValue(false));
    }

    using VFakeDevice = TestSupport::VFakeDevice;
    using VFakeParameter = TestSupport::VFakeParameter;

    std::int32_t Run(const std::wstring& name, const Parameters& input)
    {
        ControlSystem::IParameters parameters;
        for (const auto& [parameter, value] : input) {
            parameters.Set(parameter, value);
        }
        reply = ControlSystem::IParameters();
        return provider.ExecuteCommand(name, parameters, reply).Code;
    }

    Parameters Reply() const { return {reply.begin(), reply.end()}; }

    VFakeParameter& Camera(const std::string& parameter)
    {
        return *settings->Devices[{"Device", "qx:7"}]->Parameters[parameter];
    }

    VFakeParameter& Tap()
    {
        return *settings->Devices[{"System", "Gen6System"}]->Parameters["EnableTapToSelect"];
    }

    std::vector<std::string> Logged() const { return log.Texts("CommandProviderCameraSettings"); }

    std::shared_ptr<TestSupport::VFakeCameraSettings> settings =
        std::make_shared<TestSupport::VFakeCameraSettings>();
    std::shared_ptr<TestSupport::VFakeCameraSelection> selection =
        std::make_shared<TestSupport::VFakeCameraSelection>();
    VCommandProviderCameraSettings provider{selection, settings};
    TestSupport::VLogLevel level{"CommandProviderCameraSettings", 6};
    TestSupport::VLogCapture log;
    ControlSystem::IParameters reply;
};
