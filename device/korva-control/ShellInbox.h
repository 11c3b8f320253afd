#pragma once

#include <functional>
#include <mutex>
#include <vector>

/// What other threads want the main thread to do.
///
/// Owns: the functions, and a descriptor that is readable while there are any. Threads: Post [any],
/// the rest the main thread.
class VShellInbox
{
public:
    VShellInbox();
    ~VShellInbox();
    VShellInbox(const VShellInbox&) = delete;
    VShellInbox& operator=(const VShellInbox&) = delete;

    void Post(std::function<void()> function);

    int Descriptor() const { return wake; }

    /// Runs what was posted, in order.
    void RunAll();

private:
    const int wake;
    std::mutex mutex; // guards the functions, and that the descriptor tells of them
    std::vector<std::function<void()>> posted;
};
