#pragma once

#include "korva-control/LineEditor.h"
#include "korva-control/Output.h"
#include "korva-control/ShellInput.h"
#include "korva-control/ShellNames.h"

#include "ControlStreamClient/AsyncClient.h"

#include <optional>
#include <set>
#include <string>
#include <vector>

struct VShellOptions
{
    ControlStream::VAsyncOptions Client; ///< its functions are the shell's
    std::string HistoryFile;             ///< empty for none
    std::string Peer;                    ///< the host for people
};

/// A person's conversation with a host: lines are commands, and events appear as they come.
///
/// Owns: the client and the terminal. Threads: the main one. Failure: what goes wrong with a line
/// is told, and the next line is read; only the output's failure ends it.
class VShell
{
public:
    VShell(const VShellOptions& shellOptions, VOutput& shellOutput);

    /// Reads and does lines until the user leaves.
    void Run();

private:
    enum class EColour { Plain, Event, Notice, Failure };
    using Words = std::vector<std::string>;

    ControlStream::VAsyncOptions ClientOptions(ControlStream::VAsyncOptions options);
    bool DoLine(const std::string& line);
    void DoWords(const Words& words);
    void RunCommand(const std::string& name, const Words& assignments);
    void Describe(const std::string& name);
    void DescribeEvent(const std::string& name);
    void PrintList(const char* key, const std::vector<std::string>& names);
    void PrintHelp();
    void PrintInfo();
    void PrintReply(const std::string& name, const ControlStream::VCommandReply& reply);
    void LimitEvents();
    void OnEvent(const ControlStream::VEvent& event);
    void OnStatus(const ControlStream::VAsyncStatus& status);
    void LoadNames();
    std::vector<ControlStream::VParameterInformation> ParametersOf(const std::string& command);
    void Print(EColour colour, const std::string& line);
    template <typename TResult, typename TStart>
    TResult Await(const TStart& start);

    const VShellOptions options;
    VOutput& output;
    const bool colours;
    VShellInbox inbox;
    VShellInput input; // before the client, whose thread inherits the blocked signals
    VShellNames names;
    bool showsEvents = true;
    std::set<std::string> shownEvents; // all where it is empty
    std::optional<ControlStream::VAsyncStatus> shownStatus;
    VLineEditor editor;
    ControlStream::VAsyncClient client; // last: its functions use the inbox
};
