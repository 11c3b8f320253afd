// benchmark_client: measures what the client library adds, and what its batches save, with a
// running host on the loopback interface, and prints both as JSON.

#include "client/Measurements.h"
#include "control_stream/HostProcess.h"

#include "QuorixVersion.h"

#include <CLI/CLI.hpp>

#include <filesystem>
#include <iostream>

namespace {

using namespace ClientBenchmark;

int Run(const std::string& hostProgram, const VSettings& settings)
{
    const ControlStreamBenchmark::VHostProcess host(hostProgram);
    VJson report;
    report["batch"] = MeasureBatch(settings);
    report["processor_time"] = MeasureProcessorTime(settings);
    std::cout << report.dump(2) << '\n';
    return 0;
}

} // namespace

int main(int argc, char** argv)
{
    const auto folder = std::filesystem::read_symlink("/proc/self/exe").parent_path();
    std::string host = (folder / "quorix-host").string();
    VSettings settings;
    CLI::App program("Measures the client library with a running host", "benchmark_client");
    program.set_version_flag("--version", "benchmark_client " QUORIX_VERSION);
    program.add_option("--host", host, "The host's program")->capture_default_str();
    program.add_option("--rounds", settings.Rounds, "How often each is measured")
        ->check(CLI::Range(1, 1000))
        ->capture_default_str();
    program.add_option("--requests", settings.Requests, "How many requests are one sample")
        ->check(CLI::Range(1, 10000000))
        ->capture_default_str();
    CLI11_PARSE(program, argc, argv);
    try {
        return Run(host, settings);
    } catch (const std::exception& error) {
        std::cerr << "benchmark_client: " << error.what() << '\n';
        return 1;
    }
}
