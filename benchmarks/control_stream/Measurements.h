#pragma once

#include "LimitProcess.h"
#include "Processes.h"

#include <nlohmann/json.hpp>

#include <string>
#include <vector>

namespace ControlStreamBenchmark {

/// How long and where to measure.
struct VSettings
{
    double Seconds = 1; // of one sample
    int Rounds = 5;
    ELimit Limit = ELimit::Asio;
    VPlacement SharedCore{};
    VPlacement OwnCores{}; // the same as SharedCore where only one core may be used
};

/// @return the placements that a rate is measured with
std::vector<VPlacement> RatePlacements(const VSettings& settings);

/// One device on the server's core that sends its next request once it has the reply to the last:
/// the time of one request, and what it costs the server.
nlohmann::ordered_json MeasureLatency(const VSettings& settings, const IServer& host,
                                      const IServer& limit, const std::string& reply);

/// The same device with and without immediate acknowledgements, against the host alone. A server
/// that writes header and text apart loses the delay of an acknowledgement with each reply; then
/// the two differ a thousandfold.
nlohmann::ordered_json MeasureQuickAcknowledgement(const VSettings& settings, const IServer& host,
                                                   const std::string& reply);

/// 64 devices, each of which sends its next request once it has the reply to the last.
nlohmann::ordered_json MeasureConnections(const VSettings& settings, const IServer& host,
                                          const IServer& limit, const std::string& reply);

/// 64 devices that read a camera's setting beside 64 that run the command which echoes, in turn and
/// against the host alone.
///
/// @param echoReply  the host's reply to the latter
nlohmann::ordered_json MeasureCameraRead(const VSettings& settings, const IServer& host,
                                         const std::string& echoReply);

/// 16 devices that connect, ask once and close, over and over.
nlohmann::ordered_json MeasureChurn(const VSettings& settings, const IServer& host,
                                    const IServer& limit, const std::string& reply);

/// Events to 16, 64 and 256 listeners.
///
/// @param host  null to measure the limit against itself
nlohmann::ordered_json MeasureFanOut(const VSettings& settings, IEventServer* host);

/// What a connection and a request cost the host's memory.
///
/// @param program  the host's; hosts of this measurement's own are run, one of them counted
/// @param counter  the preloaded library that counts; empty to leave out what it tells
nlohmann::ordered_json MeasureMemory(const std::string& program, const std::string& counter);

} // namespace ControlStreamBenchmark
