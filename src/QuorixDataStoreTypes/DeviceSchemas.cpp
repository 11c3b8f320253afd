#include "QuorixDataStoreTypes/DeviceSchemas.h"

#include "utils/FormatMessage.h"
#include "utils/LogStatement.h"

#include <atomic>
#include <chrono>

namespace {

constexpr std::int64_t nanosecondsBetweenLines = 30000000000;

std::int64_t SteadyNanoseconds()
{
    const auto now = std::chrono::steady_clock::now().time_since_epoch();
    return std::chrono::duration_cast<std::chrono::nanoseconds>(now).count();
}

std::atomic<std::int64_t (*)()> logClock{&SteadyNanoseconds};

/// Counts a call with bad input and says so, unless a line has just gone out.
void ReportBadInput(const VDataPath& classRoot, const std::string& deviceIdentifier)
{
    // Shared by all calls and without a lock: the count is a hint and may lose some.
    static std::atomic<std::uint64_t> failures{0};
    static std::atomic<std::int64_t> nextAllowed{0};
    static KVR::VLogStatement category("DataStore");

    if (category.Admits(2)) {
        failures.store(failures.load(std::memory_order_relaxed) + 1, std::memory_order_relaxed);
    }
    const std::int64_t now = logClock.load()();
    if (now < nextAllowed.load(std::memory_order_relaxed)) {
        return;
    }
    nextAllowed.store(now + nanosecondsBetweenLines, std::memory_order_relaxed);
    KVR_LOG("DataStore", 2, "%1% (total log count = %2%)",
            KVR::FormatMessage("Failed to create device schema: [%1%] [%2%]", classRoot.Text(),
                               deviceIdentifier),
            failures.load(std::memory_order_relaxed));
}

/// Returns a path that lives as long as the process, for destructors of static objects too.
const VDataPath& Keep(const char* component)
{
    return *new VDataPath{component};
}

const std::string& KeepText(const char* text)
{
    return *new std::string(text);
}

} // namespace

namespace DeviceSchemas {

VDataPath MakeDevicePath(const VDataPath& classRoot, const std::string& deviceIdentifier)
{
    static const VDataPath& invalidClass = Keep("InvalidDeviceClass");
    const bool usable = !classRoot.Empty() && !deviceIdentifier.empty();

    VDataPath path(classRoot.Empty() ? invalidClass : classRoot,
                   deviceIdentifier.empty() ? "qx:000000" : deviceIdentifier);
    if (!usable) {
        ReportBadInput(classRoot, deviceIdentifier);
    }
    return path;
}

#define KVR_DEFINE_CLASS(name)                                                                     \
    const VDataPath& name##Root()                                                                  \
    {                                                                                              \
        static const VDataPath& root = Keep(#name);                                                \
        return root;                                                                               \
    }                                                                                              \
    VDataPath name##Device(const std::string& deviceIdentifier)                                    \
    {                                                                                              \
        return MakeDevicePath(name##Root(), deviceIdentifier);                                     \
    }
KVR_DEVICE_CLASSES(KVR_DEFINE_CLASS)
#undef KVR_DEFINE_CLASS

#define KVR_DEFINE_SECTION(name, component)                                                        \
    VDataPath name##Section(const VDataPath& devicePath)                                           \
    {                                                                                              \
        return VDataPath(devicePath, component);                                                   \
    }
KVR_DEVICE_SECTIONS(KVR_DEFINE_SECTION)
#undef KVR_DEFINE_SECTION

VDataPath AnalogueCardSection(const VDataPath& devicePath, std::uint32_t card)
{
    return VDataPath(devicePath, "AnalogueCard" + std::to_string(card));
}

#define KVR_DEFINE_VALUE(section, name)                                                            \
    const std::string& name##Leaf()                                                                \
    {                                                                                              \
        static const std::string& leaf = KeepText(#name);                                          \
        return leaf;                                                                               \
    }                                                                                              \
    VDataPath name##Path(const VDataPath& devicePath)                                              \
    {                                                                                              \
        return VDataPath(section##Section(devicePath), name##Leaf());                              \
    }                                                                                              \
    VDataToken name##Token(const VDataPath& devicePath)                                            \
    {                                                                                              \
        return VDataToken(name##Path(devicePath));                                                 \
    }
KVR_DEVICE_VALUES(KVR_DEFINE_VALUE)
#undef KVR_DEFINE_VALUE

void SetLogClock(std::int64_t (*nanoseconds)())
{
    logClock = nanoseconds != nullptr ? nanoseconds : &SteadyNanoseconds;
}

} // namespace DeviceSchemas
