#include "Processes.h"

#include "Statistics.h"

#include <sched.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <system_error>

namespace ControlStreamBenchmark {

namespace {

void Pin(pid_t thread, int core)
{
    cpu_set_t set;
    CPU_ZERO(&set);
    CPU_SET(static_cast<std::size_t>(core), &set);
    // A thread may end between being listed and being pinned, as the one that announces a host.
    if (sched_setaffinity(thread, sizeof set, &set) != 0 && errno != ESRCH) {
        throw std::system_error(errno, std::generic_category(), "sched_setaffinity");
    }
}

std::filesystem::path TaskFolder(pid_t process)
{
    return "/proc/" + std::to_string(process) + "/task";
}

} // namespace

std::vector<int> AllowedCores()
{
    cpu_set_t set;
    CPU_ZERO(&set);
    if (sched_getaffinity(0, sizeof set, &set) != 0) {
        throw std::system_error(errno, std::generic_category(), "sched_getaffinity");
    }
    std::vector<int> cores;
    for (int core = 0; core < CPU_SETSIZE; ++core) {
        if (CPU_ISSET(static_cast<std::size_t>(core), &set)) {
            cores.push_back(core);
        }
    }
    return cores;
}

void PinThisThread(int core)
{
    Pin(0, core);
}

void PinProcess(pid_t process, int core)
{
    for (const auto& entry : std::filesystem::directory_iterator(TaskFolder(process))) {
        Pin(static_cast<pid_t>(std::stol(entry.path().filename().string())), core);
    }
}

std::int64_t ProcessCpuNanoseconds(pid_t process)
{
    clockid_t clock{};
    if (const int error = clock_getcpuclockid(process, &clock); error != 0) {
        throw std::system_error(error, std::generic_category(), "clock_getcpuclockid");
    }
    timespec used{};
    if (clock_gettime(clock, &used) != 0) {
        throw std::system_error(errno, std::generic_category(), "clock_gettime");
    }
    return std::int64_t{used.tv_sec} * 1'000'000'000 + used.tv_nsec;
}

std::map<std::string, std::int64_t> ThreadCpuNanoseconds(pid_t process)
{
    std::map<std::string, std::int64_t> used;
    for (const auto& entry : std::filesystem::directory_iterator(TaskFolder(process))) {
        std::string name;
        std::getline(std::ifstream(entry.path() / "comm"), name);
        std::int64_t nanoseconds = 0;
        if (std::ifstream(entry.path() / "schedstat") >> nanoseconds) {
            used[name] += nanoseconds;
        }
    }
    return used;
}

std::int64_t MemoryBytes(pid_t process, const std::string& name)
{
    std::ifstream file("/proc/" + std::to_string(process) + "/smaps_rollup");
    for (std::string line; std::getline(file, line);) {
        if (line.rfind(name + ":", 0) == 0) {
            return std::stoll(line.substr(name.size() + 1)) * 1024;
        }
    }
    throw std::runtime_error("the kernel does not tell " + name + " of a process");
}

bool AwaitEnd(pid_t child, double seconds)
{
    constexpr useconds_t pauseMicroseconds = 2000;
    const std::int64_t limit = NowNanoseconds() + static_cast<std::int64_t>(seconds * 1e9);
    int status = 0;
    while (waitpid(child, &status, WNOHANG) == 0) {
        if (NowNanoseconds() > limit) {
            kill(child, SIGKILL);
            waitpid(child, &status, 0);
            return false;
        }
        usleep(pauseMicroseconds);
    }
    return WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

} // namespace ControlStreamBenchmark
