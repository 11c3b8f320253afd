#pragma once

#include "QuorixDataStore/DataStore.h"
#include "ReferenceStore.h"

#include <cstdint>
#include <map>
#include <mutex>
#include <random>
#include <string>
#include <vector>

namespace StoreTest {

/// Returns the listener paths that histories are made with, of every shape.
const std::vector<Names>& HistoryListeners();

/// Chooses the next step. @param writing  whether it may be a write
VStoreStep RandomStep(std::mt19937& random, bool writing);

/// The tokens that all threads of a history use at once, on whatever store.
class VSharedTokens
{
public:
    VSharedTokens();

    /// Returns the token of a path of `RandomStep`, or null for one that is empty or has a
    /// wildcard.
    const VDataToken* Find(const Names& path) const;

private:
    std::map<Names, VDataToken> tokens;
};

/// Performs steps on a store, with results as the reference gives them. One for each thread.
class VStepPerformer
{
public:
    VStepPerformer(VDataStore& store, const VSharedTokens& shared) : store(store), shared(shared) {}

    std::string Perform(const VStoreStep& step);

private:
    const VDataToken& TokenOf(const VStoreStep& step, const VDataToken& fresh);

    VDataStore& store;
    const VSharedTokens& shared;
    std::map<Names, VDataToken> kept;
};

/// Writes down the firings of the listeners, by the thread on which they come.
class VFiringRecorder
{
public:
    /// Adds listeners to all of `HistoryListeners`; every other one throws once it has noted.
    void ListenTo(VDataStore& store);

    /// Returns what came on the calling thread since the last time: in the order of coming, but
    /// sorted within a kind, where the order is free.
    static std::vector<std::string> Take();
};

/// Returns the lock tables as text, for the report of a stall.
std::string LocksText(const VDataStore& store);

/// Ends the process, with the lock tables, if it is not destroyed within a minute.
class VWatchdog
{
public:
    VWatchdog(const VDataStore& store, std::string label);
    ~VWatchdog();

private:
    struct VState;
    VState* state;
};

/// Returns the seeds to run: `count` of them, or 20 times as many with QUORIX_SOAK=1 in the
/// environment, or only the one that QUORIX_SEED names.
std::vector<std::uint32_t> HistorySeeds(std::uint32_t count);

/// Plays a history of threads under a scheduler that lets one step happen at a time, and compares
/// each with the reference. It depends on the seed alone. @return the first difference, or ""
std::string PlayScheduledHistory(std::uint32_t seed);

/// Runs threads as they come, and replays what they have written down. @return the first
/// difference, or ""
///
/// @param scopes  how many scopes each thread goes through
std::string PlayFreeHistory(std::uint32_t seed, int threadCount, int scopes);

} // namespace StoreTest
