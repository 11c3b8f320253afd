#pragma once

#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <stdexcept>
#include <string>
#include <vector>

#include <poll.h>
#include <pty.h>
#include <sys/ioctl.h>
#include <sys/wait.h>
#include <termios.h>
#include <unistd.h>

/// A korva-control at a terminal that the test types into and reads.
///
/// Owns: the process, killed where it is left over, and the terminal. Threads: the test's.
class VPseudoTerminal
{
public:
    explicit VPseudoTerminal(std::vector<std::string> arguments, unsigned short columns = 80)
    {
        arguments.insert(arguments.begin(), KORVA_CONTROL_PROGRAM);
        std::vector<char*> words;
        for (std::string& argument : arguments) {
            words.push_back(argument.data());
        }
        words.push_back(nullptr);
        winsize size{};
        size.ws_col = columns;
        size.ws_row = 24;
        pid = forkpty(&terminal, nullptr, nullptr, &size);
        if (pid == 0) {
            std::signal(SIGINT, SIG_DFL);
            setenv("TERM", "xterm", 1);
            close_range(3, ~0U, 0); // the test's own listening sockets among them
            execv(words[0], words.data());
            _exit(127);
        }
        if (pid < 0) {
            throw std::runtime_error("no terminal");
        }
    }

    ~VPseudoTerminal()
    {
        if (pid > 0) {
            kill(pid, SIGKILL);
            waitpid(pid, nullptr, 0);
        }
        close(terminal);
    }

    VPseudoTerminal(const VPseudoTerminal&) = delete;
    VPseudoTerminal& operator=(const VPseudoTerminal&) = delete;

    void Type(const std::string& keys) const
    {
        if (write(terminal, keys.data(), keys.size()) != static_cast<ssize_t>(keys.size())) {
            throw std::runtime_error("the terminal takes no keys");
        }
    }

    void Resize(unsigned short columns) const
    {
        winsize size{};
        size.ws_col = columns;
        size.ws_row = 24;
        ioctl(terminal, TIOCSWINSZ, &size);
    }

    /// Waits for a text on the screen, behind what earlier calls have found.
    ///
    /// @return everything up to and with it; the test fails by a throw where it does not come
    std::string Expect(const std::string& wanted)
    {
        std::size_t found = 0;
        while ((found = screen.find(wanted)) == std::string::npos) {
            if (!ReadSome()) {
                throw std::runtime_error("not on the screen: " + wanted + "\nbut: " + screen);
            }
        }
        const std::string text = screen.substr(0, found + wanted.size());
        screen.erase(0, text.size());
        return text;
    }

    /// Waits for the end; the test fails by a throw where it does not come.
    ///
    /// @return the exit code, or 128 and the number of a signal
    int Finish()
    {
        while (ReadSome()) {
        }
        int status = 0;
        waitpid(pid, &status, 0);
        pid = -1;
        return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
    }

    void Signal(int number) const { kill(pid, number); }

    /// Stops the program and goes on with it, as a person does by Ctrl-Z and "fg": in between the
    /// terminal is set as the person's own shell has it.
    void StopAndGoOn() const
    {
        int status = 0;
        termios modes{};
        kill(pid, SIGSTOP);
        if (waitpid(pid, &status, WUNTRACED) != pid || !WIFSTOPPED(status) ||
            tcgetattr(terminal, &modes) != 0) {
            throw std::runtime_error("the program does not stop");
        }
        modes.c_lflag |= ICANON | ECHO | ISIG;
        tcsetattr(terminal, TCSANOW, &modes);
        kill(pid, SIGCONT);
    }

private:
    /// @return false at the end; the test fails by a throw where nothing comes any more
    bool ReadSome()
    {
        pollfd descriptor{terminal, POLLIN, 0};
        char bytes[4096];
        if (poll(&descriptor, 1, 60000) == 0) {
            throw std::runtime_error("nothing more on the screen but: " + screen);
        }
        const ssize_t count = read(terminal, bytes, sizeof bytes);
        if (count <= 0) {
            return count < 0 && errno == EINTR;
        }
        screen.append(bytes, static_cast<std::size_t>(count));
        return true;
    }

    pid_t pid = -1;
    int terminal = -1;
    std::string screen; // that Expect has not taken yet
};
