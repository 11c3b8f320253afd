#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/ICommandProvider.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

class ICameraSelectionSource;
class ICameraSettingsSource;
class IDevice;
class IParameter;

/// The commands by which a device reads and sets cameras: a thin translation between text and the
/// typed parameters of the host's devices.
///
/// Owns: shared references to the two sources, either of which may be empty; nothing else is kept
/// from one command to the next. Threads: every operation [any], also several at once; the values
/// are serialised by the host. Failure: a result code, and a line at level 6 of the log category of
/// the same name. Ranges are not tested here: what is kept depends wholly on the host's SetValue.
class VCommandProviderCameraSettings : public ControlSystem::ICommandProvider
{
public:
    VCommandProviderCameraSettings(std::shared_ptr<ICameraSelectionSource> cameraSelection,
                                   std::shared_ptr<ICameraSettingsSource> cameraSettings);

    void GetCommandNames(std::vector<std::wstring>& names) override;

    /// Deliberate: the asked-for name is copied into the record also where the command is unknown;
    /// only the description then says so.
    ControlSystem::ICommandInformation GetCommandInformation(const std::wstring& name) override;

    ControlSystem::IResult ExecuteCommand(const std::wstring& name,
                                          const ControlSystem::IParameters& input,
                                          ControlSystem::IParameters& reply) override;

private:
    struct VCommand;
    struct VNumberSetting;
    using Handler = std::int32_t (VCommandProviderCameraSettings::*)(
        const ControlSystem::IParameters& input, ControlSystem::IParameters& reply) const;

    static const std::vector<VCommand>& Commands();
    static const VNumberSetting strobeIntensity;
    static const VNumberSetting threshold;
    static const VNumberSetting shutterDuration;

    std::int32_t SwitchStrobes(const ControlSystem::IParameters& input,
                               ControlSystem::IParameters& reply) const;
    template <const VNumberSetting& setting>
    std::int32_t GetNumber(const ControlSystem::IParameters& input,
                           ControlSystem::IParameters& reply) const;
    template <const VNumberSetting& setting>
    std::int32_t SetNumber(const ControlSystem::IParameters& input,
                           ControlSystem::IParameters& reply) const;
    std::int32_t GetGreyscaleMode(const ControlSystem::IParameters& input,
                                  ControlSystem::IParameters& reply) const;
    std::int32_t SetGreyscaleMode(const ControlSystem::IParameters& input,
                                  ControlSystem::IParameters& reply) const;
    std::int32_t GetSelection(const ControlSystem::IParameters& input,
                              ControlSystem::IParameters& reply) const;
    std::int32_t SetSelection(const ControlSystem::IParameters& input,
                              ControlSystem::IParameters& reply) const;
    std::int32_t ToggleTap(const ControlSystem::IParameters& input,
                           ControlSystem::IParameters& reply) const;
    std::int32_t GetTapEnabled(const ControlSystem::IParameters& input,
                               ControlSystem::IParameters& reply) const;

    std::shared_ptr<IDevice> FindCamera(const ControlSystem::IParameters& input) const;
    std::shared_ptr<IDevice> FindSystem() const;

    const std::shared_ptr<ICameraSelectionSource> selectionSource;
    const std::shared_ptr<ICameraSettingsSource> settingsSource;
};
