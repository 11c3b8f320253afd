#pragma once

#include "Statistics.h"

#include <sys/types.h>

#include <cstdint>
#include <map>
#include <string>

namespace ControlStreamBenchmark {

/// Watches the clock and the CPU time of a server, and of this process as its client, from its
/// making on.
class VUsage
{
public:
    explicit VUsage(pid_t serverProcess);

    /// @return the time since the making
    double Seconds() const;

    /// @param count  what was done meanwhile
    /// @param what   its name in the figures: "request"
    /// @return server_cpu_us_per_`what`; server_busy and client_busy, the shares of one core that
    /// each side used; and the server's CPU per `what` of each thread that used any
    VFigures Figures(std::uint64_t count, const std::string& what) const;

private:
    pid_t server;
    std::map<std::string, std::int64_t> beginThreads;
    std::int64_t beginTime;
    std::int64_t beginServer;
    std::int64_t beginClient;
};

} // namespace ControlStreamBenchmark
