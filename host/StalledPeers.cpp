#include "StalledPeers.h"

#include "SocketTable.h"

#include <poll.h>

namespace QuorixHost {
namespace {

/// Asks the system whether a write to the descriptor would have to wait. One that was closed
/// meanwhile, or that means another file by now, gives a wrong answer and no harm.
bool IsFull(int descriptor)
{
    pollfd writable = {descriptor, POLLOUT, 0};
    return poll(&writable, 1, 0) == 0;
}

} // namespace

std::string DescribeStalledPeers(std::uint16_t port)
{
    // Without end, a list of peers hides what it is there to say.
    constexpr int maximumNamed = 10;

    const auto own = OwnSockets();
    std::string peers;
    int count = 0;
    for (const VSocketRow& row : ReadSocketTables()) {
        const auto found = own.find(row.inode);
        if (row.localPort != port || row.sendQueue == 0 || found == own.end() ||
            !IsFull(found->second)) {
            continue;
        }
        if (++count <= maximumNamed) {
            peers += (count == 1 ? "" : ", ") + row.remoteAddress + ":" +
                     std::to_string(row.remotePort) + " (" + std::to_string(row.sendQueue) +
                     " bytes unsent)";
        }
    }
    if (count == 0) {
        return "No device has a full send queue.";
    }
    if (count > maximumNamed) {
        peers += " and " + std::to_string(count - maximumNamed) + " more";
    }
    return "Devices that do not read what they are sent: " + peers + ".";
}

} // namespace QuorixHost
