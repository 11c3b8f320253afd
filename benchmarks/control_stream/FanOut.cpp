#include "Measurements.h"

#include "Comparison.h"
#include "DeviceConnection.h"
#include "Listeners.h"
#include "Usage.h"

#include <algorithm>
#include <array>
#include <memory>

namespace ControlStreamBenchmark {

namespace {

constexpr std::array<std::size_t, 3> listenerCounts{16, 64, 256};
constexpr std::size_t firstBatch = 20;
constexpr int singleEvents = 100;

/// @return how many events take about `seconds`, by a first batch
std::size_t CountFor(double seconds, IEventServer& server, VListeners& listeners, bool spin)
{
    server.Fire(firstBatch);
    const VReception reception = listeners.Receive(firstBatch, spin);
    server.AwaitFired();
    const double perEvent = std::max(reception.Seconds() / firstBatch, 1e-6);
    const auto count = static_cast<std::size_t>(seconds / perEvent);
    return std::clamp(count, firstBatch, server.MaximalCount());
}

void AddBatch(VFigures& figures, std::size_t events, IEventServer& server, VListeners& listeners,
              bool spin)
{
    const VUsage usage(server.Process());
    server.Fire(events);
    const VReception reception = listeners.Receive(events, spin);
    const std::size_t deliveries = events * listeners.Count();
    const VFigures usageFigures = usage.Figures(deliveries, "delivery");
    server.AwaitFired();

    // The clock starts with the first delivery, which is therefore not counted.
    const double rate = static_cast<double>(deliveries - 1) / reception.Seconds();
    figures.emplace_back("deliveries_per_second", rate);
    figures.emplace_back("us_per_event", 1e6 * static_cast<double>(listeners.Count()) / rate);
    figures.insert(figures.end(), usageFigures.begin(), usageFigures.end());
}

void AddSingleEvents(VFigures& figures, IEventServer& server, VListeners& listeners, bool spin)
{
    std::vector<double> spreads;
    std::vector<std::uint32_t> nanoseconds;
    for (int event = 0; event < singleEvents; ++event) {
        const std::int64_t ordered = NowNanoseconds();
        server.Fire(1);
        const VReception reception = listeners.Receive(1, spin);
        server.AwaitFired();
        spreads.push_back(reception.Seconds());
        nanoseconds.push_back(static_cast<std::uint32_t>(reception.Last - ordered));
    }

    const double spread = std::max(Median(spreads), 1e-9);
    figures.emplace_back("single_event_deliveries_per_second",
                         static_cast<double>(listeners.Count() - 1) / spread);
    AddPercentiles(figures, nanoseconds);
}

nlohmann::ordered_json MeasurePlacement(const VSettings& settings, const VPlacement& placement,
                                        IEventServer& host, VListeners& hostListeners,
                                        IEventServer& limit, VListeners& limitListeners)
{
    const bool spin = !placement.IsShared();
    PinThisThread(placement.ClientCore);
    PinProcess(host.Process(), placement.ServerCore);
    PinProcess(limit.Process(), placement.ServerCore);
    const std::size_t events = CountFor(settings.Seconds, host, hostListeners, spin);
    const auto sample = [&](IEventServer& server, VListeners& listeners) {
        VFigures figures;
        AddBatch(figures, events, server, listeners, spin);
        AddSingleEvents(figures, server, listeners, spin);
        return figures;
    };

    return Compare(
        settings.Rounds, {{"deliveries_per_second", 0.8, false}},
        [&] { return sample(host, hostListeners); }, [&] { return sample(limit, limitListeners); });
}

/// What the host does for an event but sending it: it reads a line, builds the message, and
/// answers.
double EventMicrosecondsWithoutListeners(const VSettings& settings, IEventServer& host)
{
    constexpr std::size_t events = 5000;
    PinThisThread(settings.OwnCores.ClientCore);
    PinProcess(host.Process(), settings.OwnCores.ServerCore);
    std::vector<double> microseconds;
    for (int round = 0; round < settings.Rounds; ++round) {
        const std::size_t count = std::min(events, host.MaximalCount());
        const std::int64_t begin = NowNanoseconds();
        host.Fire(count);
        host.AwaitFired();
        microseconds.push_back(static_cast<double>(NowNanoseconds() - begin) / 1000 /
                               static_cast<double>(count));
    }
    return Median(microseconds);
}

/// @return the bytes of the event that the host fires, as a device gets them
std::string LearnEvent(IEventServer& host)
{
    VDeviceConnection device(host.Port());
    device.Ask(ServerInformationFrame()); // once it is answered the host knows this device
    host.Fire(1);
    std::string event = device.ReadFrame();
    host.AwaitFired();
    return event;
}

} // namespace

nlohmann::ordered_json MeasureFanOut(const VSettings& settings, IEventServer* host)
{
    nlohmann::ordered_json result;
    if (host != nullptr) {
        result["us_per_event_without_listeners"] =
            EventMicrosecondsWithoutListeners(settings, *host);
    }
    const std::string event = host != nullptr ? LearnEvent(*host) : ExecuteCommandFrame();
    for (const std::size_t count : listenerCounts) {
        VLimitProcess limit = VLimitProcess::FanOut(count, event);
        VListeners limitListeners(limit.Port(), count, event);
        std::unique_ptr<VLimitProcess> secondLimit;
        if (host == nullptr) {
            secondLimit = std::make_unique<VLimitProcess>(VLimitProcess::FanOut(count, event));
        }
        IEventServer& server = host != nullptr ? *host : *secondLimit;
        VListeners listeners(server.Port(), count, event);
        if (host != nullptr) {
            listeners.Introduce();
        }
        for (const VPlacement& placement : RatePlacements(settings)) {
            result[std::to_string(count) + "_listeners"][placement.Name()] =
                MeasurePlacement(settings, placement, server, listeners, limit, limitListeners);
        }
    }
    return result;
}

} // namespace ControlStreamBenchmark
