#include "LeftThreads.h"

#include <charconv>
#include <filesystem>
#include <fstream>
#include <map>
#include <string>
#include <thread>

namespace QuorixHost {
namespace {

// How long all the threads that are left have to sleep before they count as waiting for something
// that does not come. Whoever is about to end runs, or is woken by one that runs.
constexpr std::chrono::milliseconds quietTime{50};

/// What the system tells of a thread: whether it sleeps, and how often it has gone to sleep.
struct VThreadState
{
    bool Sleeps = false;
    std::string Switches;

    bool operator==(const VThreadState& other) const
    {
        return Sleeps == other.Sleeps && Switches == other.Switches;
    }
};

using VThreadStates = std::map<pid_t, VThreadState>;

VThreadState StateOf(pid_t thread)
{
    VThreadState state;
    std::ifstream status("/proc/self/task/" + std::to_string(thread) + "/status");
    for (std::string line; std::getline(status, line);) {
        if (line.rfind("State:", 0) == 0) {
            state.Sleeps = line.find("S (sleeping)") != std::string::npos;
        } else if (line.find("ctxt_switches:") != std::string::npos) {
            state.Switches += line;
        }
    }
    return state;
}

VThreadStates StatesOfOthers(const std::set<pid_t>& staying)
{
    VThreadStates states;
    for (const pid_t thread : OwnThreads()) {
        if (staying.count(thread) == 0) {
            states[thread] = StateOf(thread);
        }
    }
    return states;
}

bool AllSleep(const VThreadStates& states)
{
    for (const auto& [thread, state] : states) {
        if (!state.Sleeps) {
            return false;
        }
    }
    return true;
}

} // namespace

std::set<pid_t> OwnThreads()
{
    namespace fs = std::filesystem;

    std::set<pid_t> threads;
    std::error_code
        error; // a thread that ends meanwhile may end the listing, which is looked at again
    for (fs::directory_iterator entry("/proc/self/task", error), end; !error && entry != end;
         entry.increment(error)) {
        const std::string name = entry->path().filename().string();
        pid_t thread = 0;
        std::from_chars(name.data(), name.data() + name.size(), thread);
        threads.insert(thread);
    }
    return threads;
}

bool AwaitEndOfOtherThreads(const std::set<pid_t>& staying, std::chrono::milliseconds limit)
{
    // The system tells nobody that a thread has ended, so it is asked again and again.
    constexpr std::chrono::milliseconds pause{1};

    const auto start = std::chrono::steady_clock::now();
    auto quietSince = start;
    VThreadStates before;
    for (;;) {
        VThreadStates others = StatesOfOthers(staying);
        if (others.empty()) {
            return true;
        }
        const auto now = std::chrono::steady_clock::now();
        if (!(others == before) || !AllSleep(others)) {
            quietSince = now;
        }
        if (now - start >= limit || now - quietSince >= quietTime) {
            return false;
        }
        before = std::move(others);
        std::this_thread::sleep_for(pause);
    }
}

} // namespace QuorixHost
