#include "ControlStreamClient/NetworkInterfaces.h"

#include <algorithm>
#include <memory>

#include <arpa/inet.h>
#include <ifaddrs.h>
#include <net/if.h>
#include <netinet/in.h>

namespace ControlStream {

namespace {

VNetworkInterface& Find(std::vector<VNetworkInterface>& interfaces, const std::string& name)
{
    const auto found =
        std::find_if(interfaces.begin(), interfaces.end(),
                     [&name](const VNetworkInterface& one) { return one.Name == name; });
    if (found != interfaces.end()) {
        return *found;
    }
    interfaces.push_back({name, {}});
    return interfaces.back();
}

std::string AddressText(const sockaddr& address)
{
    char text[INET6_ADDRSTRLEN] = "";
    if (address.sa_family == AF_INET) {
        const auto& internet = reinterpret_cast<const sockaddr_in&>(address);
        inet_ntop(AF_INET, &internet.sin_addr, text, sizeof text);
    } else if (address.sa_family == AF_INET6) {
        const auto& internet = reinterpret_cast<const sockaddr_in6&>(address);
        inet_ntop(AF_INET6, &internet.sin6_addr, text, sizeof text);
    }
    return text;
}

} // namespace

std::vector<VNetworkInterface> ListNetworkInterfaces()
{
    ifaddrs* list = nullptr;
    if (getifaddrs(&list) != 0) {
        return {};
    }
    const std::unique_ptr<ifaddrs, void (*)(ifaddrs*)> owner(list, &freeifaddrs);
    std::vector<VNetworkInterface> interfaces;
    // The system tells one address at a time, and all of IPv4 before those of IPv6.
    for (const ifaddrs* entry = list; entry != nullptr; entry = entry->ifa_next) {
        if ((entry->ifa_flags & IFF_UP) == 0) {
            continue;
        }
        VNetworkInterface& one = Find(interfaces, entry->ifa_name);
        const std::string address =
            entry->ifa_addr != nullptr ? AddressText(*entry->ifa_addr) : std::string();
        if (!address.empty()) {
            one.Addresses.push_back(address);
        }
    }
    return interfaces;
}

} // namespace ControlStream
