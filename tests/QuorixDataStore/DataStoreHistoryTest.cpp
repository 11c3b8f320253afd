#include "StoreHistory.h"

#include "support/LogCapture.h"

#include <gtest/gtest.h>

namespace {

using namespace StoreTest;

// Both kinds of history hold the store to the same promises: the committed tree never changes under
// a reader; a writer sees its own pending changes and nobody else does; the change id grows by one
// for each outermost write lock; each listener fires at most once per kind and commit, in the order
// of kinds, on the thread that let go last; a write of the visible value records nothing; restored
// values fire nothing; a false result leaves everything as it was; no update is lost but the second
// write after a restorable removal; an item keeps its schema; a listener that throws stops no
// other; nobody waits for ever.
//
// A seed that fails is printed. QUORIX_SEED=<it> plays that one alone.

TEST(DataStoreHistory, ScheduledThreadsAgreeWithTheReference)
{
    const TestSupport::VLogCapture log; // warnings of odd targets are part of the histories
    for (const std::uint32_t seed : HistorySeeds(300)) {
        const std::string difference = PlayScheduledHistory(seed);
        ASSERT_EQ("", difference) << "QUORIX_SEED=" << seed;
    }
}

TEST(DataStoreHistory, FreeThreadsAgreeWithTheReference)
{
    const TestSupport::VLogCapture log;
    for (const std::uint32_t seed : HistorySeeds(40)) {
        const std::string difference = PlayFreeHistory(seed, 4, 40);
        ASSERT_EQ("", difference) << "QUORIX_SEED=" << seed;
    }
}

TEST(DataStoreHistory, EightThreadsAgreeWithTheReference)
{
    const TestSupport::VLogCapture log;
    for (const std::uint32_t seed : HistorySeeds(3)) {
        const std::string difference = PlayFreeHistory(seed, 8, 150);
        ASSERT_EQ("", difference) << "QUORIX_SEED=" << seed;
    }
}

} // namespace
