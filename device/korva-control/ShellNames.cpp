#include "korva-control/ShellNames.h"

#include <algorithm>

namespace {

bool BeginsWith(const std::string& text, const std::string& start)
{
    return text.compare(0, start.size(), start) == 0;
}

/// Whether the byte there goes on with a character of UTF-8.
bool IsInsideCharacter(const std::string& text, std::size_t position)
{
    return position < text.size() && (static_cast<unsigned char>(text[position]) & 0xC0U) == 0x80U;
}

void AddMatching(std::vector<VCandidate>& candidates, const std::vector<std::string>& names,
                 const std::string& start)
{
    for (const std::string& name : names) {
        if (BeginsWith(name, start)) {
            candidates.push_back({name, true});
        }
    }
}

} // namespace

const std::vector<VShellWord>& ShellWordList()
{
    static const std::vector<VShellWord> words = {
        {"run", "run NAME [PARAMETER=VALUE]...",
         "Run a command of the host; \"run\" may be left out"},
        {"commands", "commands", "List the host's commands"},
        {"describe", "describe NAME", "Describe a command of the host"},
        {"events", "events", "List the host's events"},
        {"describe-event", "describe-event NAME", "Describe an event of the host"},
        {"watch", "watch [EVENT]...", "Show only these events; all where none is given"},
        {"quiet", "quiet", "Show no events"},
        {"info", "info", "Tell how the shell stands with the host"},
        {"authorize", "authorize", "Ask for the authorization again (needs --id)"},
        {"help", "help", "Show this"},
        {"quit", "quit", "Leave, as Ctrl-D does"},
    };
    return words;
}

VShellNames::VShellNames(Describe describeFunction) : describe(std::move(describeFunction)) {}

void VShellNames::Forget()
{
    commands.clear();
    events.clear();
    parameters.clear();
}

bool VShellNames::IsCommand(const std::string& name) const
{
    return std::find(commands.begin(), commands.end(), name) != commands.end();
}

std::vector<VCandidate> VShellNames::Complete(const std::vector<std::string>& words)
{
    std::vector<VCandidate> candidates;
    if (words.empty()) {
        return candidates;
    }
    const std::string& first = words.front();
    const std::string& last = words.back();
    if (words.size() == 1) {
        for (const VShellWord& word : ShellWordList()) {
            AddMatching(candidates, {word.Word}, last);
        }
        AddMatching(candidates, commands, last);
    } else if (first == "describe-event" || first == "watch") {
        AddMatching(candidates, events, last);
    } else if ((first == "describe" || first == "run") && words.size() == 2) {
        AddMatching(candidates, commands, last);
    } else if (first == "run") {
        AddParameters(candidates, words[1], words);
    } else {
        AddParameters(candidates, first, words);
    }
    return candidates;
}

std::string VShellNames::CommonStart(const std::vector<VCandidate>& candidates)
{
    std::string start = candidates.empty() ? std::string() : candidates.front().Word;
    for (const VCandidate& candidate : candidates) {
        const auto end =
            std::mismatch(start.begin(), start.end(), candidate.Word.begin(), candidate.Word.end());
        start.erase(end.first, start.end());
    }
    // No character is left in part.
    while (!start.empty() && IsInsideCharacter(candidates.front().Word, start.size())) {
        start.pop_back();
    }
    return start;
}

/// Parameters that the line has already are not offered again.
void VShellNames::AddParameters(std::vector<VCandidate>& candidates, const std::string& command,
                                const std::vector<std::string>& words)
{
    if (!IsCommand(command)) {
        return;
    }
    const auto [entry, isNew] = parameters.try_emplace(command);
    if (isNew) {
        for (const ControlStream::VParameterInformation& parameter : describe(command)) {
            entry->second.push_back(parameter.Name);
        }
    }
    for (const std::string& name : entry->second) {
        const std::string assignment = name + "=";
        const bool isGiven = std::any_of(words.begin(), words.end() - 1, [&](const auto& word) {
            return BeginsWith(word, assignment);
        });
        // "*" stands for any name, and is none.
        if (name != "*" && !isGiven && BeginsWith(assignment, words.back())) {
            candidates.push_back({assignment, false});
        }
    }
}
