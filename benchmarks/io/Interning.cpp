#include "Interning.h"

#include "Variant/Interning.h"
#include "comparison/Comparison.h"

#include <algorithm>
#include <atomic>
#include <functional>
#include <mutex>
#include <shared_mutex>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

namespace {

using KVR::IO::EType;
using KVR::IO::GetUniquePodSchema;
using KVR::IO::GetUniqueSchema;
using KVR::IO::ISchema;

ISchema MakeTuple()
{
    ISchema tuple;
    tuple.Type = EType::NamedTuple;
    for (int i = 0; i < 20; ++i) {
        ISchema member;
        member.Type = i % 2 == 0 ? EType::Float64 : EType::String;
        tuple.SubSchemas.emplace_back("Member" + std::to_string(i), member);
    }
    return tuple;
}

ISchema MakeList()
{
    ISchema list;
    list.Type = EType::List;
    list.SubSchemas.emplace_back("", ISchema());
    list.SubSchemas.front().second.Type = EType::Float64;
    return list;
}

using LookUp = std::function<void(unsigned calls)>;

/// Looks a schema up again and again, and makes sure that each look-up took place.
template <typename Find>
LookUp Repeat(Find find)
{
    return [find](unsigned calls) {
        const ISchema* const expected = &find();
        for (unsigned i = 0; i < calls; ++i) {
            if (&find() != expected) {
                throw std::runtime_error("a schema has two instances");
            }
        }
    };
}

double NanosecondsOf(unsigned rounds, unsigned calls, const LookUp& lookUp)
{
    std::vector<double> samples;
    for (unsigned i = 0; i < rounds; ++i) {
        samples.push_back(ProcessorSecondsOf([&] { lookUp(calls); }) * 1e9 / calls);
    }
    return MedianOf(samples);
}

/// Returns the look-ups per second of some threads together, measured from the moment when all run.
double RateOf(unsigned threadCount, unsigned calls, const LookUp& lookUp)
{
    std::atomic<unsigned> ready{0};
    std::vector<std::thread> threads;
    const auto waitForAll = [&] {
        ++ready;
        while (ready < threadCount) {
        }
    };
    for (unsigned i = 1; i < threadCount; ++i) {
        threads.emplace_back([&] {
            waitForAll();
            lookUp(calls);
        });
    }
    waitForAll();
    const double seconds = SecondsOf([&] {
        lookUp(calls);
        for (std::thread& thread : threads) {
            thread.join();
        }
    });
    return threadCount * static_cast<double>(calls) / seconds;
}

nlohmann::json CompareThreads(unsigned rounds, unsigned calls, const LookUp& lookUp)
{
    std::vector<double> one;
    std::vector<double> two;
    std::vector<double> ratios;
    for (unsigned i = 0; i < rounds; ++i) {
        one.push_back(RateOf(1, calls, lookUp));
        two.push_back(RateOf(2, calls, lookUp));
        ratios.push_back(two.back() / one.back());
    }
    return {
        {"one_thread_per_second", MedianOf(one)},
        {"two_threads_per_second", MedianOf(two)},
        {"ratio", MedianOf(ratios)},
        {"ratio_range", RangeOf(ratios)},
    };
}

} // namespace

nlohmann::json MeasureInterning(unsigned rounds, unsigned calls)
{
    ISchema plain;
    plain.Type = EType::Float64;
    const ISchema tuple = MakeTuple();
    const ISchema list = MakeList();
    std::shared_mutex sharedMutex;

    const LookUp findType = Repeat([]() -> auto& { return GetUniquePodSchema(EType::String); });
    const LookUp findPlain = Repeat([&]() -> auto& { return GetUniqueSchema(plain); });
    const LookUp findList = Repeat([&]() -> auto& { return GetUniqueSchema(list); });
    const LookUp findTuple = Repeat([&]() -> auto& { return GetUniqueSchema(tuple); });
    const LookUp findListLocked = Repeat([&]() -> auto& {
        const std::shared_lock<std::shared_mutex> lock(sharedMutex);
        return GetUniqueSchema(list);
    });

    nlohmann::json threads = {
        {"plain_schema", CompareThreads(rounds, calls * 4, findPlain)},
        {"list", CompareThreads(rounds, calls, findList)},
        {"tuple_of_20", CompareThreads(rounds, calls / 4, findTuple)},
        // Why no lock is taken: the same look-up with a shared one around it.
        {"list_behind_shared_mutex", CompareThreads(rounds, calls, findListLocked)},
    };
    for (const char* name : {"plain_schema", "list", "tuple_of_20"}) {
        threads[name]["aim"] = 1.6;
    }
    return {
        {"plain_type_ns", {{"value", NanosecondsOf(rounds, calls * 4, findType)}}},
        {"plain_schema_ns", {{"value", NanosecondsOf(rounds, calls * 4, findPlain)}, {"aim", 20}}},
        {"list_ns", {{"value", NanosecondsOf(rounds, calls, findList)}}},
        {"tuple_of_20_ns", {{"value", NanosecondsOf(rounds, calls / 4, findTuple)}, {"aim", 1000}}},
        {"two_threads", threads},
    };
}
