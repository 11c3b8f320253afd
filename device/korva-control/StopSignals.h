#pragma once

#include <csignal>

namespace ControlStream {
class VClient;
}

/// While it lives, SIGINT and SIGTERM interrupt the client's wait instead of ending the process.
/// The same signal a second time ends it, should the first have found it busy elsewhere.
///
/// Owns: the two signals' dispositions, put back in the end. There is one at a time. Threads: the
/// main thread. Failure: none.
class VStopSignals
{
public:
    explicit VStopSignals(ControlStream::VClient& client);
    ~VStopSignals();
    VStopSignals(const VStopSignals&) = delete;
    VStopSignals& operator=(const VStopSignals&) = delete;

    bool IsRequested() const;

private:
    struct sigaction previousInterrupt;
    struct sigaction previousTerminate;
};
