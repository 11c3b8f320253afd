// Takes bytes for the steps of one thread on a store, and compares each with the reference that the
// tests have: results, what fires, and the change ids.

#include "DebugServices/Log.h"
#include "QuorixDataStore/DataStore.h"
#include "StoreHistory.h"

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

using namespace StoreTest;

namespace {

constexpr std::size_t bytesOfAStep = 4;

void RequireSame(const std::string& step, const std::string& expected, const std::string& result)
{
    if (expected != result) {
        std::fprintf(stderr, "%s\n  expected %s\n  but was  %s\n", step.c_str(), expected.c_str(),
                     result.c_str());
        std::abort();
    }
}

/// Reads a step: its kind, its path of at most three components, and two bytes for the rest.
VStoreStep StepOf(const std::uint8_t* bytes)
{
    VStoreStep step;
    step.Kind = static_cast<VStoreStep::EKind>(bytes[0] % VStoreStep::KindCount);
    static const char* const names[] = {"A", "B", "C", "*"};
    for (int component = 0; component < bytes[1] / 64; ++component) {
        step.Path.emplace_back(names[bytes[1] >> (2 * component) & 3]);
    }
    step.Name = std::string(1, static_cast<char>('A' + bytes[2] % 4));
    step.Value.Schema = bytes[2] / 4 % 4 % 3;
    step.Value.Number = bytes[2] / 16 % 3;
    step.Target = bytes[3] % 4 == 0 ? 7 : bytes[3] % 4;
    step.Flags = bytes[3] / 4 % 8;
    step.Token = bytes[3] / 32 % 2 == 1 ? VStoreStep::Kept : VStoreStep::New;
    return step;
}

/// A store and the reference, of which one thread writes the one and the other alike.
class VPair
{
public:
    VPair() : reference(HistoryListeners()), performer(store, shared)
    {
        VFiringRecorder().ListenTo(store);
        reference.Commit(); // of the scope that made the listeners
        Acquire();
    }

    ~VPair() { Release(); }

    void Do(const VStoreStep& step)
    {
        RequireSame(step.Text(), reference.Perform(step, true), performer.Perform(step));
    }

    void Commit()
    {
        Release();
        Acquire();
    }

private:
    void Acquire()
    {
        std::uint64_t changeId = 0;
        store.AcquireWriteLock(changeId);
        RequireSame("change id", std::to_string(reference.ChangeId()), std::to_string(changeId));
    }

    void Release()
    {
        store.ReleaseWriteLock();
        RequireSame("firings", Join(reference.Commit()), Join(VFiringRecorder::Take()));
    }

    VDataStore store;
    VReferenceStore reference;
    VSharedTokens shared;
    VStepPerformer performer;
};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    static const bool quiet = [] {
        DebugServices::SetLogLevel("DataStore", 0); // odd targets are part of the steps
        return true;
    }();
    static_cast<void>(quiet);

    VPair pair;
    for (std::size_t at = 0; at + bytesOfAStep <= size; at += bytesOfAStep) {
        if (data[at] >= 240) {
            pair.Commit();
        } else {
            pair.Do(StepOf(data + at));
        }
    }
    return 0;
}
