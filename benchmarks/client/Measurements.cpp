#include "client/Measurements.h"

#include "ControlStreamClient/AsyncClient.h"
#include "ControlStreamClient/Client.h"
#include "control_stream/DeviceConnection.h"
#include "control_stream/Statistics.h"

#include <algorithm>
#include <ctime>
#include <functional>
#include <stdexcept>
#include <vector>

#include <sys/socket.h>

namespace ClientBenchmark {

namespace {

using ControlStreamBenchmark::Median;
using ControlStreamBenchmark::NowNanoseconds;
using namespace ControlStream;

const VCall measuredCall{"Host.Echo", {{"Greeting", "Hello, stage"}, {"Answer", "ready"}}};

void Require(const VCommandReply& reply)
{
    if (!reply.Ok || GetValue(reply.Parameters, "Greeting") != "Hello, stage") {
        throw std::runtime_error("a wrong reply: " + reply.Result);
    }
}

std::int64_t ThreadNanoseconds()
{
    timespec time{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &time);
    return time.tv_sec * std::int64_t(1000000000) + time.tv_nsec;
}

/// @return what the function took on a clock
double Took(const std::function<void()>& function, std::int64_t (*clock)())
{
    const std::int64_t start = clock();
    function();
    return static_cast<double>(clock() - start);
}

void RunOneAtATime(VClient& client, int requests)
{
    for (int i = 0; i < requests; ++i) {
        Require(client.ExecuteCommand(measuredCall.Name, measuredCall.Parameters));
    }
}

void RunBatch(VClient& client, const std::vector<VCall>& calls)
{
    for (const auto& outcome : client.ExecuteBatch(calls)) {
        Require(outcome.Get());
    }
}

void RunAsynchronously(VAsyncClient& client, int requests)
{
    std::vector<std::future<VCommandReply>> replies;
    replies.reserve(static_cast<std::size_t>(requests));
    for (int i = 0; i < requests; ++i) {
        replies.push_back(client.ExecuteCommand(measuredCall.Name, measuredCall.Parameters));
    }
    for (auto& reply : replies) {
        Require(reply.get());
    }
}

VJson Summary(std::vector<double> perRequest, double unit)
{
    for (double& value : perRequest) {
        value /= unit;
    }
    VJson summary = {{"median", Median(perRequest)}};
    summary["least"] = *std::min_element(perRequest.begin(), perRequest.end());
    summary["greatest"] = *std::max_element(perRequest.begin(), perRequest.end());
    return summary;
}

std::vector<double> Ratios(const std::vector<double>& slow, const std::vector<double>& fast)
{
    std::vector<double> ratios;
    for (std::size_t i = 0; i < slow.size(); ++i) {
        ratios.push_back(slow[i] / fast[i]);
    }
    return ratios;
}

/// The least that any client does for a round trip: one call to send, as many to receive as it
/// takes for the whole reply.
void RunBare(int socket, int requests, const std::string& frame, std::size_t replySize)
{
    std::vector<char> reply(replySize);
    for (int i = 0; i < requests; ++i) {
        if (send(socket, frame.data(), frame.size(), MSG_NOSIGNAL) !=
            static_cast<ssize_t>(frame.size())) {
            throw std::runtime_error("the bare loop cannot send");
        }
        for (std::size_t got = 0; got < replySize;) {
            const ssize_t count = recv(socket, reply.data() + got, replySize - got, 0);
            if (count <= 0) {
                throw std::runtime_error("the bare loop gets no reply");
            }
            got += static_cast<std::size_t>(count);
        }
    }
}

} // namespace

VJson MeasureBatch(const VSettings& settings)
{
    VClient client;
    client.Connect("127.0.0.1", settings.Port);
    VAsyncOptions options;
    options.Port = settings.Port;
    options.TimeLimit = std::chrono::minutes(5);
    VAsyncClient asyncClient(options);
    const std::vector<VCall> calls(static_cast<std::size_t>(settings.Requests), measuredCall);

    std::vector<double> single, batch, async;
    RunBatch(client, calls); // warms up, and does not count
    RunAsynchronously(asyncClient, settings.Requests);
    for (int round = 0; round < settings.Rounds; ++round) {
        single.push_back(Took([&] { RunOneAtATime(client, settings.Requests); }, &NowNanoseconds));
        batch.push_back(Took([&] { RunBatch(client, calls); }, &NowNanoseconds));
        async.push_back(
            Took([&] { RunAsynchronously(asyncClient, settings.Requests); }, &NowNanoseconds));
    }
    const double unit = 1000.0 * settings.Requests;
    return {{"requests", settings.Requests},
            {"one_at_a_time_us", Summary(single, unit)},
            {"batch_us", Summary(batch, unit)},
            {"asynchronous_us", Summary(async, unit)},
            {"batch_ratio", Summary(Ratios(single, batch), 1.0)},
            {"asynchronous_ratio", Summary(Ratios(single, async), 1.0)},
            {"aim", "batch_ratio at least 3"}};
}

VJson MeasureProcessorTime(const VSettings& settings)
{
    VClient client;
    client.Connect("127.0.0.1", settings.Port);
    ControlStreamBenchmark::VDeviceConnection bare(settings.Port);
    const std::string frame = ControlStreamBenchmark::ExecuteCommandFrame();
    const std::size_t replySize = bare.Ask(frame).size();

    std::vector<double> through, alone, added;
    for (int round = 0; round < settings.Rounds; ++round) {
        through.push_back(
            Took([&] { RunOneAtATime(client, settings.Requests); }, &ThreadNanoseconds));
        alone.push_back(Took([&] { RunBare(bare.Socket(), settings.Requests, frame, replySize); },
                             &ThreadNanoseconds));
        added.push_back(through.back() - alone.back());
    }
    const double unit = 1000.0 * settings.Requests;
    return {{"requests", settings.Requests},
            {"client_us", Summary(through, unit)},
            {"bare_loop_us", Summary(alone, unit)},
            {"added_us", Summary(added, unit)},
            {"aim", "added_us under 10"}};
}

} // namespace ClientBenchmark
