#pragma once

#include "Servers.h"

#include <functional>
#include <string>

namespace ControlStreamBenchmark {

/// How the echo limit reads its sockets.
enum class ELimit {
    Asio, ///< as the host does: composed asynchronous reads of Boost.Asio, of header and of text
    Epoll ///< as little as can be done: epoll, one read each for header and text
};

/// A child process that does what the control stream must do at the least, and nothing else. It is
/// killed when this object goes.
///
/// Threads: one at a time; made while the process has one thread only, since it forks.
class VLimitProcess final : public IEventServer
{
public:
    /// A server of one thread that reads frames by their length and answers each with `reply`,
    /// unseen what it says, header and text in one blocking write.
    static VLimitProcess Echo(ELimit kind, const std::string& reply);

    /// A server that takes `listeners` connections, and sends to each of them in turn, header and
    /// text in one blocking write, `event` as often as Fire says.
    static VLimitProcess FanOut(std::size_t listeners, const std::string& event);

    VLimitProcess(VLimitProcess&& other) noexcept;
    VLimitProcess& operator=(VLimitProcess&&) = delete;
    ~VLimitProcess() override;

    pid_t Process() const override { return process; }
    std::uint16_t Port() const override { return port; }
    std::size_t MaximalCount() const override { return 1'000'000; }
    void Fire(std::size_t count) override;
    void AwaitFired() override;

private:
    /// @param serve  given the listening socket and the child's end of the orders; never returns
    explicit VLimitProcess(const std::function<void(int, int)>& serve);

    pid_t process = 0;
    std::uint16_t port = 0;
    int orders = -1;
};

} // namespace ControlStreamBenchmark
