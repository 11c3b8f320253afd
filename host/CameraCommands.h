#pragma once

#include <memory>

class VDataStore;

namespace QuorixHost {

class VCameraHardware;
class VCameraSelection;
class VConsole;
class VSimulatedCameras;

/// What the console's commands about cameras work on.
struct VCameraServices
{
    std::shared_ptr<VDataStore> store;
    std::shared_ptr<VCameraHardware> hardware;
    std::shared_ptr<VSimulatedCameras> cameras;
    std::shared_ptr<VCameraSelection> selection;
};

/// Adds what the host's user does to devices, as if by hand:
///
/// - `set CLASS ID PARAMETER VALUE` asks for a value, given as the text that `get` shows
/// - `get CLASS ID PARAMETER` answers with the text of the value that was asked for last
/// - `mode N NUMBER` asks camera N for a greyscale mode by its number, also one that there is not
/// - `select [N,N,...]` replaces the camera selection
/// - `notify CLASS ID PARAMETER COUNT` fires the parameter's changed notification COUNT times
/// - `add N`, `remove N`: a camera appears, or goes
/// - `locks` tells who holds and who waits for the store
void AddCameraCommands(VConsole& console, const VCameraServices& services);

/// Adds cameras, selection, tap-to-select, and the devices that the store knows as controlling, to
/// what `state` tells.
void AddCameraState(VConsole& console, const VCameraServices& services);

} // namespace QuorixHost
