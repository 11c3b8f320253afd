#pragma once

#include <memory>

class ICameraSelectionSource;
class ICameraSettingsSource;
class IControlSystem;
class IDataStore;

namespace KVR {
class IPostalService;
}

namespace QuorixPluginInterface {

/// The host's services, as the plug-in fetches them in Start and InitialiseGUI.
///
/// Every operation may return an empty pointer. Threads: called on the host's own thread.
class IHost
{
public:
    virtual ~IHost() = default;

    virtual std::shared_ptr<IDataStore> GetStore() = 0;
    virtual std::shared_ptr<ICameraSettingsSource> GetCameraSettingsSource() = 0;

    /// Delivers on the host's own thread, first in, first out, and never while a delivery runs.
    virtual std::shared_ptr<KVR::IPostalService> GetPostalService() = 0;

    virtual std::shared_ptr<ICameraSelectionSource> GetCameraSelectionSource() = 0;
    virtual std::shared_ptr<IControlSystem> GetControlSystem() = 0;
};

} // namespace QuorixPluginInterface
