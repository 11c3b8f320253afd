#pragma once

#include "QuorixPluginInterface/IHost.h"
#include "QuorixPluginInterface/IPlugin.h"
#include "QuorixPluginInterface/IQuorixGUI.h"
#include "support/FakeCameras.h"
#include "support/FakeControlSystem.h"
#include "support/RawClient.h"

#include <gtest/gtest.h>

#include <chrono>
#include <cstdint>
#include <cstring>
#include <dlfcn.h>
#include <memory>
#include <stdexcept>
#include <string>
#include <system_error>
#include <thread>
#include <utility>
#include <vector>

// The plug-in as a host meets it: the built library, its two functions, and the real port.

namespace PluginBench {

using QuorixPluginInterface::IPlugin;
using TestSupport::VFakeControlSystem;
using TestSupport::VRawClient;

constexpr std::uint16_t port = 803;

/// What every device hears when the plug-in goes.
const std::string disconnect =
    TestSupport::Frame(R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)"
                       "<Event><Name>Event.Disconnect</Name><Parameters/></Event>");

/// The library, loaded as a host does.
class VLibrary
{
public:
    VLibrary() : handle(dlopen(QUORIX_PLUGIN_LIBRARY, RTLD_NOW | RTLD_LOCAL))
    {
        if (handle == nullptr) {
            throw std::runtime_error(dlerror());
        }
    }

    IPlugin* Create() const { return Find<IPlugin* (*)()>("CreatePlugin")(); }
    void Destroy(IPlugin* plugin) const { Find<void (*)(IPlugin*)>("DestroyPlugin")(plugin); }

    /// Closes the handle. @return whether the library is still in memory
    bool StaysWhenClosed()
    {
        dlclose(handle);
        handle = dlopen(QUORIX_PLUGIN_LIBRARY, RTLD_NOW | RTLD_LOCAL | RTLD_NOLOAD);
        return handle != nullptr;
    }

private:
    template <typename TFunction>
    TFunction Find(const char* name) const
    {
        void* const address = dlsym(handle, name);
        if (address == nullptr) {
            throw std::runtime_error(dlerror());
        }
        TFunction function = nullptr;
        std::memcpy(&function, &address, sizeof function);
        return function;
    }

    void* handle;
};

/// A host that supplies what a test gives it, and notes what it is asked for.
class VFakeHost : public QuorixPluginInterface::IHost
{
public:
    explicit VFakeHost(std::shared_ptr<IControlSystem> controlSystem)
        : controlSystem(std::move(controlSystem))
    {
    }

    std::shared_ptr<IDataStore> Store;
    std::shared_ptr<TestSupport::VFakeCameraSettings> Settings;
    std::shared_ptr<KVR::IPostalService> PostalService;
    std::shared_ptr<TestSupport::VFakeCameraSelection> Selection;
    std::vector<std::string> Asked; ///< the services, in order

    std::shared_ptr<IDataStore> GetStore() override { return Noted("Store", Store); }
    std::shared_ptr<ICameraSettingsSource> GetCameraSettingsSource() override
    {
        return Noted("CameraSettingsSource", Settings);
    }
    std::shared_ptr<KVR::IPostalService> GetPostalService() override
    {
        return Noted("PostalService", PostalService);
    }
    std::shared_ptr<ICameraSelectionSource> GetCameraSelectionSource() override
    {
        return Noted("CameraSelectionSource", Selection);
    }
    std::shared_ptr<IControlSystem> GetControlSystem() override
    {
        return Noted("ControlSystem", controlSystem);
    }

private:
    template <typename TService>
    std::shared_ptr<TService> Noted(const char* name, const std::shared_ptr<TService>& service)
    {
        Asked.emplace_back(name);
        return service;
    }

    const std::shared_ptr<IControlSystem> controlSystem;
};

class VFakeGUI : public IQuorixGUI
{
public:
    std::shared_ptr<VQuickWidgetManager> GetQuickContext() override { return nullptr; }
    std::shared_ptr<IMenuService> GetMenuService() override { return nullptr; }
    std::shared_ptr<IPanelService> GetPanelService() override { return nullptr; }
};

inline bool CanConnect()
{
    try {
        const VRawClient client(port);
        return true;
    } catch (const std::system_error&) {
        return false;
    }
}

/// Waits for what the socket's thread brings about by itself.
template <typename TCondition>
bool ComesTrue(TCondition condition)
{
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    while (!condition()) {
        if (std::chrono::steady_clock::now() > deadline) {
            return false;
        }
        std::this_thread::yield();
    }
    return true;
}

/// A plug-in object with a host whose dispatcher knows one command.
class VLoadedPlugin : public testing::Test
{
protected:
    VLoadedPlugin()
    {
        controlSystem->CommandNames = {L"Test.Echo"};
        controlSystem->Commands[L"Test.Echo"] = &VFakeControlSystem::Echo;
    }
    ~VLoadedPlugin() override { Destroy(); }

    /// Destroys the plug-in, which leaves the port before it returns.
    void Destroy()
    {
        library.Destroy(std::exchange(plugin, nullptr));
        EXPECT_FALSE(CanConnect());
    }

    VLibrary library;
    const std::shared_ptr<VFakeControlSystem> controlSystem =
        std::make_shared<VFakeControlSystem>();
    VFakeHost host{controlSystem};
    VFakeHost hostWithoutServices{nullptr};
    IPlugin* plugin = library.Create();
};

} // namespace PluginBench
