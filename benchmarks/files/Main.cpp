// Measures the loading and the saving of configuration files beside the bare parsing and printing
// of the same document.

#include "Document.h"
#include "QuorixDataStore/DataStore.h"
#include "comparison/Comparison.h"

#include <CLI/CLI.hpp>
#include <nlohmann/json.hpp>

#include <cstdio>
#include <exception>
#include <fstream>
#include <malloc.h>
#include <stdexcept>
#include <string>

namespace {

void Require(bool condition, const char* what)
{
    if (!condition) {
        throw std::runtime_error(std::string("wrong result: ") + what);
    }
}

/// Returns a figure of the process's memory in MiB, by its name in the kernel's table.
double MemoryFigure(const std::string& name)
{
    std::ifstream table("/proc/self/status");
    std::string word;
    while (table >> word) {
        double kilobytes = 0;
        if (word == name && table >> kilobytes) {
            return kilobytes / 1024;
        }
    }
    return 0;
}

/// Returns how much memory a piece of work takes at its peak, beyond what is held before it.
double PeakOf(const std::function<void()>& work)
{
    malloc_trim(0);
    std::ofstream("/proc/self/clear_refs") << "5"; // the peak begins anew
    const double before = MemoryFigure("VmRSS:");
    work();
    return MemoryFigure("VmHWM:") - before;
}

nlohmann::json Measure(unsigned rounds, std::size_t count)
{
    VDataStore store;
    FillStore(store, count);
    const std::vector<VItemTexts> texts = MakeTexts(count);
    const std::string text = BuildAndPrint(texts);
    Require(SaveStore(store, false) == text, "both sides print the same");
    Require(SaveStore(*LoadStore(text), false) == text, "what is loaded prints the same");

    const auto items = static_cast<double>(count);
    nlohmann::json report;
    report["file_bytes"] = text.size();
    report["load"] = Compare(
        rounds, items, [&] { LoadStore(text); }, [&] { ParseAndWalk(text); }, 30);
    report["save"] = Compare(
        rounds, items, [&] { SaveStore(store, false); }, [&] { BuildAndPrint(texts); }, 3);
    report["save_with_pending_change"] = Compare(
        rounds, items, [&] { SaveStore(store, true); }, [&] { BuildAndPrint(texts); }, 3);
    report["peak_mib"] = {
        {"load", PeakOf([&] { LoadStore(text); })},
        {"bare_parse", PeakOf([&] { ParseAndWalk(text); })},
        {"save", PeakOf([&] { SaveStore(store, false); })},
        {"bare_build", PeakOf([&] { BuildAndPrint(texts); })},
    };
    return report;
}

} // namespace

int main(int argc, char** argv)
{
    unsigned rounds = 11;
    std::vector<std::size_t> counts{1000, 10000, 100000, 1000000};
    CLI::App options("Measures loading and saving of configuration files; one JSON object on "
                     "standard output");
    options.add_option("--rounds", rounds, "samples of each side")->check(CLI::PositiveNumber);
    options.add_option("--count", counts, "items, one run for each")
        ->check(CLI::Range(1u, 10000000u));
    CLI11_PARSE(options, argc, argv);

    try {
        nlohmann::json report;
        for (const std::size_t count : counts) {
            report[std::to_string(count)] = Measure(rounds, count);
        }
        std::printf("%s\n", report.dump(2).c_str());
    } catch (const std::exception& error) {
        std::fprintf(stderr, "benchmark_files: %s\n", error.what());
        return 1;
    }
    return 0;
}
