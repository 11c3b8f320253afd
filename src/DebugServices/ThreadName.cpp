#include "DebugServices/ThreadName.h"

#include "DebugServices/ThreadNameText.h"

#include <pthread.h>

#include <atomic>
#include <cstring>

namespace DebugServices {

namespace {

/// What a crash report reads on this thread. In the static part of thread storage, since a signal
/// handler must not be the one who makes the thread's part of it.
__attribute__((tls_model("initial-exec"))) thread_local const char* volatile nameText = nullptr;

/// The whole name of a thread.
class VNameOfThread
{
public:
    ~VNameOfThread() { nameText = nullptr; }

    void Set(const char* name)
    {
        nameText = nullptr;
        std::atomic_signal_fence(std::memory_order_seq_cst); // a crash here reports no name
        text = name;
        std::atomic_signal_fence(std::memory_order_seq_cst);
        nameText = text.c_str();
    }

private:
    std::string text;
};

thread_local VNameOfThread nameOfThread;

} // namespace

void SetThreadName(const char* name)
{
    nameOfThread.Set(name != nullptr ? name : "");

    // The kernel refuses a name above 15 bytes as a whole, so it is given the beginning. It cannot
    // fail then, and a thread without a name in the debugger would still be a working thread.
    constexpr std::size_t kernelLength = 15;
    const std::string beginning(nameText, strnlen(nameText, kernelLength));
    (void)pthread_setname_np(pthread_self(), beginning.c_str());
}

std::string GetThreadName()
{
    const char* const name = nameText;
    if (name != nullptr) {
        return name;
    }
    char kernelName[16] = ""; // the kernel's length and the zero
    (void)pthread_getname_np(pthread_self(), kernelName, sizeof kernelName);
    return kernelName;
}

const char* ThreadNameText()
{
    return nameText;
}

} // namespace DebugServices
