#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace ControlStream {

/// A host's advertisement, as one network interface shows it.
struct VDiscoveredHost
{
    std::string Name;      ///< of the service: any text, for people
    std::string HostName;  ///< of the machine, "studio.local"; empty where it did not say
    std::string Interface; ///< on which it was heard, "eth0"
    std::vector<std::string> Addresses; ///< IPv4 before IPv6; empty where it did not say
    std::uint16_t AdvertisedPort = 0;   ///< not the port to connect to, see DefaultPort
};

/// Finds hosts on the local network by DNS-SD, with the machine's own DNS-SD service (Avahi).
///
/// Owns: the connection to that service. Everything happens inside the calls. Threads: one at a
/// time, as for any plain object. Failure: VError of the kind NoConnection where no service is
/// there or it goes away.
class VDiscovery
{
public:
    /// Asked after every change; true ends the browsing before its time.
    using IsEnough = std::function<bool(const std::vector<VDiscoveredHost>&)>;

    /// Connects to the machine's DNS-SD service.
    VDiscovery();
    ~VDiscovery();
    VDiscovery(const VDiscovery&) = delete;
    VDiscovery& operator=(const VDiscovery&) = delete;

    /// Browses until the service says that nobody else is there for now, or the limit has run out.
    ///
    /// @return what was seen, by name and interface, once for each interface
    std::vector<VDiscoveredHost> Browse(std::chrono::milliseconds limit,
                                        const IsEnough& isEnough = IsEnough());

private:
    class VBrowser;

    std::unique_ptr<VBrowser> browser;
};

/// Whether a text is an IPv4 address in dotted form. [any]
bool IsIPv4Address(const std::string& text);

/// Returns the IPv4 addresses of the host that advertises itself under `name`; none where nobody
/// does within the limit. Only IPv4, since hosts listen there alone.
///
/// @throws VError  as VDiscovery
std::vector<std::string> DiscoverAddresses(const std::string& name,
                                           std::chrono::milliseconds limit);

/// Returns what to connect to for a host as a user names it: a name that is an IPv4 address, or
/// that the system's resolver knows, as it is; for any other, the address of the host that
/// advertises itself under this name.
///
/// @param limit  for the resolver, and once more for the browsing
/// @throws VError  of the kind NoConnection where nobody knows the name, TimedOut where the
/// resolver takes longer
std::string FindHost(const std::string& name, std::chrono::milliseconds limit);

} // namespace ControlStream
