// Runs eight threads against stores for as long as told, and compares every history with the
// reference. It is not a part of ./check: run it under the thread sanitizer for a minute.
//
// Usage: QuorixDataStoreStress [seconds] [first seed]

#include "DebugServices/Log.h"
#include "StoreHistory.h"

#include <chrono>
#include <cstdio>
#include <cstdlib>

int main(int argc, char** argv)
{
    const int seconds = argc > 1 ? std::atoi(argv[1]) : 60;
    auto seed = static_cast<std::uint32_t>(argc > 2 ? std::atoi(argv[2]) : 1);
    DebugServices::SetLogLevel("DataStore", 0); // warnings of odd targets are part of the histories

    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(seconds);
    std::uint32_t histories = 0;
    for (; std::chrono::steady_clock::now() < end; ++seed, ++histories) {
        const std::string difference = StoreTest::PlayFreeHistory(seed, 8, 200);
        if (!difference.empty()) {
            std::fprintf(stderr, "seed %u: %s\n", seed, difference.c_str());
            return 1;
        }
    }
    std::printf("%u histories of 8 threads with 200 scopes each, no difference\n", histories);
    return 0;
}
