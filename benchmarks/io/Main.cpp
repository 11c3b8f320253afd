// Measures value text beside its bare generators and parsers, how long interning takes, and the
// reading of C++ objects beside copying their bytes.

#include "Interning.h"
#include "NativeReading.h"
#include "NumberText.h"

#include <CLI/CLI.hpp>
#include <nlohmann/json.hpp>

#include <cstdio>
#include <exception>

int main(int argc, char** argv)
{
    unsigned rounds = 21;
    std::size_t count = 1000000;
    unsigned calls = 1000000;
    CLI::App options(
        "Measures value text, interning and the reading of objects; one JSON object on standard "
        "output");
    options.add_option("--rounds", rounds, "how often each comparison is made")
        ->check(CLI::PositiveNumber);
    options
        .add_option("--count", count,
                    "numbers in the list whose text is measured, and records in a tenth of that")
        ->check(CLI::Range(1u, 10000000u));
    options.add_option("--calls", calls, "look-ups in a sample of interning")
        ->check(CLI::Range(4u, 100000000u));
    CLI11_PARSE(options, argc, argv);

    try {
        const nlohmann::json report = {
            {"value_text", MeasureNumberText(rounds, count)},
            {"interning", MeasureInterning(rounds, calls)},
            {"native_reading", MeasureNativeReading(rounds, count / 10 + 1)},
        };
        std::printf("%s\n", report.dump(2).c_str());
    } catch (const std::exception& error) {
        std::fprintf(stderr, "benchmark_io: %s\n", error.what());
        return 1;
    }
    return 0;
}
