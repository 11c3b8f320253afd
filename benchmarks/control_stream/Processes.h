#pragma once

#include <sys/types.h>

#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace ControlStreamBenchmark {

/// The cores on which a server and its clients run.
struct VPlacement
{
    int ServerCore;
    int ClientCore;

    bool IsShared() const { return ServerCore == ClientCore; }
    std::string Name() const { return IsShared() ? "shared_core" : "own_cores"; }
};

/// @return the cores on which this process may run
std::vector<int> AllowedCores();

/// Pins the calling thread, and the threads that it starts from now on. Throws std::system_error.
void PinThisThread(int core);

/// Pins every thread that `process` has. Throws std::system_error.
void PinProcess(pid_t process, int core);

/// @return the CPU time that all threads of `process` have used. Throws std::system_error.
std::int64_t ProcessCpuNanoseconds(pid_t process);

/// @return the CPU time of each living thread of `process`, by the thread's name; threads of one
/// name are added up. Empty where the kernel does not account for it.
std::map<std::string, std::int64_t> ThreadCpuNanoseconds(pid_t process);

/// @return the field `name` of the process's memory map, in bytes. Throws std::runtime_error.
std::int64_t MemoryBytes(pid_t process, const std::string& name);

/// Ends a child process: waits `seconds` for it to end by itself, then kills it.
/// @return whether it ended by itself with exit code 0
bool AwaitEnd(pid_t child, double seconds);

} // namespace ControlStreamBenchmark
