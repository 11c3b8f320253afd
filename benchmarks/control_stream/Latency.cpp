#include "Measurements.h"

#include "Comparison.h"
#include "DeviceConnection.h"
#include "Usage.h"

#include <cstdint>

namespace ControlStreamBenchmark {

namespace {

enum class EAcknowledgement { Default, Quick, Delayed };

/// One device and the server that answers it.
struct VPeer
{
    VPeer(const IServer& server, int core) : Process(server.Process()), Device(server.Port())
    {
        PinProcess(Process, core);
    }

    pid_t Process;
    VDeviceConnection Device;
};

VFigures Sample(VPeer& peer, const std::string& reply, double seconds,
                EAcknowledgement acknowledgement)
{
    const std::string request = ExecuteCommandFrame();
    std::vector<std::uint32_t> nanoseconds;
    const VUsage usage(peer.Process);
    const std::int64_t end = NowNanoseconds() + static_cast<std::int64_t>(seconds * 1e9);
    for (std::int64_t begin = 0; begin < end;) {
        begin = NowNanoseconds();
        if (acknowledgement != EAcknowledgement::Default) {
            peer.Device.SetQuickAcknowledgement(acknowledgement == EAcknowledgement::Quick);
        }
        peer.Device.Exchange(request, reply);
        nanoseconds.push_back(static_cast<std::uint32_t>(NowNanoseconds() - begin));
    }

    const std::size_t requests = nanoseconds.size();
    VFigures figures = usage.Figures(requests, "request");
    figures.emplace_back("requests_per_second", static_cast<double>(requests) / usage.Seconds());
    AddPercentiles(figures, nanoseconds);
    return figures;
}

} // namespace

nlohmann::ordered_json MeasureLatency(const VSettings& settings, const IServer& host,
                                      const IServer& limit, const std::string& reply)
{
    PinThisThread(settings.SharedCore.ClientCore);
    VPeer hostPeer(host, settings.SharedCore.ServerCore);
    VPeer limitPeer(limit, settings.SharedCore.ServerCore);
    const auto sample = [&](VPeer& peer) {
        return Sample(peer, reply, settings.Seconds, EAcknowledgement::Default);
    };

    return Compare(
        settings.Rounds, {{"p50_us", 1.25, true}, {"server_cpu_us_per_request", 1.3, true}},
        [&] { return sample(hostPeer); }, [&] { return sample(limitPeer); });
}

nlohmann::ordered_json MeasureQuickAcknowledgement(const VSettings& settings, const IServer& host,
                                                   const std::string& reply)
{
    PinThisThread(settings.SharedCore.ClientCore);
    VPeer peer(host, settings.SharedCore.ServerCore);
    const auto sample = [&](EAcknowledgement acknowledgement) {
        return Sample(peer, reply, settings.Seconds, acknowledgement);
    };

    // Both sides set the option, since the call itself takes time.
    return Compare(
        settings.Rounds, {{"p50_us", 1.2, true}}, [&] { return sample(EAcknowledgement::Delayed); },
        [&] { return sample(EAcknowledgement::Quick); },
        {"delayed_acknowledgement", "quick_acknowledgement"});
}

} // namespace ControlStreamBenchmark
