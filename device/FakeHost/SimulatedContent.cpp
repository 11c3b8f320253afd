#include "FakeHost/SimulatedContent.h"

#include "ControlSystem.h"
#include "HostCommandProvider.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixPluginControlStreamServer/ControlSystem/CommandProviderAuthorization.h"
#include "QuorixPluginControlStreamServer/ControlSystem/CommandProviderCameraSettings.h"
#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderAuthorized.h"
#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderCameraSelection.h"
#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderCameraSettings.h"
#include "cameras/CameraHardware.h"
#include "cameras/CameraSelection.h"
#include "cameras/SimulatedCameras.h"
#include "notification/MakeShared.h"

#include <boost/bind/bind.hpp>

namespace FakeHost {

namespace {

// How long a camera's electronics take over a setting, in milliseconds.
constexpr std::uint32_t HardwareDelay = 20;

class VSimulatedContent : public IFakeContent
{
public:
    VSimulatedContent(std::uint32_t cameraCount, const VOperatorOptions& operatorOptions)
        : hardware(KVR::MakeShared<QuorixHost::VCameraHardware>(store, HardwareDelay)),
          cameras(std::make_shared<QuorixHost::VSimulatedCameras>(store, hardware))
    {
        for (std::uint32_t number = 1; number <= cameraCount; ++number) {
            cameras->AddCamera(number);
        }
        AddProviders(std::make_shared<VFakeOperator>(operatorOptions));
        cameras->ReportDevices(); // to the providers, which came after them
    }

    /// The hardware publishes events, and so ends before the dispatcher.
    ~VSimulatedContent() override
    {
        VSimulatedContent::SayFarewell();
        hardware->Stop();
    }

    VSimulatedContent(const VSimulatedContent&) = delete;
    VSimulatedContent& operator=(const VSimulatedContent&) = delete;

    std::shared_ptr<IControlSystem> ControlSystem() override { return dispatcher; }

    void OnDevice() override {}

    /// The operator goes with the last provider that knows it, and tells of that.
    void SayFarewell() override
    {
        if (asked) {
            asked->EndThinking();
            asked.reset();
        }
        dispatcher->RemoveEventProvider(outcomes);
        outcomes.reset();
        dispatcher->RemoveCommandProvider(requests);
        requests.reset();
    }

private:
    /// In the order in which the plug-in adds its own, behind the host's.
    void AddProviders(const std::shared_ptr<VFakeOperator>& fakeOperator)
    {
        asked = fakeOperator;
        IControlSystem* const target = dispatcher.get();
        requests = std::make_shared<VCommandProviderAuthorization>(fakeOperator);
        outcomes = std::make_shared<VEventProviderAuthorized>(dispatcher, fakeOperator);
        dispatcher->AddCommandProvider(std::make_shared<QuorixHost::VHostCommandProvider>(
            boost::bind(&QuorixHost::VSimulatedCameras::CameraNumbers, cameras)));
        dispatcher->AddCommandProvider(requests);
        dispatcher->AddCommandProvider(
            std::make_shared<VCommandProviderCameraSettings>(selection, cameras));
        dispatcher->AddEventProvider(outcomes);
        dispatcher->AddEventProvider(
            KVR::MakeShared<VEventProviderCameraSelection>(target, selection));
        dispatcher->AddEventProvider(
            KVR::MakeShared<VEventProviderCameraSettings>(target, cameras));
    }

    const std::shared_ptr<VDataStore> store = std::make_shared<VDataStore>();
    const std::shared_ptr<QuorixHost::VCameraHardware> hardware;
    const std::shared_ptr<QuorixHost::VSimulatedCameras> cameras;
    const std::shared_ptr<QuorixHost::VCameraSelection> selection =
        std::make_shared<QuorixHost::VCameraSelection>();
    const std::shared_ptr<QuorixHost::VControlSystem> dispatcher =
        std::make_shared<QuorixHost::VControlSystem>();
    std::shared_ptr<VFakeOperator> asked;
    std::shared_ptr<VCommandProviderAuthorization> requests;
    std::shared_ptr<VEventProviderAuthorized> outcomes;
};

} // namespace

std::unique_ptr<IFakeContent> MakeSimulatedContent(std::uint32_t cameras,
                                                   const VOperatorOptions& operatorOptions)
{
    return std::make_unique<VSimulatedContent>(cameras, operatorOptions);
}

} // namespace FakeHost
