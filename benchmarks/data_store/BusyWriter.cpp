#include "BusyWriter.h"

#include "comparison/Comparison.h"

#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataWriter.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <functional>
#include <sched.h>
#include <sys/resource.h>
#include <thread>
#include <vector>

namespace {

using Clock = std::chrono::steady_clock;

constexpr double longWait = 10e-3;
constexpr std::size_t readsOfARun = 1000;

/// What the reader met.
struct VReads
{
    double MeanSeconds = 0; ///< of the reads of those runs in which nobody else had its processor
    double GreatestSeconds = 0;
    std::size_t Runs = 0;
    std::size_t Disturbed = 0; ///< runs in which another program had the reader's processor
    std::size_t Long = 0;      ///< reads over 10 ms in all other runs
    std::size_t Writes = 0;    ///< scopes of the writer meanwhile
};

/// Returns how often another thread or program took the processor from the calling thread.
long TimesPutOff()
{
    rusage usage{};
    getrusage(RUSAGE_THREAD, &usage);
    return usage.ru_nivcsw;
}

/// Keeps the calling thread on one processor, where there are several and the system lets it.
void StayOn(unsigned processor)
{
    cpu_set_t set;
    CPU_ZERO(&set);
    CPU_SET(processor % std::max(1u, std::thread::hardware_concurrency()), &set);
    static_cast<void>(sched_setaffinity(0, sizeof set, &set));
}

VReads ReadFor(const std::function<void()>& read, double seconds)
{
    VReads reads;
    double total = 0;
    double disturbedTotal = 0;
    const Clock::time_point begin = Clock::now();
    for (Clock::time_point run = begin; run - begin < std::chrono::duration<double>(seconds);) {
        const long putOff = TimesPutOff();
        double greatest = 0;
        std::size_t over = 0;
        run = Clock::now();
        Clock::time_point before = run;
        for (std::size_t index = 0; index < readsOfARun; ++index) {
            read();
            const Clock::time_point after = Clock::now();
            const double took = std::chrono::duration<double>(after - before).count();
            greatest = std::max(greatest, took);
            over += took > longWait ? 1 : 0;
            before = after;
        }
        ++reads.Runs;
        const double took = std::chrono::duration<double>(before - run).count();
        if (TimesPutOff() != putOff) {
            ++reads.Disturbed;
            disturbedTotal += took;
            continue;
        }
        total += took;
        reads.GreatestSeconds = std::max(reads.GreatestSeconds, greatest);
        reads.Long += over;
    }
    // On a machine that never leaves the reader alone all runs are counted instead.
    const std::size_t counted = reads.Runs - reads.Disturbed;
    reads.MeanSeconds = counted > 0
                            ? total / static_cast<double>(counted * readsOfARun)
                            : disturbedTotal / static_cast<double>(reads.Runs * readsOfARun);
    return reads;
}

VReads Measure(const std::function<void()>& read, const std::function<void()>& write,
               double seconds)
{
    std::atomic<bool> stop{false};
    std::atomic<std::size_t> writes{0};
    VReads reads;
    std::thread writer([&] {
        StayOn(1);
        while (!stop) {
            write();
            ++writes;
        }
    });
    std::thread reader([&] {
        StayOn(0);
        while (writes == 0) {
            std::this_thread::yield();
        }
        reads = ReadFor(read, seconds);
    });
    reader.join();
    stop = true;
    writer.join();
    reads.Writes = writes;
    return reads;
}

nlohmann::json Describe(const std::vector<VReads>& all)
{
    std::vector<double> means;
    double greatest = 0;
    std::size_t waits = 0;
    std::size_t runs = 0;
    std::size_t disturbed = 0;
    std::size_t writes = 0;
    for (const VReads& reads : all) {
        means.push_back(reads.MeanSeconds);
        greatest = std::max(greatest, reads.GreatestSeconds);
        waits += reads.Long;
        runs += reads.Runs;
        disturbed += reads.Disturbed;
        writes += reads.Writes;
    }
    return {{"mean_ns", MedianOf(means) * 1e9},
            {"greatest_ms", greatest * 1e3},
            {"over_10_ms", waits},
            {"runs", runs},
            {"runs_disturbed_and_not_counted", disturbed},
            {"scopes_of_the_writer", writes}};
}

} // namespace

nlohmann::json CompareBesideBusyWriter(VItems& items, VDataStore& store, VMapStore& map,
                                       std::size_t perScope, double seconds)
{
    VItems writerItems(items.Texts.size()); // with an order of its own
    double number = 0;
    VDataValue seen;
    const auto readStore = [&] {
        const VDataReader reader(store);
        reader.GetValue(items.Tokens[items.Next()], seen);
    };
    const auto readMap = [&] {
        map.Read(
            [&](const auto& values) { seen = values.find(items.Texts[items.Next()])->second; });
    };
    const auto writeStore = [&] {
        const VDataValue value = MakeNumber(++number);
        VDataWriter writer(store);
        for (std::size_t index = 0; index < perScope; ++index) {
            writer.SetValue(writerItems.Tokens[writerItems.Next()], value);
        }
    };
    const auto writeMap = [&] {
        const VDataValue value = MakeNumber(++number);
        map.Write([&](const auto& set) {
            for (std::size_t index = 0; index < perScope; ++index) {
                set(writerItems.Texts[writerItems.Next()], value);
            }
        });
    };

    std::vector<VReads> own;
    std::vector<VReads> limit;
    std::vector<double> ratios;
    for (int round = 0; round < 3; ++round) {
        own.push_back(Measure(readStore, writeStore, seconds));
        limit.push_back(Measure(readMap, writeMap, seconds));
        ratios.push_back(own.back().MeanSeconds / limit.back().MeanSeconds);
    }
    return {{"own", Describe(own)},
            {"limit", Describe(limit)},
            {"ratio", MedianOf(ratios)},
            {"ratio_range", RangeOf(ratios)},
            {"aim", 0.5},
            {"aim_met", MedianOf(ratios) <= 0.5}};
}
