#include "FakeHost/Faults.h"

#include <algorithm>

namespace FakeHost {

namespace {

/// Passes everything on as it is, but for its faults.
class VFaultFilter : public IByteFilter
{
public:
    explicit VFaultFilter(const VFaults& chosenFaults) : faults(chosenFaults) {}

    bool ReadsDevice() override { return !faults.NeverReads; }

    VPassed FromDevice(const std::string& bytes) override { return {bytes, {}, false}; }

    VPassed FromHost(const std::string& bytes) override
    {
        if (faults.NeverReplies) {
            return {};
        }
        VPassed passed{bytes, faults.Delay, false};
        const std::uint64_t begin = hostBytes;
        hostBytes += bytes.size();
        if (faults.GarbageAfter && hostBytes > *faults.GarbageAfter) {
            const std::uint64_t sound =
                *faults.GarbageAfter > begin ? *faults.GarbageAfter - begin : 0;
            MakeNoise(passed.Bytes, static_cast<std::size_t>(sound));
        }
        if (faults.CutAfter && hostBytes >= *faults.CutAfter) {
            const std::uint64_t kept = *faults.CutAfter > begin ? *faults.CutAfter - begin : 0;
            passed.Bytes.resize(static_cast<std::size_t>(kept));
            passed.Close = true;
        }
        return passed;
    }

private:
    /// The same noise each time, so that what it causes can be looked into. Taken for the length of
    /// a frame it is above what any device accepts.
    static void MakeNoise(std::string& bytes, std::size_t from)
    {
        std::uint32_t state = 0x9E3779B9U;
        for (std::size_t i = from; i < bytes.size(); ++i) {
            state = state * 1664525U + 1013904223U;
            bytes[i] = static_cast<char>(0x80U | (state >> 25U));
        }
    }

    const VFaults faults;
    std::uint64_t hostBytes = 0;
};

} // namespace

std::unique_ptr<IByteFilter> MakeFaultFilter(const VFaults& faults, unsigned connection)
{
    return std::make_unique<VFaultFilter>(connection <= faults.Connections ? faults : VFaults());
}

} // namespace FakeHost
