#include "LimitProcess.h"

#include "EchoServers.h"
#include "Processes.h"

#include <netinet/in.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <stdexcept>
#include <system_error>
#include <vector>

namespace ControlStreamBenchmark {

namespace {

[[noreturn]] void ThrowErrno(const char* what)
{
    throw std::system_error(errno, std::generic_category(), what);
}

int Listen(std::uint16_t& port)
{
    const int listener = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_ANY);
    socklen_t size = sizeof address;
    auto* generic = reinterpret_cast<sockaddr*>(&address);
    if (listener < 0 || bind(listener, generic, size) != 0 || listen(listener, SOMAXCONN) != 0 ||
        getsockname(listener, generic, &size) != 0) {
        ThrowErrno("listen");
    }
    port = ntohs(address.sin_port);
    return listener;
}

[[noreturn]] void ServeFanOut(int listener, int orders, std::size_t listeners,
                              const std::string& event)
{
    std::vector<int> sockets;
    while (sockets.size() < listeners) {
        sockets.push_back(accept4(listener, nullptr, nullptr, SOCK_CLOEXEC));
    }
    for (std::uint64_t count = 0; read(orders, &count, sizeof count) == sizeof count;) {
        for (std::uint64_t index = 0; index < count; ++index) {
            for (const int socket : sockets) {
                WriteFrame(socket, event);
            }
        }
        if (write(orders, &count, sizeof count) != sizeof count) {
            break;
        }
    }
    _exit(0);
}

} // namespace

VLimitProcess VLimitProcess::Echo(ELimit kind, const std::string& reply)
{
    return VLimitProcess([kind, &reply](int listener, int) {
        kind == ELimit::Asio ? ServeWithAsio(listener, reply) : ServeWithEpoll(listener, reply);
    });
}

VLimitProcess VLimitProcess::FanOut(std::size_t listeners, const std::string& event)
{
    return VLimitProcess([listeners, &event](int listener, int childOrders) {
        ServeFanOut(listener, childOrders, listeners, event);
    });
}

VLimitProcess::VLimitProcess(const std::function<void(int, int)>& serve)
{
    std::array<int, 2> pair{};
    if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, pair.data()) != 0) {
        ThrowErrno("socketpair");
    }
    const int listener = Listen(port);
    process = fork();
    if (process == 0) {
        prctl(PR_SET_PDEATHSIG, SIGKILL);
        close(pair[0]);
        try {
            serve(listener, pair[1]);
        } catch (...) {
            // The benchmark sees the connection end and says so.
        }
        _exit(1);
    }
    close(listener);
    close(pair[1]);
    orders = pair[0];
    if (process < 0) {
        ThrowErrno("fork");
    }
}

VLimitProcess::VLimitProcess(VLimitProcess&& other) noexcept
    : process(other.process), port(other.port), orders(other.orders)
{
    other.process = 0;
    other.orders = -1;
}

VLimitProcess::~VLimitProcess()
{
    if (process > 0) {
        kill(process, SIGKILL);
        AwaitEnd(process, 1); // its exit code says nothing: it was killed
    }
    if (orders >= 0) {
        close(orders);
    }
}

void VLimitProcess::Fire(std::size_t count)
{
    const std::uint64_t order = count;
    if (write(orders, &order, sizeof order) != sizeof order) {
        ThrowErrno("write");
    }
}

void VLimitProcess::AwaitFired()
{
    std::uint64_t count = 0;
    if (read(orders, &count, sizeof count) != sizeof count) {
        throw std::runtime_error("the fan-out limit has ended");
    }
}

} // namespace ControlStreamBenchmark
