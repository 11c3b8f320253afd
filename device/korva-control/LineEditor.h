#pragma once

#include "korva-control/ShellInput.h"
#include "korva-control/ShellNames.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>

/// Reads lines from a person at a terminal: editing, history, completion, and what is posted in
/// between appears above the line that is being typed, which stays whole. Where standard input is
/// no terminal, lines are taken as they come.
///
/// Owns: the terminal's mode while it reads, and the history with its file. Threads: the main one.
/// Failure: a history that cannot be read or written is gone without a word.
class VLineEditor
{
public:
    /// Returns the ways to go on behind the text left of the cursor.
    using Complete = std::function<std::vector<VCandidate>(const std::vector<std::string>& words)>;

    /// @param historyFile  empty for a history that goes with the program
    VLineEditor(VShellInput& shellInput, const std::string& historyFile, Complete complete);
    ~VLineEditor();
    VLineEditor(const VLineEditor&) = delete;
    VLineEditor& operator=(const VLineEditor&) = delete;

    /// Whether there is a person to type.
    bool IsAtTerminal() const;

    /// Returns the next line without its end; empty at the end of the input, and after SIGTERM.
    std::optional<std::string> ReadLine();

private:
    class VTerminal;

    std::optional<std::string> ReadPlainLine();

    VShellInput& input;
    std::unique_ptr<VTerminal> terminal; // empty where there is none
};
