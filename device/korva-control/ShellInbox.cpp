#include "korva-control/ShellInbox.h"

#include <stdexcept>
#include <utility>

#include <sys/eventfd.h>
#include <unistd.h>

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
    posted.push_back(std::move(function));
    eventfd_write(wake, 1);
}

void VShellInbox::RunAll()
{
    std::vector<std::function<void()>> taken;
    {
        const std::lock_guard<std::mutex> lock(mutex);
        taken.swap(posted);
        eventfd_t ignored = 0;
        eventfd_read(wake, &ignored);
    }
    for (const std::function<void()>& function : taken) {
        function();
    }
}
