#include "StoreHistory.h"

#include <map>
#include <memory>
#include <thread>
#include <utility>

namespace StoreTest {

namespace {

/// What one thread did between its outermost taking and letting go.
struct VScope
{
    int Thread = 0;
    int Order = 0; ///< among the scopes of its thread
    std::uint64_t ChangeId = 0;
    bool Writing = false;
    std::vector<std::pair<VStoreStep, std::string>> Steps; ///< with their results
    std::vector<std::string> Fired;                        ///< on this thread while it let go
};

/// Goes through scopes and writes down what it sees.
class VFreeThread
{
public:
    VFreeThread(VDataStore& store, const VSharedTokens& shared, int thread, std::uint32_t seed,
                int scopeCount)
        : store(store),
          thread(thread),
          random(seed),
          performer(store, shared),
          scopeCount(scopeCount)
    {
    }

    void Run()
    {
        for (int scope = 0; scope < scopeCount; ++scope) {
            random() % 2 == 0 ? Write() : Read();
        }
    }

    std::vector<VScope> scopes;

private:
    void Write()
    {
        VScope scope = Begin();
        scope.Writing = true;
        store.AcquireWriteLock(scope.ChangeId);
        Steps(scope, true);
        if (random() % 3 == 0) {
            // Nested scopes of either kind are part of the outer one.
            std::uint64_t nested = 0;
            store.AcquireWriteLock(nested);
            Steps(scope, true);
            store.ReleaseWriteLock();
            store.AcquireReadLock(nested);
            Steps(scope, true);
            store.ReleaseReadLock();
        }
        store.ReleaseWriteLock();
        scope.Fired = VFiringRecorder::Take();
        scopes.push_back(std::move(scope));
    }

    void Read()
    {
        VScope scope = Begin();
        store.AcquireReadLock(scope.ChangeId);
        Steps(scope, false);
        // The same again: the tree may not change under a reader.
        const std::size_t count = scope.Steps.size();
        for (std::size_t index = 0; index < count; ++index) {
            const VStoreStep step = scope.Steps[index].first;
            scope.Steps.emplace_back(step, performer.Perform(step));
        }
        store.ReleaseReadLock();
        scope.Fired = VFiringRecorder::Take();
        scopes.push_back(std::move(scope));
    }

    VScope Begin() const
    {
        VScope scope;
        scope.Thread = thread;
        scope.Order = static_cast<int>(scopes.size());
        return scope;
    }

    void Steps(VScope& scope, bool writing)
    {
        for (unsigned count = random() % 8; count > 0; --count) {
            const VStoreStep step = RandomStep(random, writing);
            scope.Steps.emplace_back(step, performer.Perform(step));
        }
    }

    VDataStore& store;
    const int thread;
    std::mt19937 random;
    VStepPerformer performer;
    const int scopeCount;
};

/// Compares the results of a scope with the reference's, in the state in which it is now.
std::string Compare(const VScope& scope, bool isWriter, VReferenceStore& reference)
{
    for (const auto& [step, result] : scope.Steps) {
        const std::string expected = reference.Perform(step, isWriter);
        if (expected != result) {
            return "at change id " + std::to_string(scope.ChangeId) +
                   (scope.Writing ? " writing: " : " reading: ") + step.Text() + "\n  expected " +
                   expected + "\n  but was  " + result;
        }
    }
    return "";
}

/// Replays the scopes of one change id, which all saw the same state, and its commit.
std::string ReplayChange(const std::vector<const VScope*>& scopes, VReferenceStore& reference)
{
    const VScope* writing = nullptr;
    std::vector<std::string> fired;
    int firingScopes = 0;
    for (const VScope* scope : scopes) {
        if (scope->Writing && writing != nullptr) {
            return "two writers had one change id";
        }
        writing = scope->Writing ? scope : writing;
        if (!scope->Fired.empty()) {
            fired = scope->Fired;
            ++firingScopes;
        }
    }
    if (writing == nullptr) {
        return "a change id without a writer was committed";
    }
    // A thread that has let go of its write lock sees its changes until they are committed.
    const auto seesChanges = [writing](const VScope& scope) {
        return scope.Thread == writing->Thread && scope.Order > writing->Order;
    };
    std::string difference;
    for (const VScope* scope : scopes) {
        if (difference.empty() && scope != writing && !seesChanges(*scope)) {
            difference = Compare(*scope, false, reference);
        }
    }
    if (difference.empty()) {
        difference = Compare(*writing, true, reference);
    }
    for (const VScope* scope : scopes) {
        if (difference.empty() && seesChanges(*scope)) {
            difference = Compare(*scope, true, reference);
        }
    }
    const std::vector<std::string> expected = reference.Commit();
    if (difference.empty() && (expected != fired || firingScopes > 1)) {
        difference = "change id " + std::to_string(reference.ChangeId()) + " fired on " +
                     std::to_string(firingScopes) + " threads\n  expected " + Join(expected) +
                     "\n  but was  " + Join(fired);
    }
    return difference;
}

/// Replays all scopes in the order of their change ids.
std::string Replay(const std::vector<const VScope*>& scopes, std::uint64_t finalChangeId)
{
    std::map<std::uint64_t, std::vector<const VScope*>> byId;
    for (const VScope* scope : scopes) {
        byId[scope->ChangeId].push_back(scope);
    }
    VReferenceStore reference(HistoryListeners());
    reference.Commit(); // of the scope that made the listeners
    while (reference.ChangeId() < finalChangeId) {
        const std::string difference = ReplayChange(byId[reference.ChangeId()], reference);
        if (!difference.empty()) {
            return difference;
        }
    }
    for (const VScope* scope : byId[finalChangeId]) {
        if (scope->Writing || !scope->Fired.empty()) {
            return "a change was not committed";
        }
        const std::string difference = Compare(*scope, false, reference);
        if (!difference.empty()) {
            return difference;
        }
    }
    return byId.rbegin()->first > finalChangeId ? "a scope is ahead of the store" : "";
}

} // namespace

std::string PlayFreeHistory(std::uint32_t seed, int threadCount, int scopes)
{
    VDataStore store;
    VFiringRecorder().ListenTo(store);
    const VSharedTokens shared;
    std::vector<std::unique_ptr<VFreeThread>> runs;
    {
        const VWatchdog watchdog(store, "free history of seed " + std::to_string(seed));
        std::vector<std::thread> threads;
        for (int index = 0; index < threadCount; ++index) {
            runs.push_back(std::make_unique<VFreeThread>(
                store, shared, index, seed * 100 + static_cast<std::uint32_t>(index), scopes));
            threads.emplace_back([run = runs.back().get()] { run->Run(); });
        }
        for (std::thread& thread : threads) {
            thread.join();
        }
    }
    if (!store.GetLocks().empty()) {
        return "locks are left:\n" + LocksText(store);
    }
    std::vector<const VScope*> all;
    for (const auto& run : runs) {
        for (const VScope& scope : run->scopes) {
            all.push_back(&scope);
        }
    }
    std::uint64_t finalChangeId = 0;
    store.AcquireReadLock(finalChangeId);
    store.ReleaseReadLock();
    return Replay(all, finalChangeId);
}

} // namespace StoreTest
