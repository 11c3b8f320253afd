#include "korva-control/Arguments.h"
#include "korva-control/Assignments.h"
#include "korva-control/Commands.h"
#include "korva-control/Session.h"
#include "korva-control/TerminalText.h"

#include "ControlStreamClient/Requests.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <exception>
#include <thread>

#include <CLI/CLI.hpp>

namespace {

using ControlStream::VClient;
using ControlStream::VParameters;
using Clock = std::chrono::steady_clock;

/// What one connection measured.
struct VSample
{
    std::vector<double> Microseconds; // of each request
    std::size_t Failures = 0;         // that the host reported
    std::exception_ptr Error;         // which ended it
};

/// The value below which a share of all lie, by the nearest rank.
double Percentile(const std::vector<double>& sorted, double share)
{
    const auto rank =
        static_cast<std::size_t>(std::ceil(share * static_cast<double>(sorted.size())));
    return sorted[std::clamp<std::size_t>(rank, 1, sorted.size()) - 1];
}

std::string Decimal(double number)
{
    char text[64];
    std::snprintf(text, sizeof text, "%.1f", number);
    return text;
}

class VCommandBench : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        CLI::App* command =
            program.add_subcommand("bench", "Measure how fast the host answers under load");
        command->footer(
            "A closed loop: each connection sends its next request when it has the reply to the "
            "last. Without a NAME it asks for the server information. The host runs the commands "
            "of "
            "all devices one after the other, so that others wait meanwhile. Ends with 1 where the "
            "host reports a failure.");
        command->add_option("NAME", name, "The command to run")->transform(&PlainWord);
        command->add_option("PARAMETER", assignments, "NAME=VALUE, as many as there are")
            ->transform(&PlainWord);
        command->add_option("--requests", requests, "How many requests each connection makes")
            ->transform(WholeNumber(1, 100000000))
            ->capture_default_str();
        command->add_option("--connections", connections, "How many connections there are")
            ->transform(WholeNumber(1, 1000))
            ->capture_default_str();
        return command;
    }

    EExitCode Run(VSession& session) override
    {
        parameters = ParseAssignments(assignments);
        if (!name.empty()) {
            ControlStream::MakeExecuteCommandRequest("1", name, parameters); // refuses early
        }
        std::vector<VSample> samples(static_cast<std::size_t>(connections));
        const double seconds = Measure(session, samples);

        VSample all;
        for (const VSample& sample : samples) {
            if (sample.Error) {
                std::rethrow_exception(sample.Error);
            }
            all.Microseconds.insert(all.Microseconds.end(), sample.Microseconds.begin(),
                                    sample.Microseconds.end());
            all.Failures += sample.Failures;
        }
        std::sort(all.Microseconds.begin(), all.Microseconds.end());
        Print(session.Output(), all, seconds);
        return all.Failures == 0 ? EExitCode::Done : EExitCode::HostFailed;
    }

private:
    /// @return how long it took, from the first request to the last reply
    double Measure(VSession& session, std::vector<VSample>& samples) const
    {
        std::vector<std::unique_ptr<VClient>> clients;
        for (std::size_t i = 0; i < samples.size(); ++i) {
            clients.push_back(Connect(session));
        }
        const auto start = Clock::now();
        std::vector<std::thread> threads;
        for (std::size_t i = 0; i < samples.size(); ++i) {
            threads.emplace_back([this, &client = *clients[i], &sample = samples[i]] {
                RunGuarded(client, sample);
            });
        }
        for (std::thread& thread : threads) {
            thread.join();
        }
        return std::chrono::duration<double>(Clock::now() - start).count();
    }

    static std::unique_ptr<VClient> Connect(VSession& session)
    {
        ControlStream::VClientOptions options;
        options.TimeLimit = session.TimeLimit();
        options.KeptEventBytes = 0;
        auto client = std::make_unique<VClient>(options);
        client->Connect(session.HostAddress(), session.Options().Port, session.TimeLimit());
        client->GetServerInformation(); // so that the first request meets a host that knows it
        return client;
    }

    void RunGuarded(VClient& client, VSample& sample) const
    {
        try {
            sample.Microseconds.reserve(static_cast<std::size_t>(requests));
            for (int i = 0; i < requests; ++i) {
                const auto start = Clock::now();
                const bool good = Request(client);
                const std::chrono::duration<double, std::micro> took = Clock::now() - start;
                sample.Microseconds.push_back(took.count());
                sample.Failures += good ? 0 : 1;
            }
        } catch (const std::exception&) {
            sample.Error = std::current_exception();
        }
    }

    bool Request(VClient& client) const
    {
        if (name.empty()) {
            client.GetServerInformation();
            return true;
        }
        return client.ExecuteCommand(name, parameters).Ok;
    }

    static void Print(VOutput& output, const VSample& sample, double seconds)
    {
        const std::vector<double>& times = sample.Microseconds;
        const double rate = static_cast<double>(times.size()) / seconds;
        const std::pair<const char*, double> figures[] = {
            {"p50", Percentile(times, 0.5)},  {"p90", Percentile(times, 0.9)},
            {"p99", Percentile(times, 0.99)}, {"p99.9", Percentile(times, 0.999)},
            {"greatest", times.back()},
        };
        if (output.IsJson()) {
            VJson object = {{"requests", times.size()},
                            {"failures", sample.Failures},
                            {"seconds", seconds},
                            {"requestsPerSecond", rate}};
            for (const auto& [label, value] : figures) {
                object["microseconds"][label] = value;
            }
            output.PrintJson(object);
            return;
        }
        output.PrintLine(std::to_string(times.size()) + " requests in " + Decimal(seconds) +
                         " s, " + Decimal(rate) + " a second, " + std::to_string(sample.Failures) +
                         " failures");
        for (const auto& [label, value] : figures) {
            output.PrintLine(std::string(label) + ": " + Decimal(value) + " us");
        }
    }

    std::string name;
    std::vector<std::string> assignments;
    VParameters parameters;
    int requests = 1000;
    int connections = 1;
};

} // namespace

std::unique_ptr<ICommand> MakeCommandBench()
{
    return std::make_unique<VCommandBench>();
}
