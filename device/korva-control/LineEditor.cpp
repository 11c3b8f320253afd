#include "korva-control/LineEditor.h"

#include "korva-control/ShellWords.h"
#include "korva-control/TerminalText.h"

#include "ControlStreamClient/Error.h"
#include "utils/WideText.h"

#include <clocale>
#include <cstdio>
#include <cstring>
#include <cwchar>
#include <filesystem>

#include <histedit.h>
#include <langinfo.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

constexpr int HistorySize = 1000;
constexpr wchar_t KillLine = L'\x15'; // what Ctrl-U types

/// The library below writes characters by the locale's encoding; this program speaks UTF-8 only.
void ChooseUtf8()
{
    std::setlocale(LC_CTYPE, "");
    if (std::strcmp(nl_langinfo(CODESET), "UTF-8") != 0) {
        std::setlocale(LC_CTYPE, "C.UTF-8");
    }
}

wchar_t* Prompt(EditLine* /*editor*/)
{
    static wchar_t text[] = L"korva> ";
    return text;
}

int WidthOf(const wchar_t* begin, const wchar_t* end)
{
    int width = 0;
    for (; begin < end; ++begin) {
        const int one = wcwidth(*begin);
        width += one > 0 ? one : 0;
    }
    return width;
}

} // namespace

/// The editor at a terminal.
class VLineEditor::VTerminal
{
public:
    VTerminal(VShellInput& shellInput, std::string historyFile, Complete completeFunction)
        : input(shellInput), file(std::move(historyFile)), complete(std::move(completeFunction))
    {
        ChooseUtf8();
        editor = el_init("korva-control", stdin, stdout, stderr);
        history = history_winit();
        if (editor == nullptr || history == nullptr) {
            throw std::runtime_error("the terminal cannot be used");
        }
        SetUpHistory();
        SetUpEditor();
    }

    ~VTerminal()
    {
        SaveHistory();
        history_wend(history);
        el_end(editor);
    }

    VTerminal(const VTerminal&) = delete;
    VTerminal& operator=(const VTerminal&) = delete;

    std::optional<std::string> ReadLine()
    {
        int count = 0;
        const wchar_t* const line = el_wgets(editor, &count);
        if (line == nullptr || count <= 0 || input.IsTerminated()) {
            std::fputs("\n", stdout);
            return std::nullopt;
        }
        std::wstring text(line, static_cast<std::size_t>(count));
        text.erase(text.find_last_not_of(L"\r\n") + 1);
        if (text.find_first_not_of(L" \t") != std::wstring::npos) {
            HistEventW event{};
            history_w(history, &event, H_ENTER, text.c_str());
        }
        return KVR::WideToUtf8(text);
    }

private:
    static VTerminal& Of(EditLine* editor)
    {
        void* owner = nullptr;
        el_wget(editor, EL_CLIENTDATA, &owner);
        return *static_cast<VTerminal*>(owner);
    }

    static int ReadCharacter(EditLine* editor, wchar_t* character)
    {
        return Of(editor).Read(*character);
    }

    static unsigned char CompleteWord(EditLine* editor, int /*key*/)
    {
        return Of(editor).CompleteHere();
    }

    void SetUpHistory()
    {
        HistEventW event{};
        history_w(history, &event, H_SETSIZE, HistorySize);
        history_w(history, &event, H_SETUNIQUE, 1);
        if (!file.empty()) {
            history_w(history, &event, H_LOAD, file.c_str());
        }
    }

    void SetUpEditor()
    {
        el_wset(editor, EL_CLIENTDATA, this);
        el_wset(editor, EL_PROMPT, &Prompt);
        el_wset(editor, EL_EDITOR, L"emacs");
        el_wset(editor, EL_SIGNAL, 0); // signals are heard beside what is typed
        el_wset(editor, EL_HIST, history_w, history);
        el_wset(editor, EL_GETCFN, &ReadCharacter);
        el_wset(editor, EL_ADDFN, L"complete-name", L"Complete a name", &CompleteWord);
        el_wset(editor, EL_BIND, L"^I", L"complete-name", nullptr);
        el_wset(editor, EL_BIND, L"^R", L"em-inc-search-prev", nullptr);
        SetUpModes();
    }

    /// What is typed while a command runs is kept as it is: in the usual mode the terminal takes a
    /// Ctrl-D for itself, and would echo the rest between the lines that the command prints.
    /// Within a line Ctrl-C is a key like any other, since the signal overtakes what was typed
    /// before it; while a command runs it is a signal, and ends the wait.
    void SetUpModes()
    {
        el_wset(editor, EL_SETTY, L"-x", L"-icanon", L"-echo", nullptr);
        el_wset(editor, EL_SETTY, L"-d", L"intr=", nullptr);
        el_wset(editor, EL_BIND, L"^C", L"em-kill-line", nullptr);
    }

    /// Others on the machine need not know what was typed.
    void SaveHistory()
    {
        if (file.empty()) {
            return;
        }
        std::error_code ignored;
        std::filesystem::create_directories(std::filesystem::path(file).parent_path(), ignored);
        const mode_t mask = umask(077);
        HistEventW event{};
        history_w(history, &event, H_SAVE, file.c_str());
        umask(mask);
    }

    /// @return 1 with a character, 0 at the end
    int Read(wchar_t& character)
    {
        for (;;) {
            switch (input.Wait(true)) {
            case EShellInput::Ready:
                return ReadTyped(character);
            case EShellInput::Interrupted:
                character = KillLine;
                return 1;
            case EShellInput::Posted:
                ShowPosted();
                if (VShellInput::HasTyped()) {
                    return ReadTyped(character); // though more is posted all the time
                }
                break;
            case EShellInput::Resized:
                el_resize(editor);
                break;
            case EShellInput::Resumed:
                ShowAgain();
                break;
            case EShellInput::Terminated:
            case EShellInput::Ended:
                return 0;
            }
        }
    }

    static int ReadTyped(wchar_t& character)
    {
        std::mbstate_t state{};
        for (;;) {
            char byte = 0;
            if (!VShellInput::ReadByte(byte)) {
                return 0;
            }
            const std::size_t used = std::mbrtowc(&character, &byte, 1, &state);
            if (used == static_cast<std::size_t>(-1)) {
                character = L'\xFFFD';
                return 1;
            }
            if (used != static_cast<std::size_t>(-2)) {
                return 1;
            }
        }
    }

    /// Takes the typed line off the screen, lets others print, and puts it back below.
    void ShowPosted()
    {
        HideLine();
        input.Inbox().RunSome();
        std::fflush(stdout);
        el_wset(editor, EL_REFRESH);
    }

    /// Takes the terminal back from the shell that had it while this program was stopped.
    void ShowAgain()
    {
        el_wset(editor, EL_PREP_TERM, 0); // else the editor believes that its mode is still set
        el_wset(editor, EL_PREP_TERM, 1);
        el_wset(editor, EL_REFRESH);
    }

    void HideLine()
    {
        const LineInfoW* const line = el_wline(editor);
        int columns = 0;
        el_wget(editor, EL_GETTC, "co", &columns);
        const int before =
            static_cast<int>(std::wcslen(Prompt(editor))) + WidthOf(line->buffer, line->cursor);
        if (columns > 0 && before >= columns) {
            std::printf("\x1B[%dA", before / columns);
        }
        std::fputs("\r\x1B[J", stdout);
        std::fflush(stdout);
    }

    unsigned char CompleteHere()
    {
        const LineInfoW* const line = el_wline(editor);
        const std::string left = KVR::WideToUtf8(
            std::wstring(line->buffer, static_cast<std::size_t>(line->cursor - line->buffer)));
        std::vector<std::string> words;
        try {
            words = SplitWords(left);
        } catch (const ControlStream::VError&) {
            return CC_ERROR; // inside of a quote
        }
        if (left.empty() || left.back() == ' ') {
            words.emplace_back();
        }
        const std::vector<VCandidate> candidates = complete(words);
        if (candidates.empty()) {
            return CC_ERROR;
        }
        std::string more = VShellNames::CommonStart(candidates).substr(words.back().size());
        if (more.empty() && candidates.size() > 1) {
            List(candidates);
            return CC_REDISPLAY;
        }
        more = QuotedWord(more);
        if (candidates.size() == 1 && candidates.front().IsWhole) {
            more += ' ';
        }
        return el_winsertstr(editor, KVR::Utf8ToWide(more).c_str()) == 0 ? CC_REFRESH : CC_ERROR;
    }

    void List(const std::vector<VCandidate>& candidates)
    {
        HideLine();
        for (const VCandidate& candidate : candidates) {
            std::printf("  %s\n", ForTerminal(candidate.Word).c_str());
        }
        std::fflush(stdout);
        el_wset(editor, EL_REFRESH);
    }

    VShellInput& input;
    const std::string file;
    const Complete complete;
    EditLine* editor = nullptr;
    HistoryW* history = nullptr;
};

VLineEditor::VLineEditor(VShellInput& shellInput, const std::string& historyFile, Complete complete)
    : input(shellInput)
{
    if (isatty(STDIN_FILENO) != 0 && isatty(STDOUT_FILENO) != 0) {
        terminal = std::make_unique<VTerminal>(shellInput, historyFile, std::move(complete));
    }
}

VLineEditor::~VLineEditor() = default;

bool VLineEditor::IsAtTerminal() const
{
    return terminal != nullptr;
}

std::optional<std::string> VLineEditor::ReadLine()
{
    return terminal ? terminal->ReadLine() : ReadPlainLine();
}

std::optional<std::string> VLineEditor::ReadPlainLine()
{
    std::string line;
    for (;;) {
        switch (input.Wait(true)) {
        case EShellInput::Posted:
            input.Inbox().RunSome();
            break;
        case EShellInput::Ready: {
            char byte = 0;
            if (!VShellInput::ReadByte(byte)) {
                return line.empty() ? std::nullopt : std::optional(line);
            }
            if (byte == '\n') {
                line.erase(line.find_last_not_of('\r') + 1);
                return line;
            }
            line += byte;
            break;
        }
        case EShellInput::Resized:
        case EShellInput::Resumed:
            break;
        case EShellInput::Interrupted:
        case EShellInput::Terminated:
        case EShellInput::Ended:
            return std::nullopt;
        }
    }
}
