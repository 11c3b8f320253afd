#include "LeftThreads.h"

#include <algorithm>
#include <charconv>
#include <filesystem>
#include <string>
#include <thread>

namespace QuorixHost {

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

    const auto deadline = std::chrono::steady_clock::now() + limit;
    for (;;) {
        const std::set<pid_t> present = OwnThreads();
        if (std::includes(staying.begin(), staying.end(), present.begin(), present.end())) {
            return true;
        }
        if (std::chrono::steady_clock::now() >= deadline) {
            return false;
        }
        std::this_thread::sleep_for(pause);
    }
}

} // namespace QuorixHost
