#include "korva-control/ShellInput.h"

#include <cerrno>
#include <stdexcept>

#include <poll.h>
#include <sys/signalfd.h>
#include <unistd.h>

VShellInput::VShellInput(VShellInbox& shellInbox) : inbox(shellInbox)
{
    sigset_t heard{};
    sigemptyset(&heard);
    sigaddset(&heard, SIGINT);
    sigaddset(&heard, SIGTERM);
    sigaddset(&heard, SIGWINCH);
    sigaddset(&heard, SIGCONT);
    pthread_sigmask(SIG_BLOCK, &heard, &previous);
    signals = signalfd(-1, &heard, SFD_CLOEXEC | SFD_NONBLOCK);
    if (signals < 0) {
        pthread_sigmask(SIG_SETMASK, &previous, nullptr);
        throw std::runtime_error("no descriptor is free");
    }
}

VShellInput::~VShellInput()
{
    close(signals);
    pthread_sigmask(SIG_SETMASK, &previous, nullptr);
}

EShellInput VShellInput::Wait(bool reads)
{
    for (;;) {
        pollfd descriptors[] = {{signals, POLLIN, 0},
                                {inbox.Descriptor(), POLLIN, 0},
                                {reads ? STDIN_FILENO : -1, POLLIN, 0}};
        if (poll(descriptors, 3, -1) < 0 && errno != EINTR) {
            return EShellInput::Ended;
        }
        if (descriptors[0].revents != 0) {
            return ReadSignal();
        }
        if (descriptors[1].revents != 0) {
            return EShellInput::Posted;
        }
        if (descriptors[2].revents != 0) {
            return EShellInput::Ready;
        }
    }
}

bool VShellInput::HasTyped()
{
    pollfd descriptor{STDIN_FILENO, POLLIN, 0};
    return poll(&descriptor, 1, 0) > 0;
}

bool VShellInput::ReadByte(char& byte)
{
    ssize_t count = 0;
    do {
        count = read(STDIN_FILENO, &byte, 1);
    } while (count < 0 && errno == EINTR);
    return count == 1;
}

EShellInput VShellInput::ReadSignal()
{
    signalfd_siginfo information{};
    if (read(signals, &information, sizeof information) != sizeof information) {
        return EShellInput::Posted; // it was taken back: look at the rest again
    }
    switch (information.ssi_signo) {
    case SIGINT:
        return EShellInput::Interrupted;
    case SIGWINCH:
        return EShellInput::Resized;
    case SIGCONT:
        return EShellInput::Resumed;
    default:
        terminated = true;
        return EShellInput::Terminated;
    }
}
