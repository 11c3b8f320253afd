#pragma once

#include <chrono>
#include <csignal>
#include <optional>

/// SIGINT and SIGTERM, waited for instead of ending the process. To be made before any thread, as
/// threads inherit what is blocked.
///
/// Owns: the blocking of both signals on this thread, put back in the end. Threads: the main one.
class VAwaitedSignals
{
public:
    VAwaitedSignals();
    ~VAwaitedSignals();
    VAwaitedSignals(const VAwaitedSignals&) = delete;
    VAwaitedSignals& operator=(const VAwaitedSignals&) = delete;

    /// Waits for one of both, or for the limit where there is one.
    void Await(std::optional<std::chrono::milliseconds> limit) const;

private:
    sigset_t signals{};
    sigset_t previous{};
};
