// Runs eight threads against stores for as long as told, and compares every history with the
// reference. It is not a part of ./check: run it under the thread sanitizer for a minute.
//
// Usage: QuorixDataStoreStress [seconds] [first seed]

#include "DebugServices/Log.h"
#include "StoreHistory.h"

#include <charconv>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <cstring>

namespace {

/// Reads an argument that is a whole number. @return whether it is one
bool ReadNumber(const char* text, std::uint32_t& number)
{
    const char* const end = text + std::strlen(text);
    const auto [read, error] = std::from_chars(text, end, number);
    return error == std::errc() && read == end;
}

} // namespace

int main(int argc, char** argv)
{
    std::uint32_t seconds = 60;
    std::uint32_t seed = 1;
    if (argc > 3 || (argc > 1 && !ReadNumber(argv[1], seconds)) ||
        (argc > 2 && !ReadNumber(argv[2], seed))) {
        std::fprintf(stderr, "Usage: QuorixDataStoreStress [seconds] [first seed]\n");
        return 2;
    }
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
