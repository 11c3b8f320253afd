#include "window/GuiSignal.h"

#include "MainThreadWakeUp.h"
#include "utils/Mutex.h"

#include <utility>

namespace QuorixHost {

struct VGuiSignal::VGate
{
    void Wake()
    {
        const KVR::VMutexLock lock(Mutex);
        if (WakeUp) {
            WakeUp->Wake();
        }
    }

    KVR::VMutex Mutex;
    std::unique_ptr<VMainThreadWakeUp> WakeUp KVR_GUARDED_BY(Mutex); // null once shut
};

VGuiSignal::VGuiSignal(boost::function<void()> function) : gate(std::make_shared<VGate>())
{
    const KVR::VMutexLock lock(gate->Mutex);
    gate->WakeUp = std::make_unique<VMainThreadWakeUp>(std::move(function));
}

VGuiSignal::~VGuiSignal()
{
    const KVR::VMutexLock lock(gate->Mutex);
    gate->WakeUp.reset();
}

boost::function<void()> VGuiSignal::Waker() const
{
    return [kept = gate] { kept->Wake(); };
}

} // namespace QuorixHost
