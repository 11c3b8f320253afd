// benchmark_control_stream: measures a running host's control stream beside the least that any
// server of the same framing must do, in the same run, and prints both as JSON.

#include "Measurements.h"

#include "DeviceConnection.h"
#include "HostProcess.h"
#include "QuorixVersion.h"
#include "Table.h"

#include <CLI/CLI.hpp>
#include <sys/resource.h>
#include <sys/utsname.h>

#include <algorithm>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <memory>

namespace {

using namespace ControlStreamBenchmark;
using VJson = nlohmann::ordered_json;

const std::vector<std::string> benchmarkNames{
    "latency", "quick_acknowledgement", "connections", "camera_read", "churn", "fan_out", "memory"};

struct VOptions
{
    std::string Host;
    std::vector<std::string> Only;
    bool Calibrate = false;
    VSettings Settings;

    bool Wants(const std::string& name) const
    {
        return Only.empty() || std::find(Only.begin(), Only.end(), name) != Only.end();
    }
};

std::filesystem::path ProgramFolder()
{
    return std::filesystem::read_symlink("/proc/self/exe").parent_path();
}

/// @return the counter library that was built with this program, or an empty text
std::string CounterLibrary()
{
    const auto path = ProgramFolder().parent_path() / "lib/libbenchmark_allocation_counter.so";
    return std::filesystem::exists(path) ? path.string() : std::string();
}

void RaiseFileLimit()
{
    rlimit limit{};
    if (getrlimit(RLIMIT_NOFILE, &limit) == 0) {
        limit.rlim_cur = limit.rlim_max;
        setrlimit(RLIMIT_NOFILE, &limit); // where it fails, a connect will tell
    }
}

VJson DescribeMachine()
{
    VJson machine;
    utsname system{};
    uname(&system);
    machine["kernel"] = system.release;
    machine["cores"] = AllowedCores().size();
    std::ifstream file("/proc/cpuinfo");
    for (std::string line; std::getline(file, line);) {
        if (line.rfind("model name", 0) == 0) {
            machine["processor"] = line.substr(line.find(':') + 2);
            break;
        }
    }
    return machine;
}

VJson DescribeSettings(const VOptions& options)
{
    const VSettings& settings = options.Settings;
    return {{"sample_seconds", settings.Seconds},
            {"rounds", settings.Rounds},
            {"limit", settings.Limit == ELimit::Asio ? "asio" : "epoll"},
            {"calibration", options.Calibrate},
            {"server_core", settings.OwnCores.ServerCore},
            {"client_core", settings.OwnCores.ClientCore}};
}

VJson MeasureRequests(const VOptions& options, const IServer* host)
{
    const VSettings& settings = options.Settings;
    std::unique_ptr<VLimitProcess> secondLimit;
    std::string reply = ExecuteCommandFrame();
    if (host != nullptr) {
        reply = VDeviceConnection(host->Port()).Ask(ExecuteCommandFrame());
    } else {
        secondLimit = std::make_unique<VLimitProcess>(VLimitProcess::Echo(settings.Limit, reply));
        host = secondLimit.get();
    }
    const VLimitProcess limit = VLimitProcess::Echo(settings.Limit, reply);

    VJson results;
    if (options.Wants("latency")) {
        results["latency"] = MeasureLatency(settings, *host, limit, reply);
    }
    if (options.Wants("quick_acknowledgement")) {
        results["quick_acknowledgement"] = MeasureQuickAcknowledgement(settings, *host, reply);
    }
    if (options.Wants("connections")) {
        results["connections"] = MeasureConnections(settings, *host, limit, reply);
    }
    if (options.Wants("camera_read") && !options.Calibrate) {
        results["camera_read"] = MeasureCameraRead(settings, *host, reply);
    }
    if (options.Wants("churn")) {
        results["churn"] = MeasureChurn(settings, *host, limit, reply);
    }
    return results;
}

VJson MeasureAll(const VOptions& options)
{
    VJson report;
    report["machine"] = DescribeMachine();
    report["settings"] = DescribeSettings(options);
    VJson& results = report["benchmarks"];
    {
        std::unique_ptr<VHostProcess> host;
        if (!options.Calibrate) {
            host = std::make_unique<VHostProcess>(options.Host);
        }
        results = MeasureRequests(options, host.get());
        if (options.Wants("fan_out")) {
            results["fan_out"] = MeasureFanOut(options.Settings, host.get());
        }
    }
    if (options.Wants("memory") && !options.Calibrate) {
        results["memory"] = MeasureMemory(options.Host, CounterLibrary());
    }
    return report;
}

void DefineOptions(CLI::App& app, VOptions& options)
{
    VSettings& settings = options.Settings;
    const std::vector<int> cores = AllowedCores();
    settings.OwnCores.ServerCore = cores.front();
    settings.OwnCores.ClientCore = cores.back();
    options.Host = (ProgramFolder() / "quorix-host").string();

    app.set_version_flag("--version", QUORIX_VERSION);
    app.add_option("--host", options.Host, "The host; default: the one built with this program");
    app.add_option("--only", options.Only, "A benchmark to run; repeatable; default: all")
        ->check(CLI::IsMember(benchmarkNames));
    app.add_option("--seconds", settings.Seconds, "Length of one sample; default: 1")
        ->check(CLI::Range(0.01, 600.0));
    app.add_option("--rounds", settings.Rounds, "Samples of each side; default: 5")
        ->check(CLI::Range(1, 1000));
    app.add_option("--limit", settings.Limit, "How the echo limit reads: asio (default) or epoll")
        ->transform(CLI::CheckedTransformer(
            std::map<std::string, ELimit>{{"asio", ELimit::Asio}, {"epoll", ELimit::Epoll}}));
    app.add_option("--server-core", settings.OwnCores.ServerCore, "Default: the first allowed")
        ->check(CLI::IsMember(cores));
    app.add_option("--client-core", settings.OwnCores.ClientCore,
                   "For what is measured on a core of its own; default: the last allowed")
        ->check(CLI::IsMember(cores));
    app.add_flag("--calibrate", options.Calibrate,
                 "Measures the limits against themselves: how far from 1 a ratio is by chance");
}

} // namespace

int main(int argumentCount, char** arguments)
{
    CLI::App app(
        "Measures a host's control stream beside the least that a server of the same framing "
        "must do. Needs port 803: run it through tests/support/in-network-namespace.");
    try {
        VOptions options;
        DefineOptions(app, options);
        CLI11_PARSE(app, argumentCount, arguments);
        options.Settings.SharedCore = {options.Settings.OwnCores.ServerCore,
                                       options.Settings.OwnCores.ServerCore};
        RaiseFileLimit();
        std::signal(SIGPIPE,
                    SIG_IGN); // a host that has died is seen by what its console does not say
        const VJson report = MeasureAll(options);
        std::cout << report.dump(2) << std::endl;
        PrintTable(std::cerr, report);
        return 0;
    } catch (const std::exception& failure) {
        std::cerr << "benchmark_control_stream: " << failure.what() << std::endl;
        return 1;
    }
}
