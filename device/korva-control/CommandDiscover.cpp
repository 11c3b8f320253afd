#include "ControlStreamClient/Discovery.h"
#include "korva-control/Commands.h"
#include "korva-control/Session.h"
#include "korva-control/TerminalText.h"

#include <CLI/CLI.hpp>

namespace {

using ControlStream::VDiscoveredHost;

class VCommandDiscover : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        return program.add_subcommand("discover",
                                      "List the hosts that advertise themselves on the network");
    }

    EExitCode Run(VSession& session) override
    {
        ControlStream::VDiscovery discovery;
        const std::vector<VDiscoveredHost> hosts = discovery.Browse(session.TimeLimit());

        for (const VDiscoveredHost& host : hosts) {
            if (session.Output().IsJson()) {
                PrintJson(session.Output(), host, session.Options().Port);
            } else {
                PrintText(session.Output(), host, session.Options().Port);
            }
        }
        if (hosts.empty()) {
            throw ControlStream::VError(ControlStream::EErrorKind::NoConnection,
                                        "no host advertises itself; doctor tells more");
        }
        return EExitCode::Done;
    }

private:
    static void PrintJson(VOutput& output, const VDiscoveredHost& host, std::uint16_t port)
    {
        output.PrintJson({{"name", host.Name},
                          {"host", host.HostName},
                          {"interface", host.Interface},
                          {"addresses", host.Addresses},
                          {"advertisedPort", host.AdvertisedPort},
                          {"port", port}});
    }

    // Deliberate: the advertised port is shown beside the one to connect to. Hosts advertise
    // another port than the one on which they listen.
    static void PrintText(VOutput& output, const VDiscoveredHost& host, std::uint16_t port)
    {
        std::string addresses;
        for (const std::string& address : host.Addresses) {
            addresses += " " + ForTerminal(address);
        }
        output.PrintLine(ForTerminal(host.Name));
        output.PrintLine("  host: " + ForTerminal(host.HostName));
        output.PrintLine("  addresses:" + (addresses.empty() ? " none" : addresses));
        output.PrintLine("  interface: " + ForTerminal(host.Interface));
        output.PrintLine("  advertised port: " + std::to_string(host.AdvertisedPort) +
                         " (the port to connect to is " + std::to_string(port) + ")");
    }
};

} // namespace

std::unique_ptr<ICommand> MakeCommandDiscover()
{
    return std::make_unique<VCommandDiscover>();
}
