#include "Measurements.h"

#include "ClosedLoop.h"
#include "Comparison.h"
#include "DeviceConnection.h"

#include <stdexcept>

namespace ControlStreamBenchmark {

namespace {

constexpr std::size_t deviceCount = 64;

} // namespace

nlohmann::ordered_json MeasureConnections(const VSettings& settings, const IServer& host,
                                          const IServer& limit, const std::string& reply)
{
    VClosedLoop hostLoop(host, deviceCount, ExecuteCommandFrame(), reply);
    VClosedLoop limitLoop(limit, deviceCount, ExecuteCommandFrame(), reply);
    nlohmann::ordered_json result;
    for (const VPlacement& placement : RatePlacements(settings)) {
        PinThisThread(placement.ClientCore);
        PinProcess(host.Process(), placement.ServerCore);
        PinProcess(limit.Process(), placement.ServerCore);
        const bool spin = !placement.IsShared();
        result[placement.Name()] = Compare(
            settings.Rounds, {{"requests_per_second", 0.6, false}},
            [&] { return hostLoop.Sample(settings.Seconds, spin); },
            [&] { return limitLoop.Sample(settings.Seconds, spin); });
    }
    return result;
}

nlohmann::ordered_json MeasureCameraRead(const VSettings& settings, const IServer& host,
                                         const std::string& echoReply)
{
    const std::string cameraReply = VDeviceConnection(host.Port()).Ask(ReadStrobeFrame());
    if (cameraReply.find("<Result>OK</Result>") == std::string::npos) {
        throw std::runtime_error("the host's camera 1 cannot be read: " + cameraReply);
    }
    VClosedLoop cameraLoop(host, deviceCount, ReadStrobeFrame(), cameraReply);
    VClosedLoop echoLoop(host, deviceCount, ExecuteCommandFrame(), echoReply);
    nlohmann::ordered_json result;
    for (const VPlacement& placement : RatePlacements(settings)) {
        PinThisThread(placement.ClientCore);
        PinProcess(host.Process(), placement.ServerCore);
        const bool spin = !placement.IsShared();
        result[placement.Name()] = Compare(
            settings.Rounds, {{"requests_per_second", 0.9, false}},
            [&] { return cameraLoop.Sample(settings.Seconds, spin); },
            [&] { return echoLoop.Sample(settings.Seconds, spin); }, {"camera_read", "echo"});
    }
    return result;
}

} // namespace ControlStreamBenchmark
