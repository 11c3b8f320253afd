#include "korva-control/ShellInbox.h"

#include <stdexcept>
#include <utility>
#include <vector>

#include <sys/eventfd.h>
#include <unistd.h>

namespace {

constexpr std::size_t mostAtOnce = 100;

} // namespace

VShellInbox::VShellInbox() : wake(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK))
{
    if (wake < 0) {
        throw std::runtime_error("no descriptor is free");
    }
}

VShellInbox::~VShellInbox()
{
    close(wake);
}

void VShellInbox::Post(std::function<void()> function)
{
    const std::lock_guard<std::mutex> lock(mutex);
    Add(std::move(function));
}

void VShellInbox::PostEvent(std::function<void()> function)
{
    const std::lock_guard<std::mutex> lock(mutex);
    if (leftOut > 0 || posted.size() >= eventLimit) {
        ++leftOut;
    } else {
        Add(std::move(function));
    }
}

void VShellInbox::LimitEvents(std::size_t limit, OnLeftOut onLeftOut)
{
    tellLeftOut = std::move(onLeftOut);
    const std::lock_guard<std::mutex> lock(mutex);
    eventLimit = limit;
}

void VShellInbox::RunSome()
{
    std::vector<std::function<void()>> taken;
    std::size_t missing = 0;
    {
        const std::lock_guard<std::mutex> lock(mutex);
        while (!posted.empty() && taken.size() < mostAtOnce) {
            taken.push_back(std::move(posted.front()));
            posted.pop_front();
        }
        if (posted.empty()) {
            missing = std::exchange(leftOut, 0);
            eventfd_t ignored = 0;
            eventfd_read(wake, &ignored);
        }
    }
    for (const std::function<void()>& function : taken) {
        function();
    }
    if (missing > 0) {
        tellLeftOut(missing);
    }
}

void VShellInbox::Add(std::function<void()> function)
{
    posted.push_back(std::move(function));
    eventfd_write(wake, 1);
}
