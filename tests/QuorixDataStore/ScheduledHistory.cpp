#include "StoreHistory.h"

#include "StoreFixture.h"
#include "WorkerThread.h"

#include <algorithm>
#include <functional>
#include <memory>
#include <optional>

namespace StoreTest {

namespace {

constexpr std::size_t threadCount = 5;
constexpr int stepCount = 80;
constexpr std::size_t nobody = 99;

/// The rules of the locks, told plainly: which thread holds how many, and who is on which id.
class VReferenceLocks
{
public:
    struct VEntry
    {
        std::uint64_t Id;
        int Holders;
        std::size_t Writer;
    };

    bool IsWriter(std::size_t thread) const
    {
        return !entries.empty() && entries.front().Writer == thread;
    }

    std::uint64_t AcquireRead(std::size_t thread, std::uint64_t current)
    {
        if (reads[thread]++ > 0) {
            return current;
        }
        if (entries.empty()) {
            entries.push_back({current, 0, nobody});
        }
        ++entries.front().Holders;
        return entries.front().Id;
    }

    /// @return nothing if the thread holds a read lock
    std::optional<std::uint64_t> AcquireWrite(std::size_t thread, std::uint64_t current)
    {
        if (reads[thread] > 0) {
            return std::nullopt;
        }
        if (writes[thread]++ > 0) {
            return current;
        }
        if (entries.empty()) {
            entries.push_back({current, 0, nobody});
        }
        if (entries.back().Writer != nobody) {
            entries.push_back({entries.back().Id + 1, 0, nobody});
        }
        entries.back().Writer = thread;
        ++entries.back().Holders;
        return entries.back().Id;
    }

    /// @return true if a commit is due
    bool Release(std::vector<int>& counts, std::size_t thread)
    {
        if (counts[thread] == 0 || --counts[thread] > 0 || --entries.front().Holders > 0) {
            return false;
        }
        const bool hadWriter = entries.front().Writer != nobody;
        entries.erase(entries.begin());
        return hadWriter;
    }

    std::vector<int> reads = std::vector<int>(threadCount, 0);
    std::vector<int> writes = std::vector<int>(threadCount, 0);
    std::vector<VEntry> entries;
};

/// One history: each step is chosen from what the rules say of the present state, done by the
/// thread that is to do it, and compared at once.
class VScheduledHistory
{
public:
    explicit VScheduledHistory(std::uint32_t seed)
        : random(seed), reference(HistoryListeners()), blocked(threadCount, false)
    {
        recorder.ListenTo(store);
        reference.Commit(); // of the scope that made the listeners
        for (std::size_t thread = 0; thread < threadCount; ++thread) {
            performers.emplace_back(store, shared);
            workers.push_back(std::make_unique<VWorkerThread>());
        }
    }

    std::string Play()
    {
        for (int step = 0; step < stepCount && difference.empty(); ++step) {
            Step(random() % threadCount);
        }
        while (difference.empty() && Held()) {
            const std::size_t thread = random() % threadCount;
            if (!blocked[thread] && locks.reads[thread] > 0) {
                Release(thread, false);
            } else if (!blocked[thread] && locks.writes[thread] > 0) {
                Release(thread, true);
            }
        }
        if (difference.empty() && !store.GetLocks().empty()) {
            difference = "locks are left:\n" + LocksText(store);
        }
        if (difference.empty()) {
            return "";
        }
        LetGo();
        return difference + "\nafter:\n" + story;
    }

private:
    void Step(std::size_t thread)
    {
        if (blocked[thread]) {
            return;
        }
        const bool holds = locks.reads[thread] + locks.writes[thread] > 0;
        const unsigned choice = random() % 10;
        if (choice == 0 && locks.reads[thread] < 3) {
            AcquireRead(thread);
        } else if (choice == 1 && locks.writes[thread] < 3) {
            AcquireWrite(thread);
        } else if (choice == 2) {
            Release(thread, random() % 2 == 0);
        } else if (choice == 3 && !locks.IsWriter(thread)) {
            ForbiddenWrite(thread);
        } else if (holds) {
            const VStoreStep step = RandomStep(random, locks.IsWriter(thread));
            const std::string expected = reference.Perform(step, locks.IsWriter(thread));
            Do(thread, step.Text(), expected, [&] { return performers[thread].Perform(step); });
        } else if (random() % 2 == 0) {
            AcquireWrite(thread);
        } else {
            AcquireRead(thread);
        }
    }

    void AcquireRead(std::size_t thread)
    {
        const std::uint64_t expected = locks.AcquireRead(thread, reference.ChangeId());
        Do(thread, "AcquireReadLock", std::to_string(expected), [this] {
            std::uint64_t id = 0;
            store.AcquireReadLock(id);
            return std::to_string(id);
        });
    }

    void AcquireWrite(std::size_t thread)
    {
        const std::optional<std::uint64_t> expected =
            locks.AcquireWrite(thread, reference.ChangeId());
        const auto acquire = [this] {
            std::uint64_t id = 0;
            return store.AcquireWriteLock(id) ? std::to_string(id) : "refused";
        };
        if (!expected || *expected == reference.ChangeId()) {
            Do(thread, "AcquireWriteLock", expected ? std::to_string(*expected) : "refused",
               acquire);
            return;
        }
        Note(thread, "AcquireWriteLock", "waits for " + std::to_string(*expected));
        blocked[thread] = true;
        results[thread].clear();
        workers[thread]->Start([this, thread, acquire] { results[thread] = acquire(); });
        // The order of the queue is part of the history: nothing else happens before it stands.
        if (!Eventually([&] { return WaitingFor(*expected); })) {
            difference =
                "no thread waits for " + std::to_string(*expected) + "\n" + LocksText(store);
        }
    }

    void Release(std::size_t thread, bool write)
    {
        const bool commits = locks.Release(write ? locks.writes : locks.reads, thread);
        const std::vector<std::string> expected =
            commits ? reference.Commit() : std::vector<std::string>();
        Do(thread, write ? "ReleaseWriteLock" : "ReleaseReadLock", Join(expected), [this, write] {
            write ? store.ReleaseWriteLock() : store.ReleaseReadLock();
            return Join(VFiringRecorder::Take());
        });
        if (commits && difference.empty() && !locks.entries.empty()) {
            FinishWaiting(locks.entries.front().Writer);
        }
    }

    void FinishWaiting(std::size_t thread)
    {
        const std::string expected = std::to_string(reference.ChangeId());
        if (!workers[thread]->Finish()) {
            difference = "a writer was not woken\n" + LocksText(store);
            return;
        }
        blocked[thread] = false;
        Compare(thread, "woken", expected, results[thread]);
    }

    void ForbiddenWrite(std::size_t thread)
    {
        VStoreStep step = RandomStep(random, true);
        step.Kind = VStoreStep::SetValue;
        const VAssertions assertions(VAssertions::Return);
        Do(thread, "forbidden " + step.Text(), "false ",
           [&] { return performers[thread].Perform(step); });
        if (assertions.Expressions() != Texts{"pDataStoreDelta"}) {
            difference = "no assertion failed";
        }
    }

    void Do(std::size_t thread, const std::string& what, const std::string& expected,
            const std::function<std::string()>& action)
    {
        std::string result;
        workers[thread]->Start([&] { result = action(); });
        if (!workers[thread]->Finish()) {
            std::fprintf(stderr, "Stalled in %s\n%s", what.c_str(), LocksText(store).c_str());
            std::abort(); // the thread still uses this frame
        }
        Compare(thread, what, expected, result);
    }

    void Compare(std::size_t thread, const std::string& what, const std::string& expected,
                 const std::string& result)
    {
        Note(thread, what, result);
        if (result != expected && difference.empty()) {
            difference = what + "\n  expected " + expected + "\n  but was  " + result;
        }
    }

    void Note(std::size_t thread, const std::string& what, const std::string& result)
    {
        story += "  thread " + std::to_string(thread) + " " + what + " -> " + result + "\n";
    }

    /// Releases whatever the threads hold, so that those that wait come to an end, after a
    /// difference of which nothing is sure but that a release without a lock does nothing.
    void LetGo()
    {
        const bool done = Eventually([this] {
            bool allDone = true;
            for (const std::unique_ptr<VWorkerThread>& worker : workers) {
                allDone = allDone && !worker->Busy();
                if (!worker->Busy()) {
                    worker->Start([this] { ReleaseAll(); });
                    static_cast<void>(worker->Finish());
                }
            }
            return allDone;
        });
        if (!done) {
            std::fprintf(stderr, "%s\nafter:\n%s", difference.c_str(), story.c_str());
            std::abort(); // a thread that waits for ever still uses this object
        }
    }

    void ReleaseAll()
    {
        for (int depth = 0; depth < 3; ++depth) {
            store.ReleaseReadLock();
            store.ReleaseWriteLock();
        }
    }

    bool Held() const
    {
        for (std::size_t thread = 0; thread < threadCount; ++thread) {
            if (locks.reads[thread] + locks.writes[thread] > 0) {
                return true;
            }
        }
        return false;
    }

    bool WaitingFor(std::uint64_t id) const
    {
        for (const VDataStoreLock& lock : store.GetLocks()) {
            if (lock.Waiting && lock.ChangeId == id) {
                return true;
            }
        }
        return false;
    }

    std::mt19937 random;
    VDataStore store;
    VFiringRecorder recorder;
    VReferenceStore reference;
    VReferenceLocks locks;
    VSharedTokens shared;
    std::vector<VStepPerformer> performers;
    std::vector<bool> blocked;
    std::string results[threadCount];
    std::string story;
    std::string difference;
    std::vector<std::unique_ptr<VWorkerThread>> workers; // last: they use the rest
};

} // namespace

std::string PlayScheduledHistory(std::uint32_t seed)
{
    return VScheduledHistory(seed).Play();
}

} // namespace StoreTest
