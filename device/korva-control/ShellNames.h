#pragma once

#include "ControlStreamClient/Records.h"

#include <functional>
#include <map>
#include <string>
#include <vector>

/// One way to go on with a word that is being typed.
struct VCandidate
{
    std::string Word; ///< the whole of it
    bool IsWhole;     ///< a blank may follow; else the user has to go on, as behind "="
};

/// The names that a host has told, and what can be typed because of them.
///
/// Threads: the main thread.
class VShellNames
{
public:
    /// Asks the host for the parameters of a command; may return none.
    using Describe = std::function<std::vector<ControlStream::VParameterInformation>(
        const std::string& command)>;

    explicit VShellNames(Describe describeFunction);

    void SetCommands(const std::vector<std::string>& names) { commands = names; }
    void SetEvents(const std::vector<std::string>& names) { events = names; }

    /// Forgets what was told: another host may answer now.
    void Forget();

    bool IsCommand(const std::string& name) const;

    /// Returns how the last of the words can go on; an empty last word begins a new one. Without
    /// any words there is nothing to go on with.
    std::vector<VCandidate> Complete(const std::vector<std::string>& words);

    /// The longest text of whole characters with which all candidates begin.
    static std::string CommonStart(const std::vector<VCandidate>& candidates);

private:
    void AddParameters(std::vector<VCandidate>& candidates, const std::string& command,
                       const std::vector<std::string>& words);

    const Describe describe;
    std::vector<std::string> commands;
    std::vector<std::string> events;
    std::map<std::string, std::vector<std::string>> parameters; // by command
};

/// The shell's own words, with a line of help for each.
struct VShellWord
{
    const char* Word;
    const char* Usage;
    const char* Help;
};

const std::vector<VShellWord>& ShellWordList();
