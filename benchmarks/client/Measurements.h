#pragma once

#include <nlohmann/json.hpp>

#include <cstdint>

namespace ClientBenchmark {

using VJson = nlohmann::ordered_json;

struct VSettings
{
    std::uint16_t Port = 803;
    int Rounds = 9;
    int Requests = 10000;
};

/// So many requests one at a time, beside the same as one batch and through the asynchronous
/// client, in turn. Throws std::runtime_error on a wrong reply.
VJson MeasureBatch(const VSettings& settings);

/// The processor time of the thread that asks, for one round trip through the client, beside a
/// bare loop that sends the same bytes and takes whatever comes for the reply.
VJson MeasureProcessorTime(const VSettings& settings);

} // namespace ClientBenchmark
