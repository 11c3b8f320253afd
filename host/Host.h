#pragma once

#include "CameraCommands.h"
#include "QuorixPluginInterface/IHost.h"

#include <cstdint>
#include <memory>

namespace QuorixHost {

class VControlSystem;
class VMainThreadPostalService;

/// The services that the plug-in is given: the dispatcher, the main thread's postal service, and
/// the simulated cameras with the data store in which they live.
///
/// Owns: references to the services. Threads: [gui].
class VHost : public QuorixPluginInterface::IHost
{
public:
    /// Makes the services, and cameras numbered from 1.
    explicit VHost(std::uint32_t cameraCount);

    /// Closes.
    ~VHost() override;

    std::shared_ptr<IDataStore> GetStore() override;
    std::shared_ptr<ICameraSettingsSource> GetCameraSettingsSource() override;
    std::shared_ptr<KVR::IPostalService> GetPostalService() override;
    std::shared_ptr<ICameraSelectionSource> GetCameraSelectionSource() override;
    std::shared_ptr<IControlSystem> GetControlSystem() override;

    /// Returns the cameras, for who handles them on the user's behalf.
    const VCameraServices& Cameras() const { return cameras; }

    /// Returns the dispatcher, for who watches what runs through it.
    const std::shared_ptr<VControlSystem>& Dispatcher() const { return controlSystem; }

    /// Ends the cameras' hardware, and what is delivered on the event loop, once the loop and the
    /// plug-in have gone. A second call does nothing.
    void Close();

private:
    // None of these goes before Close has ended the hardware's thread, which publishes events.
    VCameraServices cameras;
    std::shared_ptr<VControlSystem> controlSystem;
    std::shared_ptr<VMainThreadPostalService> postalService;
};

} // namespace QuorixHost
