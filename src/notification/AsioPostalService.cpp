#include "notification/AsioPostalService.h"

#include "DebugServices/CrashHandlerForThread.h"
#include "DebugServices/ThreadName.h"
#include "DebugServices/UncaughtException.h"
#include "notification/GuardedCall.h"

#include <boost/asio/io_service.hpp>
#include <boost/system/system_error.hpp>
#include <boost/thread/thread.hpp>

#include <sys/resource.h>
#include <unistd.h>

#include <utility>

namespace NotificationSystem {

namespace {

/// What a thread knows of its service: copies and references of its own, so that a function which
/// runs on it may release the service.
struct VThreadContext
{
    std::string ThreadName;
    std::shared_ptr<boost::asio::io_service> IOService;
    std::weak_ptr<const void> Work; // expired once the service has been stopped
    std::shared_ptr<const std::atomic<std::uint32_t>> Starts;
    std::uint32_t Start = 0; // the one to which this thread belongs
};

/// A function on its way through the queue.
class VPostedItem
{
public:
    VPostedItem(boost::function<void()> posted, std::uintptr_t travelling)
        : function(std::move(posted)), token(travelling)
    {
    }

    void operator()() const { KVR::GuardedCall(function); } // a dead target is no error

private:
    boost::function<void()> function;
    [[maybe_unused]] std::uintptr_t token;
};

/// While it lives, a function that the calling thread runs on the I/O service does not count as
/// work of it: the other threads would never see the end of the work, and the caller waits for
/// them.
class VCallersWorkExcluded
{
public:
    explicit VCallersWorkExcluded(boost::asio::io_service& ioService)
        : executor(ioService.get_executor()), excluded(executor.running_in_this_thread())
    {
        if (excluded) {
            executor.on_work_finished();
        }
    }
    ~VCallersWorkExcluded()
    {
        if (excluded) {
            executor.on_work_started();
        }
    }

    VCallersWorkExcluded(const VCallersWorkExcluded&) = delete;
    VCallersWorkExcluded& operator=(const VCallersWorkExcluded&) = delete;

private:
    const boost::asio::io_service::executor_type executor;
    const bool excluded;
};

void RaisePriority()
{
    // Deliberate: every postal thread runs a step above the process's others, since devices wait
    // for it. Without the right to raise itself a thread runs as it is. Linux takes 0 for the
    // calling thread alone, which begins with the niceness of whoever made it: the step counts from
    // the first thread of the process, as a postal thread may have made this one.
    constexpr int stepAbove = -1;
    const int normal = getpriority(PRIO_PROCESS, static_cast<id_t>(getpid()));
    static_cast<void>(setpriority(PRIO_PROCESS, 0, normal + stepAbove));
}

/// Runs queued functions and completions until the service has been stopped and nothing is left.
///
/// It is `io_service::run` taken one function at a time, since two things may happen after a
/// function has stopped its own service. The service may be started again while this thread is
/// still in that function: then others have taken over, and this thread leaves. And the I/O service
/// may mark itself as stopped, for lack of work, after a new start has cleared that mark.
void RunUntilDone(const VThreadContext& context)
{
    while (context.Starts->load() == context.Start) {
        boost::system::error_code error;
        const bool handledOne = context.IOService->run_one(error) != 0;
        if (error) {
            throw boost::system::system_error(error);
        }
        if (handledOne) {
            continue;
        }
        if (context.Work.expired()) {
            return;
        }
        context.IOService->reset();
    }
}

void Run(const VThreadContext& context)
{
    const DebugServices::VCrashHandlerForThread crashHandler;
    DebugServices::SetThreadName(context.ThreadName.c_str());
    RaisePriority();
    RunUntilDone(context);
}

/// The whole of a thread. The last reference to the I/O service may go with the context, and with
/// it functions that are still queued.
void RunAndReport(VThreadContext&& given)
{
    const VThreadContext context = std::move(given);
    try {
        Run(context);
    } catch (...) {
        DebugServices::ReportUncaughtException("Notification");
    }
}

} // namespace

/// Keeps the I/O service running while it has nothing to do.
class VAsioPostalService::VWork
{
public:
    explicit VWork(boost::asio::io_service& ioService) : work(ioService) {}

private:
    const boost::asio::io_service::work work;
};

VAsioPostalService::VAsioPostalService(std::string threadNames, std::uint32_t threadCount,
                                       std::int32_t unused)
    : name(std::move(threadNames)),
      option(unused),
      ioService(std::make_shared<boost::asio::io_service>()),
      starts(std::make_shared<std::atomic<std::uint32_t>>(0))
{
    static_cast<void>(Start(threadCount)); // false for no threads, which is what was asked for
}

VAsioPostalService::~VAsioPostalService()
{
    try {
        static_cast<void>(Stop());
    } catch (...) {
        // Only waiting for a thread can have failed. The threads hold what they need and end by
        // themselves, and there is nobody here to tell.
    }
}

void VAsioPostalService::Post(boost::function<void()> function, std::uintptr_t token)
{
    // Held to the end, since the function may release this object before the call below returns.
    const std::shared_ptr<boost::asio::io_service> held = ioService;
    held->post(VPostedItem(std::move(function), token));
}

boost::asio::io_service& VAsioPostalService::GetIOService()
{
    return *ioService;
}

std::shared_ptr<boost::asio::io_service> VAsioPostalService::GetIOServicePtr()
{
    return ioService;
}

bool VAsioPostalService::Start(std::uint32_t threadCount)
{
    KVR::VMutexLock lock(mutex);
    if (work || threadCount == 0) {
        return false;
    }

    work = std::make_shared<VWork>(*ioService);
    // After the work, since without any the I/O service would mark itself as stopped once more. It
    // does so whenever the queue runs empty after a function has stopped its own service.
    ioService->reset();
    const std::uint32_t start = ++*starts;
    try {
        for (std::uint32_t index = 0; index < threadCount; ++index) {
            VThreadContext context{name + std::to_string(index), ioService, work, starts, start};
            threads.emplace_back(
                [context = std::move(context)]() mutable { RunAndReport(std::move(context)); });
        }
    } catch (...) {
        EndThreads();
        throw;
    }
    return true;
}

bool VAsioPostalService::Stop()
{
    KVR::VMutexLock lock(mutex);
    if (!work) {
        return false;
    }
    EndThreads();
    return true;
}

void VAsioPostalService::EndThreads()
{
    // Whoever interrupts the calling thread must not leave it with threads that are still at work.
    const boost::this_thread::disable_interruption uninterrupted;

    work.reset();
    std::vector<boost::thread> ending;
    ending.swap(threads);
    {
        const VCallersWorkExcluded excluded(*ioService);
        for (boost::thread& thread : ending) {
            if (thread.get_id() == boost::this_thread::get_id()) {
                thread.detach(); // ends by itself, after the function that called here
            } else {
                thread.join();
            }
        }
    }
    ioService->reset();
}

} // namespace NotificationSystem
