#include "notification/MultiCallback.h"

#include "notification/Support.h"

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <set>
#include <stdexcept>
#include <string>
#include <thread>
#include <utility>
#include <vector>

using NotificationSystem::VMultiCallback;
using NotificationTest::SlotOf;
using NotificationTest::VLastWord;

namespace {

/// A list whose functions write their letter.
class MultiCallback : public testing::Test
{
protected:
    std::uint64_t AddLetter(char letter)
    {
        return callback.Add([this, letter] { called += letter; });
    }

    std::string Called()
    {
        called.clear();
        callback();
        return called;
    }

    VMultiCallback<void()> callback;
    std::string called;
};

TEST_F(MultiCallback, SlotsAreInOrder)
{
    typedef KVR::IMultiCallback<void()> IMultiCallback;

    EXPECT_EQ(0u, SlotOf(&IMultiCallback::Add));
    EXPECT_EQ(1u, SlotOf(&IMultiCallback::Remove));
    EXPECT_EQ(2u, SlotOf(&IMultiCallback::Clear));
    EXPECT_EQ(3u, SlotOf(&IMultiCallback::Count));
}

TEST_F(MultiCallback, WithoutFunctionsReturnsFalse)
{
    EXPECT_FALSE(callback());
    EXPECT_EQ(0u, callback.Count());
    EXPECT_EQ(0u, callback.Clear());
}

TEST_F(MultiCallback, CallsInOrderOfAddingOnTheCallersThread)
{
    AddLetter('a');
    std::thread::id thread;
    callback.Add([&thread] { thread = std::this_thread::get_id(); });
    AddLetter('b');
    AddLetter('c');

    EXPECT_TRUE(callback());

    EXPECT_EQ("abc", called);
    EXPECT_EQ(std::this_thread::get_id(), thread);
    EXPECT_EQ(4u, callback.Count());
}

TEST_F(MultiCallback, HandlesDifferAndAreNeverZero)
{
    std::set<std::uint64_t> handles;
    for (int i = 0; i < 100; ++i) {
        handles.insert(AddLetter('a'));
    }

    EXPECT_EQ(100u, handles.size());
    EXPECT_EQ(0u, handles.count(0));
}

TEST_F(MultiCallback, RemoveClosesTheGapAndKeepsTheOrder)
{
    AddLetter('a');
    const std::uint64_t handle = AddLetter('b');
    AddLetter('c');
    AddLetter('d');

    EXPECT_EQ(1u, callback.Remove(handle));

    EXPECT_EQ("acd", Called());
    EXPECT_EQ(3u, callback.Count());
}

TEST_F(MultiCallback, RemoveOfAnUnknownHandleChangesNothing)
{
    const std::uint64_t handle = AddLetter('a');
    const std::uint64_t removed = AddLetter('b');
    callback.Remove(removed);

    EXPECT_EQ(0u, callback.Remove(0));
    EXPECT_EQ(0u, callback.Remove(handle + 1));
    EXPECT_EQ(0u, callback.Remove(removed));

    EXPECT_EQ("a", Called());
}

TEST_F(MultiCallback, HandlesStayValidWhileOthersComeAndGo)
{
    const std::uint64_t first = AddLetter('a');
    const std::uint64_t last = AddLetter('z');
    for (int i = 0; i < 100; ++i) {
        callback.Remove(AddLetter('b'));
        AddLetter('c');
    }

    EXPECT_EQ(1u, callback.Remove(last));
    EXPECT_EQ(1u, callback.Remove(first));

    EXPECT_EQ(std::string(100, 'c'), Called());
}

TEST_F(MultiCallback, TheSameFunctionMayStandInTheListTwice)
{
    const std::uint64_t handle = AddLetter('a');
    AddLetter('a');
    EXPECT_EQ("aa", Called());

    EXPECT_EQ(1u, callback.Remove(handle));

    EXPECT_EQ("a", Called());
}

TEST_F(MultiCallback, ClearRemovesAllAndReturnsHowMany)
{
    AddLetter('a');
    AddLetter('b');

    EXPECT_EQ(2u, callback.Clear());

    EXPECT_EQ(0u, callback.Count());
    EXPECT_FALSE(callback());
    EXPECT_EQ("", called);
}

TEST_F(MultiCallback, AFunctionThatRemovesItselfRunsOnce)
{
    std::uint64_t handle = 0;
    handle = callback.Add([this, &handle] {
        called += 'x';
        EXPECT_EQ(1u, callback.Remove(handle));
    });
    AddLetter('a');

    EXPECT_EQ("xa", Called());
    EXPECT_EQ("a", Called());
}

TEST_F(MultiCallback, AFunctionAddedDuringACallRunsFromTheNext)
{
    bool added = false;
    callback.Add([this, &added] {
        if (!added) {
            AddLetter('n');
            added = true;
        }
    });
    AddLetter('a');

    EXPECT_EQ("a", Called());
    EXPECT_EQ("an", Called());
}

TEST_F(MultiCallback, AFunctionRemovedDuringACallStillRunsInIt)
{
    std::uint64_t later = 0;
    callback.Add([this, &later] { callback.Remove(later); });
    later = AddLetter('a');

    EXPECT_EQ("a", Called());
    EXPECT_EQ("", Called());
}

TEST_F(MultiCallback, FunctionsMayClearCountAndCallTheirOwnList)
{
    std::size_t counted = 0;
    callback.Add([this, &counted] {
        counted = callback.Count();
        EXPECT_EQ(2u, callback.Clear());
        EXPECT_FALSE(callback());
    });
    AddLetter('a');

    EXPECT_TRUE(callback());

    EXPECT_EQ(2u, counted);
    EXPECT_EQ("a", called);
}

TEST_F(MultiCallback, DeadTargetsAreRemovedAndOneLivingMakesTheResultTrue)
{
    callback.Add([] { throw KVR::VDeregisterWeakCallbackException(); });
    AddLetter('a');
    callback.Add([] { throw KVR::VDeregisterWeakCallbackException(); });

    EXPECT_EQ(3u, callback.Count());
    EXPECT_TRUE(callback());

    EXPECT_EQ("a", called);
    EXPECT_EQ(1u, callback.Count());
}

TEST_F(MultiCallback, OnlyDeadTargetsMakeTheResultFalse)
{
    callback.Add([] { throw KVR::VDeregisterWeakCallbackException(); });

    EXPECT_FALSE(callback());
    EXPECT_EQ(0u, callback.Count());
}

TEST_F(MultiCallback, AFunctionMayDestroyItsListBesideDeadTargets)
{
    auto list = std::make_unique<VMultiCallback<void()>>();
    list->Add([] { throw KVR::VDeregisterWeakCallbackException(); });
    list->Add([&] { list.reset(); });
    list->Add([] { throw KVR::VDeregisterWeakCallbackException(); });
    list->Add([this] { called += 'z'; });

    VMultiCallback<void()>& calling = *list;

    EXPECT_TRUE(calling());
    EXPECT_EQ(called, "z");
}

TEST_F(MultiCallback, AFunctionMayDestroyItsListWithinACallOfACall)
{
    auto list = std::make_unique<VMultiCallback<void()>>();
    bool inner = false;
    list->Add([] { throw KVR::VDeregisterWeakCallbackException(); });
    list->Add([&] {
        if (!std::exchange(inner, true)) {
            (*list)();
            return;
        }
        list.reset();
    });

    VMultiCallback<void()>& calling = *list;

    EXPECT_TRUE(calling());
}

TEST_F(MultiCallback, RemovingADeadEntryNeverHitsANewOne)
{
    std::uint64_t handle = 0;
    handle = callback.Add([this, &handle] {
        // Removed before it is found dead: its address must not pass to one of these meanwhile.
        callback.Remove(handle);
        for (int i = 0; i < 100; ++i) {
            AddLetter('n');
        }
        throw KVR::VDeregisterWeakCallbackException();
    });

    EXPECT_FALSE(callback());
    EXPECT_EQ(std::string(100, 'n'), Called());
}

TEST_F(MultiCallback, AnExceptionPassesAndEndsTheCall)
{
    AddLetter('a');
    callback.Add([] { throw KVR::VDeregisterWeakCallbackException(); });
    const std::uint64_t throwing = callback.Add([] { throw std::runtime_error("out"); });
    AddLetter('b');

    EXPECT_THROW(callback(), std::runtime_error);

    EXPECT_EQ("a", called);
    EXPECT_EQ(4u, callback.Count()); // dead ones go at the end of a call
    callback.Remove(throwing);
    EXPECT_EQ("ab", Called());
    EXPECT_EQ(2u, callback.Count());
}

TEST_F(MultiCallback, AnEmptyFunctionThrowsWhenItIsCalled)
{
    callback.Add(boost::function<void()>());

    try {
        callback();
        FAIL() << "returned";
    } catch (const boost::bad_function_call& exception) {
        EXPECT_STREQ("call to empty boost::function", exception.what());
    }
    EXPECT_EQ(1u, callback.Count());
}

TEST_F(MultiCallback, EveryFunctionReceivesTheArgumentsAsGiven)
{
    VMultiCallback<void(std::string, bool)> withArguments;
    std::vector<std::string> received;
    for (int i = 0; i < 2; ++i) {
        withArguments.Add([&received](std::string text, bool flag) {
            received.push_back(text + (flag ? " true" : " false"));
            text = "changed by a function";
        });
    }

    EXPECT_TRUE(withArguments("text", true));
    EXPECT_EQ((std::vector<std::string>{"text true", "text true"}), received);
}

TEST_F(MultiCallback, FunctionsShareAnArgumentGivenByReference)
{
    VMultiCallback<void(int&)> withReference;
    withReference.Add([](int& number) { ++number; });
    withReference.Add([](int& number) { number *= 10; });
    int number = 1;

    EXPECT_TRUE(withReference(number));
    EXPECT_EQ(20, number);
}

TEST_F(MultiCallback, FunctionsMayCallBackWhenTheyAreDestroyed)
{
    int words = 0;
    const auto calling = [&] {
        return [word = std::make_shared<VLastWord>([&] {
                    callback.Remove(callback.Add([] {}));
                    ++words;
                })] {};
    };

    callback.Remove(callback.Add(calling()));
    EXPECT_EQ(1, words);
    callback.Add(calling());
    callback.Clear();
    EXPECT_EQ(2, words);
    callback.Add([function = calling()] { throw KVR::VDeregisterWeakCallbackException(); });
    EXPECT_FALSE(callback());
    EXPECT_EQ(3, words);
    EXPECT_EQ(0u, callback.Count());
}

/// A function that calls back whenever it is copied or destroyed.
struct VCallingCopy
{
    explicit VCallingCopy(VMultiCallback<void()>& target) : Target(&target) {}
    VCallingCopy(const VCallingCopy& other) : Target(other.Target) { Target->Count(); }
    VCallingCopy& operator=(const VCallingCopy&) = delete;
    ~VCallingCopy() { Target->Count(); }

    void operator()() const {}

    VMultiCallback<void()>* Target;
};

TEST_F(MultiCallback, FunctionsMayCallBackWhenTheyAreCopied)
{
    callback.Add(VCallingCopy(callback));

    EXPECT_TRUE(callback());
    EXPECT_EQ(1u, callback.Clear());
}

TEST_F(MultiCallback, MayBeChangedDuringCallsOfManyThreads)
{
    std::atomic<int> constant{0};
    std::atomic<int> passing{0};
    callback.Add([&constant] { ++constant; });

    constexpr int callsOfEach = 500;
    std::vector<std::thread> threads;
    threads.reserve(4);
    for (int i = 0; i < 2; ++i) {
        threads.emplace_back([&] {
            for (int call = 0; call < callsOfEach; ++call) {
                EXPECT_TRUE(callback());
            }
        });
        threads.emplace_back([&] {
            for (int change = 0; change < callsOfEach; ++change) {
                const std::uint64_t handle = callback.Add([&passing] { ++passing; });
                callback.Add([] { throw KVR::VDeregisterWeakCallbackException(); });
                EXPECT_LE(1u, callback.Count());
                EXPECT_EQ(1u, callback.Remove(handle));
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }

    EXPECT_EQ(2 * callsOfEach, constant);
    const int before = passing;
    EXPECT_TRUE(callback());
    EXPECT_EQ(before, passing);
    EXPECT_EQ(1u, callback.Count());
}

} // namespace
