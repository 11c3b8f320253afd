#include "MainThreadWakeUp.h"

#include <QSocketNotifier>

#include <cerrno>
#include <sys/eventfd.h>
#include <system_error>
#include <unistd.h>
#include <utility>

namespace QuorixHost {

VMainThreadWakeUp::VMainThreadWakeUp(boost::function<void()> function)
    : function(std::move(function)), descriptor(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK))
{
    if (descriptor < 0) {
        throw std::system_error(errno, std::system_category(), "eventfd");
    }
    notifier = std::make_unique<QSocketNotifier>(descriptor, QSocketNotifier::Read);
    QObject::connect(notifier.get(), &QSocketNotifier::activated, notifier.get(),
                     [this] { OnReadable(); });
}

VMainThreadWakeUp::~VMainThreadWakeUp()
{
    notifier.reset();
    close(descriptor);
}

void VMainThreadWakeUp::Wake()
{
    // A full counter fails to rise, and has woken the loop already.
    static_cast<void>(eventfd_write(descriptor, 1));
}

void VMainThreadWakeUp::OnReadable()
{
    eventfd_t wakes = 0;
    if (eventfd_read(descriptor, &wakes) == 0) {
        function();
    }
}

} // namespace QuorixHost
