#include "ControlStreamClient/Discovery.h"

#include "ControlStreamClient/Deadline.h"
#include "ControlStreamClient/Error.h"
#include "ControlStreamClient/HostAddress.h"

#include <algorithm>
#include <map>
#include <set>
#include <utility>

#include <avahi-client/client.h>
#include <avahi-client/lookup.h>
#include <avahi-common/address.h>
#include <avahi-common/error.h>
#include <avahi-common/simple-watch.h>

#include <arpa/inet.h>
#include <net/if.h>

namespace ControlStream {

namespace {

constexpr const char* ServiceType = "_korva._tcp";

// Most hosts have no IPv6 address, of which the service is sure only after five seconds. One that
// is there comes with the other.
constexpr std::chrono::milliseconds restLimit{300};

/// Makes the C library's way of destroying its objects a deleter.
template <auto Free>
struct VFree
{
    template <typename TObject>
    void operator()(TObject* object) const
    {
        Free(object);
    }
};

using VPoll = std::unique_ptr<AvahiSimplePoll, VFree<&avahi_simple_poll_free>>;
using VClientHandle = std::unique_ptr<AvahiClient, VFree<&avahi_client_free>>;
using VServiceBrowser = std::unique_ptr<AvahiServiceBrowser, VFree<&avahi_service_browser_free>>;
using VResolver = std::unique_ptr<AvahiServiceResolver, VFree<&avahi_service_resolver_free>>;

std::string InterfaceName(AvahiIfIndex index)
{
    char name[IF_NAMESIZE] = "";
    return if_indextoname(static_cast<unsigned>(index), name) != nullptr ? name
                                                                         : std::to_string(index);
}

/// Returns an address as a program takes it: one that holds on one link only names that link.
std::string AddressText(const AvahiAddress& address, const std::string& interface)
{
    char text[AVAHI_ADDRESS_STR_MAX] = "";
    avahi_address_snprint(text, sizeof text, &address);
    const bool isOfLink =
        address.proto == AVAHI_PROTO_INET6 && IN6_IS_ADDR_LINKLOCAL(address.data.ipv6.address);
    return isOfLink ? std::string(text) + "%" + interface : text;
}

} // namespace

/// The conversation with Avahi. Its callbacks come from inside Iterate; what they find wrong is
/// kept and thrown behind it, as no exception may pass through the C library.
class VDiscovery::VBrowser
{
public:
    VBrowser() : poll(avahi_simple_poll_new())
    {
        int error = AVAHI_ERR_NO_MEMORY;
        if (poll) {
            client.reset(avahi_client_new(avahi_simple_poll_get(poll.get()), AvahiClientFlags{},
                                          &OnClient, this, &error));
        }
        if (!client) {
            Throw(error);
        }
    }

    std::vector<VDiscoveredHost> Browse(const VDeadline& deadline, const IsEnough& isEnough)
    {
        Start();
        VDeadline end = deadline;
        bool isWaitingForRest = false;
        while (!IsComplete() && !end.IsOver()) {
            if (!isWaitingForRest && IsUsable()) {
                isWaitingForRest = true;
                end = deadline.Sooner(restLimit);
            }
            if (avahi_simple_poll_iterate(poll.get(), end.PollMilliseconds()) != 0) {
                failure = failure != 0 ? failure : AVAHI_ERR_DISCONNECTED;
            }
            if (failure != 0) {
                Throw(failure);
            }
            if (std::exchange(isChanged, false) && isEnough && isEnough(Hosts())) {
                break;
            }
        }
        return Hosts();
    }

private:
    using VKey = std::pair<std::string, std::string>; // name and interface

    struct VSeen
    {
        VDiscoveredHost Host;
        std::set<std::string> IPv4;
        std::set<std::string> IPv6;
    };

    [[noreturn]] static void Throw(int error)
    {
        throw VError(EErrorKind::NoConnection,
                     std::string("no DNS-SD service is running here: ") + avahi_strerror(error));
    }

    void Start()
    {
        resolvers.clear();
        seen.clear();
        pending.clear();
        isAllForNow = false;
        browser.reset(avahi_service_browser_new(client.get(), AVAHI_IF_UNSPEC, AVAHI_PROTO_UNSPEC,
                                                ServiceType, nullptr, AvahiLookupFlags{},
                                                &OnBrowser, this));
        if (!browser) {
            Throw(avahi_client_errno(client.get()));
        }
    }

    bool IsComplete() const { return isAllForNow && pending.empty(); }

    /// Whether nothing is missing but further addresses of hosts that have one.
    bool IsUsable() const
    {
        return isAllForNow && std::all_of(seen.begin(), seen.end(), [](const auto& one) {
                   return !one.second.IPv4.empty() || !one.second.IPv6.empty();
               });
    }

    std::vector<VDiscoveredHost> Hosts() const
    {
        std::vector<VDiscoveredHost> hosts;
        for (const auto& [key, one] : seen) {
            hosts.push_back(one.Host);
            hosts.back().Addresses.assign(one.IPv4.begin(), one.IPv4.end());
            hosts.back().Addresses.insert(hosts.back().Addresses.end(), one.IPv6.begin(),
                                          one.IPv6.end());
        }
        return hosts;
    }

    static void OnClient(AvahiClient* client, AvahiClientState state, void* self)
    {
        if (state == AVAHI_CLIENT_FAILURE) {
            static_cast<VBrowser*>(self)->failure = avahi_client_errno(client);
        }
    }

    static void OnBrowser(AvahiServiceBrowser* /*browser*/, AvahiIfIndex interface,
                          AvahiProtocol protocol, AvahiBrowserEvent event, const char* name,
                          const char* type, const char* domain, AvahiLookupResultFlags /*flags*/,
                          void* self)
    {
        auto& browser = *static_cast<VBrowser*>(self);
        switch (event) {
        case AVAHI_BROWSER_NEW:
            browser.Resolve(interface, protocol, name, type, domain);
            break;
        case AVAHI_BROWSER_REMOVE:
            browser.seen.erase({name, InterfaceName(interface)});
            browser.isChanged = true;
            break;
        case AVAHI_BROWSER_ALL_FOR_NOW:
            browser.isAllForNow = true;
            break;
        case AVAHI_BROWSER_FAILURE:
            browser.failure = avahi_client_errno(browser.client.get());
            break;
        case AVAHI_BROWSER_CACHE_EXHAUSTED:
            break;
        }
    }

    void Resolve(AvahiIfIndex interface, AvahiProtocol protocol, const char* name, const char* type,
                 const char* domain)
    {
        const std::string interfaceName = InterfaceName(interface);
        VSeen& one = seen[{name, interfaceName}];
        one.Host.Name = name;
        one.Host.Interface = interfaceName;
        isChanged = true;
        for (const AvahiProtocol wanted : {AVAHI_PROTO_INET, AVAHI_PROTO_INET6}) {
            VResolver resolver(avahi_service_resolver_new(client.get(), interface, protocol, name,
                                                          type, domain, wanted, AvahiLookupFlags{},
                                                          &OnResolver, this));
            if (resolver) {
                resolvers.push_back(std::move(resolver));
                pending.insert(resolvers.back().get());
            }
        }
    }

    static void OnResolver(AvahiServiceResolver* resolver, AvahiIfIndex interface,
                           AvahiProtocol /*protocol*/, AvahiResolverEvent event, const char* name,
                           const char* /*type*/, const char* /*domain*/, const char* hostName,
                           const AvahiAddress* address, std::uint16_t port,
                           AvahiStringList* /*text*/, AvahiLookupResultFlags /*flags*/, void* self)
    {
        auto& browser = *static_cast<VBrowser*>(self);
        browser.pending.erase(resolver);
        const std::string interfaceName = InterfaceName(interface);
        const auto found = browser.seen.find({name, interfaceName});
        if (event != AVAHI_RESOLVER_FOUND || found == browser.seen.end()) {
            return; // it has gone meanwhile, or has no address of that kind
        }
        VSeen& one = found->second;
        one.Host.HostName = hostName;
        one.Host.AdvertisedPort = port;
        const bool isIPv4 = address->proto == AVAHI_PROTO_INET;
        (isIPv4 ? one.IPv4 : one.IPv6).insert(AddressText(*address, interfaceName));
        browser.isChanged = true;
    }

    // Released in reverse: Avahi's objects before the client, the client before what it waits with.
    VPoll poll;
    VClientHandle client;
    VServiceBrowser browser;
    std::vector<VResolver> resolvers;

    std::map<VKey, VSeen> seen;
    std::set<const AvahiServiceResolver*> pending; // those that have not answered yet
    bool isAllForNow = false;
    bool isChanged = false;
    int failure = 0;
};

VDiscovery::VDiscovery() : browser(std::make_unique<VBrowser>()) {}

VDiscovery::~VDiscovery() = default;

std::vector<VDiscoveredHost> VDiscovery::Browse(std::chrono::milliseconds limit,
                                                const IsEnough& isEnough)
{
    return browser->Browse(VDeadline(limit), isEnough);
}

namespace {

std::vector<std::string> AddressesOf(const std::string& name,
                                     const std::vector<VDiscoveredHost>& hosts)
{
    std::vector<std::string> addresses;
    for (const VDiscoveredHost& host : hosts) {
        if (host.Name == name) {
            std::copy_if(host.Addresses.begin(), host.Addresses.end(),
                         std::back_inserter(addresses), &IsIPv4Address);
        }
    }
    return addresses;
}

} // namespace

bool IsIPv4Address(const std::string& text)
{
    in_addr ignored{};
    return inet_pton(AF_INET, text.c_str(), &ignored) == 1;
}

std::vector<std::string> DiscoverAddresses(const std::string& name, std::chrono::milliseconds limit)
{
    VDiscovery discovery;
    return AddressesOf(name, discovery.Browse(limit, [&name](const auto& hosts) {
        return !AddressesOf(name, hosts).empty();
    }));
}

std::string FindHost(const std::string& name, std::chrono::milliseconds limit)
{
    std::string unknown;
    // A blank is in no host's name, and in the name of nearly every service.
    if (name.find(' ') == std::string::npos) {
        try {
            FindAddresses(name, VDeadline(limit));
            return name;
        } catch (const VError& error) {
            if (error.Kind() != EErrorKind::NoConnection) {
                throw;
            }
            unknown = error.what() + std::string("; ");
        }
    }
    std::vector<std::string> addresses;
    try {
        addresses = DiscoverAddresses(name, limit);
    } catch (const VError& error) {
        throw VError(EErrorKind::NoConnection, unknown + "a host that advertises itself as '" +
                                                   name + "' cannot be looked for, as " +
                                                   error.what());
    }
    if (addresses.empty()) {
        throw VError(EErrorKind::NoConnection,
                     unknown + "no host advertises itself as '" + name + "'");
    }
    return addresses.front();
}

} // namespace ControlStream
