#pragma once

#include "Servers.h"

#include <string>
#include <vector>

namespace ControlStreamBenchmark {

/// A running host without a window, driven through its console. It keeps its files in a temporary
/// folder, and is asked to quit when this object goes.
///
/// Threads: one at a time.
class VHostProcess final : public IEventServer
{
public:
    /// Starts the host, waits until it is ready and connects to it once. Throws std::runtime_error
    /// with the end of what the host wrote to standard error if it does not come up, or if its port
    /// is answered by somebody else.
    ///
    /// @param environment  further variables of the host, as NAME=VALUE
    explicit VHostProcess(const std::string& program,
                          const std::vector<std::string>& environment = {});

    VHostProcess(const VHostProcess&) = delete;
    VHostProcess& operator=(const VHostProcess&) = delete;

    /// Ends the host; says on standard error if it did not end in order.
    ~VHostProcess() override;

    pid_t Process() const override { return process; }
    std::uint16_t Port() const override { return controlPort; }
    std::size_t MaximalCount() const override;

    /// Fills the console with lines that each fire one event, in one write.
    void Fire(std::size_t count) override;
    void AwaitFired() override;

private:
    static constexpr std::uint16_t controlPort = 803;

    void Start(const std::string& program, const std::vector<std::string>& environment);
    void AwaitReady();
    void Stop();
    std::string ReadLine(double seconds);
    void WriteConsole(const std::string& text) const;
    [[noreturn]] void Fail(const std::string& reason) const;

    std::string folder;
    pid_t process = 0;
    int console = -1; // the host's standard input
    int answers = -1; // the host's standard output
    std::string unread;
    std::size_t pipeBytes = 0;
    std::size_t awaitedAnswers = 0;
};

} // namespace ControlStreamBenchmark
