#include "Usage.h"

#include "Processes.h"

#include <unistd.h>

#include <algorithm>

namespace ControlStreamBenchmark {

VUsage::VUsage(pid_t serverProcess)
    : server(serverProcess),
      beginThreads(ThreadCpuNanoseconds(server)),
      beginTime(NowNanoseconds()),
      beginServer(ProcessCpuNanoseconds(server)),
      beginClient(ProcessCpuNanoseconds(getpid()))
{
}

double VUsage::Seconds() const
{
    return static_cast<double>(NowNanoseconds() - beginTime) / 1e9;
}

VFigures VUsage::Figures(std::uint64_t count, const std::string& what) const
{
    constexpr double leastShownMicroseconds = 0.05;
    const auto time = static_cast<double>(NowNanoseconds() - beginTime);
    const auto serverTime = static_cast<double>(ProcessCpuNanoseconds(server) - beginServer);
    const auto clientTime = static_cast<double>(ProcessCpuNanoseconds(getpid()) - beginClient);
    const auto divisor = static_cast<double>(std::max<std::uint64_t>(count, 1));

    VFigures figures;
    figures.emplace_back("server_cpu_us_per_" + what, serverTime / divisor / 1000);
    figures.emplace_back("server_busy", serverTime / time);
    figures.emplace_back("client_busy", clientTime / time);
    const std::string threadFigure = "thread_cpu_us_per_" + what + ":";
    for (const auto& [name, used] : ThreadCpuNanoseconds(server)) {
        const auto begin = beginThreads.find(name);
        const std::int64_t usedBefore = begin == beginThreads.end() ? 0 : begin->second;
        const double microseconds = static_cast<double>(used - usedBefore) / divisor / 1000;
        if (microseconds >= leastShownMicroseconds) {
            figures.emplace_back(std::string(threadFigure).append(name), microseconds);
        }
    }
    return figures;
}

} // namespace ControlStreamBenchmark
