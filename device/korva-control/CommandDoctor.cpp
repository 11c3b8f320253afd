#include "ControlStreamClient/Discovery.h"
#include "ControlStreamClient/Error.h"
#include "ControlStreamClient/HostAddress.h"
#include "ControlStreamClient/NetworkInterfaces.h"
#include "korva-control/Commands.h"
#include "korva-control/PortProbe.h"
#include "korva-control/Session.h"
#include "korva-control/TerminalText.h"

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstdio>
#include <system_error>

#include <arpa/inet.h>

#include <CLI/CLI.hpp>

namespace {

using ControlStream::EErrorKind;
using ControlStream::VDiscoveredHost;
using ControlStream::VError;

/// What a step found, in words.
struct VFinding
{
    bool IsGood = false;
    std::string Text;
};

/// A host to look at: what the user or the network calls it, and the addresses that it advertises.
struct VTarget
{
    std::string Name;
    bool IsAdvertised = false;
    std::vector<std::string> Addresses;
};

/// Runs the steps and prints what each found with the time that it took.
class VReport
{
public:
    explicit VReport(VOutput& reportOutput) : output(reportOutput) {}

    /// @param look  returns what it found; a VError that leaves it is a problem
    template <typename TLook>
    bool Step(const std::string& step, TLook look)
    {
        const auto start = std::chrono::steady_clock::now();
        VFinding finding;
        try {
            finding = look();
        } catch (const VError& error) {
            finding.Text = error.what();
        }
        const std::chrono::duration<double, std::milli> time =
            std::chrono::steady_clock::now() - start;
        Print(step, finding, std::round(time.count() * 10) / 10);
        return finding.IsGood;
    }

private:
    void Print(const std::string& step, const VFinding& finding, double milliseconds)
    {
        if (output.IsJson()) {
            output.PrintJson({{"step", step},
                              {"ok", finding.IsGood},
                              {"milliseconds", milliseconds},
                              {"text", finding.Text}});
            return;
        }
        char time[64];
        std::snprintf(time, sizeof time, " (%.1f ms)", milliseconds);
        output.PrintLine((finding.IsGood ? "ok       " : "problem  ") + step + ": " +
                         ForTerminal(finding.Text) + time);
    }

    VOutput& output;
};

std::string InterfacesText()
{
    std::string text;
    for (const ControlStream::VNetworkInterface& one : ControlStream::ListNetworkInterfaces()) {
        text += (text.empty() ? "" : ", ") + one.Name;
        text += one.Addresses.empty() ? " (no address)" : " (" + one.Addresses.front() + ")";
    }
    return text.empty() ? "no network interface, as none is up" : text;
}

VFinding AdvertisementFinding(const std::vector<VDiscoveredHost>& hosts)
{
    if (hosts.empty()) {
        return {false, "no host advertises itself; looked on " + InterfacesText() +
                           ". The host may not run, may be on another network, or a firewall "
                           "between may drop multicast to UDP port 5353"};
    }
    std::string text;
    for (const VDiscoveredHost& host : hosts) {
        text += (text.empty() ? "'" : ", '") + host.Name + "' on " + host.Interface;
    }
    return {true, text};
}

VFinding PortFinding(const std::string& peer, int error)
{
    switch (error) {
    case 0:
        return {true, peer + " is open"};
    case ECONNREFUSED:
        return {false, peer + " is closed: the machine is there, but nothing listens on this port. "
                              "Is the host running, and may it bind the port?"};
    case ETIMEDOUT:
        return {false, peer + " is filtered: nothing comes back at all. The machine may be off, or "
                              "a firewall drops what is sent to this port"};
    default:
        return {false, peer + " cannot be reached: " + std::generic_category().message(error)};
    }
}

VFinding AnswerFinding(const VError& error, const std::string& peer)
{
    switch (error.Kind()) {
    case EErrorKind::TimedOut:
        return {false, "something listens on " + peer +
                           ", but does not answer in this protocol: " + error.what()};
    case EErrorKind::Protocol:
        return {false, "what listens on " + peer + " speaks another protocol: " + error.what()};
    case EErrorKind::Closed:
        return {false,
                "what listens on " + peer + " hangs up instead of answering: " + error.what()};
    case EErrorKind::Usage:
    case EErrorKind::NoConnection:
        break;
    }
    return {false, error.what()};
}

class VCommandDoctor : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        return program.add_subcommand(
            "doctor", "Find out what is wrong between this device and a host, step by step");
    }

    EExitCode Run(VSession& session) override
    {
        VReport report(session.Output());
        const std::vector<VDiscoveredHost> hosts = Look(report, session.TimeLimit());
        EExitCode result = EExitCode::Done;
        for (const VTarget& target : Targets(session, hosts)) {
            const EExitCode one = Examine(report, session, target);
            result = result == EExitCode::Done ? one : result;
        }
        return result;
    }

private:
    /// Looks for advertisements. That there are none keeps nobody from connecting by address.
    static std::vector<VDiscoveredHost> Look(VReport& report, std::chrono::milliseconds limit)
    {
        std::unique_ptr<ControlStream::VDiscovery> discovery;
        std::vector<VDiscoveredHost> hosts;
        const bool isRunning = report.Step("DNS-SD service", [&]() -> VFinding {
            discovery = std::make_unique<ControlStream::VDiscovery>();
            return {true, "one is running on this machine"};
        });
        if (isRunning) {
            report.Step("advertisement", [&] {
                hosts = discovery->Browse(limit);
                return AdvertisementFinding(hosts);
            });
        }
        return hosts;
    }

    /// The host that the user named; else all that advertise themselves, each once; else the one
    /// that every command takes where none is named.
    static std::vector<VTarget> Targets(const VSession& session,
                                        const std::vector<VDiscoveredHost>& hosts)
    {
        std::vector<VTarget> targets;
        if (!session.Options().IsHostGiven) {
            for (const VDiscoveredHost& host : hosts) {
                const bool isKnown =
                    std::any_of(targets.begin(), targets.end(),
                                [&](const VTarget& one) { return one.Name == host.Name; });
                if (!isKnown) {
                    targets.push_back({host.Name, true, host.Addresses});
                }
            }
        }
        if (targets.empty()) {
            targets.push_back({session.Options().Host, false, {}});
        }
        return targets;
    }

    static EExitCode Examine(VReport& report, VSession& session, const VTarget& target)
    {
        const std::chrono::milliseconds limit = session.TimeLimit();
        std::string address;
        if (!report.Step("address", [&]() -> VFinding {
                address = AddressOf(target, limit);
                return {true, "'" + target.Name + "' is at " + address};
            })) {
            return EExitCode::NoConnection;
        }
        const std::uint16_t port = session.Options().Port;
        const std::string peer = address + ":" + std::to_string(port);
        if (!report.Step("port",
                         [&] { return PortFinding(peer, ProbePort(address, port, limit)); })) {
            return EExitCode::NoConnection;
        }
        EExitCode result = EExitCode::HostFailed;
        report.Step("answer", [&] { return Ask(address, port, limit, result); });
        return result;
    }

    /// Returns the target's IPv4 address: hosts listen on no other.
    static std::string AddressOf(const VTarget& target, std::chrono::milliseconds limit)
    {
        if (target.IsAdvertised) {
            const auto found = std::find_if(target.Addresses.begin(), target.Addresses.end(),
                                            &ControlStream::IsIPv4Address);
            if (found == target.Addresses.end()) {
                throw VError(EErrorKind::NoConnection,
                             "'" + target.Name + "' advertises no IPv4 address");
            }
            return *found;
        }
        const std::string host = ControlStream::FindHost(target.Name, limit);
        const in_addr address =
            ControlStream::FindAddresses(host, ControlStream::VDeadline(limit)).front();
        char text[INET_ADDRSTRLEN] = "";
        inet_ntop(AF_INET, &address, text, sizeof text);
        return text;
    }

    static VFinding Ask(const std::string& address, std::uint16_t port,
                        std::chrono::milliseconds limit, EExitCode& result)
    {
        try {
            ControlStream::VClient client;
            client.SetTimeLimit(limit);
            client.Connect(address, port, limit);
            const ControlStream::VServerInformation information = client.GetServerInformation();
            result = EExitCode::Done;
            return {true, "a host answers with control stream " +
                              std::to_string(information.Major) + "." +
                              std::to_string(information.Minor)};
        } catch (const VError& error) {
            result = error.Kind() == EErrorKind::TimedOut   ? EExitCode::TimedOut
                     : error.Kind() == EErrorKind::Protocol ? EExitCode::HostFailed
                                                            : EExitCode::NoConnection;
            return AnswerFinding(error, address + ":" + std::to_string(port));
        }
    }
};

} // namespace

std::unique_ptr<ICommand> MakeCommandDoctor()
{
    return std::make_unique<VCommandDoctor>();
}
