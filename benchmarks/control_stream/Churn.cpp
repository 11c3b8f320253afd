#include "Measurements.h"

#include "Comparison.h"
#include "DeviceConnection.h"
#include "Usage.h"

#include <future>

namespace ControlStreamBenchmark {

namespace {

constexpr int loopCount = 16;

/// Connects, asks once and closes until `end`. @return the time of each turn
std::vector<std::uint32_t> Loop(std::uint16_t port, const std::string& request,
                                const std::string& reply, int loop, std::int64_t end)
{
    constexpr int addressesPerLoop = 15;
    std::vector<std::uint32_t> nanoseconds;
    for (std::int64_t begin = 0; begin < end;) {
        const auto turn = static_cast<int>(nanoseconds.size());
        const int lastByte = 1 + loop * addressesPerLoop + turn % addressesPerLoop;
        begin = NowNanoseconds();
        {
            VDeviceConnection device(port, static_cast<std::uint8_t>(lastByte));
            device.Exchange(request, reply);
        }
        nanoseconds.push_back(static_cast<std::uint32_t>(NowNanoseconds() - begin));
    }
    return nanoseconds;
}

VFigures Sample(const IServer& server, const std::string& reply, double seconds)
{
    const std::string request = ExecuteCommandFrame();
    const VUsage usage(server.Process());
    const std::int64_t end = NowNanoseconds() + static_cast<std::int64_t>(seconds * 1e9);
    std::vector<std::future<std::vector<std::uint32_t>>> loops;
    loops.reserve(loopCount);
    for (int loop = 0; loop < loopCount; ++loop) {
        loops.push_back(std::async(std::launch::async, [&request, &reply, &server, loop, end] {
            return Loop(server.Port(), request, reply, loop, end);
        }));
    }
    std::vector<std::uint32_t> nanoseconds;
    for (auto& loop : loops) {
        const std::vector<std::uint32_t> turns = loop.get();
        nanoseconds.insert(nanoseconds.end(), turns.begin(), turns.end());
    }

    const std::size_t turns = nanoseconds.size();
    VFigures figures = usage.Figures(turns, "turn");
    figures.emplace_back("turns_per_second", static_cast<double>(turns) / usage.Seconds());
    AddPercentiles(figures, nanoseconds);
    return figures;
}

} // namespace

nlohmann::ordered_json MeasureChurn(const VSettings& settings, const IServer& host,
                                    const IServer& limit, const std::string& reply)
{
    nlohmann::ordered_json result;
    for (const VPlacement& placement : RatePlacements(settings)) {
        PinThisThread(placement.ClientCore);
        PinProcess(host.Process(), placement.ServerCore);
        PinProcess(limit.Process(), placement.ServerCore);
        result[placement.Name()] = Compare(
            settings.Rounds, {{"turns_per_second", 0.9, false}},
            [&] { return Sample(host, reply, settings.Seconds); },
            [&] { return Sample(limit, reply, settings.Seconds); });
    }
    return result;
}

} // namespace ControlStreamBenchmark
