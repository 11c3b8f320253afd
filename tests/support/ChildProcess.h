#pragma once

#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <fcntl.h>
#include <functional>
#include <linux/capability.h>
#include <sched.h>
#include <stdexcept>
#include <string>
#include <sys/mount.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

// Work that needs a process of its own: with fewer rights, or with a file system of its own. Only
// for tests whose process has a single thread.

namespace TestSupport {

/// What a child process ends with where the kernel forbids what it needs.
constexpr int notAllowed = 77;

/// Runs work in a child process. @return what the work returned, or -1 if the child died
inline int RunInChild(const std::function<int()>& work)
{
    const pid_t child = fork();
    if (child == 0) {
        int code = 255;
        try {
            code = work();
        } catch (...) {
            // The code tells it: nobody can catch across the border of a process.
        }
        _exit(code);
    }
    int status = 0;
    if (child < 0 || waitpid(child, &status, 0) != child) {
        throw std::runtime_error("no child process");
    }
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

inline bool WriteSystemFile(const char* path, const std::string& text)
{
    const int file = open(path, O_WRONLY | O_CLOEXEC);
    const bool written = file >= 0 && write(file, text.data(), text.size()) > 0;
    close(file);
    return written;
}

/// Puts the calling process into a user namespace where it is the user `id`, and nobody else is.
inline bool EnterUserNamespace(unsigned id, int furtherFlags = 0)
{
    const std::string user = std::to_string(id) + " " + std::to_string(geteuid()) + " 1\n";
    const std::string group = std::to_string(id) + " " + std::to_string(getegid()) + " 1\n";
    return unshare(CLONE_NEWUSER | furtherFlags) == 0 &&
           WriteSystemFile("/proc/self/setgroups", "deny") &&
           WriteSystemFile("/proc/self/uid_map", user) &&
           WriteSystemFile("/proc/self/gid_map", group);
}

/// Gives up every capability, so that the modes of files count for an administrator too.
inline bool DropCapabilities()
{
    __user_cap_header_struct header = {_LINUX_CAPABILITY_VERSION_3, 0};
    const __user_cap_data_struct none[2] = {};
    return syscall(SYS_capset, &header, none) == 0;
}

/// Makes the calling process one of a user without privileges.
inline bool GiveUpPrivileges()
{
    constexpr unsigned ordinaryUser = 1000;
    // Where there is no namespace to be had, as under the thread sanitizer, whose own thread
    // forbids it, an administrator without capabilities is such a user too.
    return (EnterUserNamespace(ordinaryUser) || geteuid() == 0) && DropCapabilities();
}

/// Runs work in a child process as a user without privileges. @return as RunInChild
inline int RunWithoutPrivileges(const std::function<int()>& work)
{
    return RunInChild([&] { return GiveUpPrivileges() ? work() : notAllowed; });
}

/// Runs work in a child process that has an empty file system in memory on a folder.
///
/// @param options  of the file system, such as "size=64k" @return as RunInChild
inline int RunOnSmallDisk(const std::string& folder, const std::string& options,
                          const std::function<int()>& work)
{
    return RunInChild([&] {
        if (!EnterUserNamespace(0, CLONE_NEWNS) ||
            mount("none", folder.c_str(), "tmpfs", 0, options.c_str()) != 0) {
            return notAllowed;
        }
        return work();
    });
}

} // namespace TestSupport
