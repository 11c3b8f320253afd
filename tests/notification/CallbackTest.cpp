#include "notification/Callback.h"

#include "notification/CallableSharedPtr.h"
#include "notification/Support.h"

#include <boost/bind/bind.hpp>
#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

using NotificationSystem::VCallback;
using NotificationTest::SlotOf;
using NotificationTest::VLastWord;

namespace {

void Deregister()
{
    throw KVR::VDeregisterWeakCallbackException();
}

TEST(Callback, SlotsAreInOrder)
{
    typedef KVR::ICallback<void()> ICallback;

    EXPECT_EQ(0u, SlotOf(&ICallback::Set));
    EXPECT_EQ(1u, SlotOf(&ICallback::Clear));
    EXPECT_EQ(2u, SlotOf(&ICallback::IsSet));
}

TEST(Callback, WithNothingSetReturnsFalse)
{
    VCallback<void()> callback;

    EXPECT_FALSE(callback());
    EXPECT_FALSE(callback.IsSet());
    EXPECT_EQ(0u, callback.Clear());
}

TEST(Callback, CallsTheFunctionOnTheCallersThread)
{
    VCallback<void()> callback;
    std::thread::id thread;
    callback.Set([&thread] { thread = std::this_thread::get_id(); });

    EXPECT_TRUE(callback.IsSet());
    EXPECT_TRUE(callback());
    EXPECT_EQ(std::this_thread::get_id(), thread);
}

TEST(Callback, StaysSetAfterACall)
{
    VCallback<void()> callback;
    int calls = 0;
    callback.Set([&calls] { ++calls; });

    EXPECT_TRUE(callback());
    EXPECT_TRUE(callback());
    EXPECT_EQ(2, calls);
}

TEST(Callback, PassesItsArguments)
{
    VCallback<void(std::shared_ptr<int>, std::wstring)> callback;
    std::shared_ptr<int> connection;
    std::wstring message;
    callback.Set([&](std::shared_ptr<int> first, std::wstring second) {
        connection = std::move(first);
        message = std::move(second);
    });
    const auto given = std::make_shared<int>(1);

    EXPECT_TRUE(callback(given, L"text"));

    EXPECT_EQ(given, connection);
    EXPECT_EQ(L"text", message);
}

TEST(Callback, SetReplacesTheEarlierFunction)
{
    VCallback<void()> callback;
    std::string called;
    callback.Set([&called] { called += "first"; });
    callback.Set([&called] { called += "second"; });

    EXPECT_TRUE(callback());
    EXPECT_EQ("second", called);
}

TEST(Callback, ClearDropsTheFunction)
{
    VCallback<void()> callback;
    callback.Set([] { FAIL() << "called"; });

    EXPECT_EQ(1u, callback.Clear());

    EXPECT_EQ(0u, callback.Clear());
    EXPECT_FALSE(callback.IsSet());
    EXPECT_FALSE(callback());
}

TEST(Callback, ClearsItselfWhenTheTargetIsGone)
{
    VCallback<void()> callback;
    callback.Set(&Deregister);

    EXPECT_FALSE(callback());
    EXPECT_FALSE(callback.IsSet());
}

TEST(Callback, KeepsAFunctionThatWasSetWhileADeadOneWasCalled)
{
    VCallback<void()> callback;
    int calls = 0;
    callback.Set([&] {
        callback.Set([&calls] { ++calls; });
        throw KVR::VDeregisterWeakCallbackException();
    });

    EXPECT_FALSE(callback());

    EXPECT_TRUE(callback.IsSet());
    EXPECT_TRUE(callback());
    EXPECT_EQ(1, calls);
}

TEST(Callback, LetsOtherExceptionsPassAndStaysSet)
{
    VCallback<void()> callback;
    callback.Set([] { throw std::runtime_error("out"); });

    EXPECT_THROW(callback(), std::runtime_error);
    EXPECT_TRUE(callback.IsSet());
}

TEST(Callback, StoresAnEmptyFunctionAndThrowsWhenItIsCalled)
{
    VCallback<void()> callback;
    callback.Set(boost::function<void()>());

    EXPECT_TRUE(callback.IsSet());
    EXPECT_THROW(callback(), boost::bad_function_call);
    EXPECT_EQ(1u, callback.Clear());
}

TEST(Callback, RunsTheFunctionWithNoLockHeld)
{
    VCallback<void()> callback;
    std::string log;
    callback.Set([&] {
        log += callback.IsSet() ? "set " : "not set ";
        log += callback.Clear() == 1 ? "cleared " : "not cleared ";
        log += callback() ? "called" : "not called";
    });

    EXPECT_TRUE(callback());
    EXPECT_EQ("set cleared not called", log);
}

TEST(Callback, AFunctionThatClearsItselfLivesUntilItReturns)
{
    VCallback<void()> callback;
    bool destroyed = false;
    bool destroyedWithin = true;
    const auto lastWord = [&destroyed] {
        return std::make_shared<VLastWord>([&destroyed] { destroyed = true; });
    };
    callback.Set([&, word = lastWord()] {
        callback.Clear();
        destroyedWithin = destroyed;
    });

    EXPECT_TRUE(callback());

    EXPECT_FALSE(destroyedWithin);
    EXPECT_TRUE(destroyed);
}

TEST(Callback, AFunctionMayCallBackWhenItIsDestroyed)
{
    VCallback<void()> callback;
    int words = 0;
    const auto calling = [&] {
        return [word = std::make_shared<VLastWord>([&] {
                    callback.IsSet();
                    ++words;
                })] {};
    };
    callback.Set(calling());

    callback.Set(calling()); // destroys the first
    EXPECT_EQ(1, words);
    callback.Clear();
    EXPECT_EQ(2, words);
    callback.Set([function = calling()] { throw KVR::VDeregisterWeakCallbackException(); });
    EXPECT_FALSE(callback());
    EXPECT_EQ(3, words);
}

/// A function that calls back whenever it is copied.
struct VCallingCopy
{
    explicit VCallingCopy(VCallback<void()>& target) : Target(&target) {}
    VCallingCopy(const VCallingCopy& other) : Target(other.Target) { Target->IsSet(); }
    VCallingCopy& operator=(const VCallingCopy&) = delete;
    ~VCallingCopy() { Target->IsSet(); }

    void operator()() const {}

    VCallback<void()>* Target;
};

TEST(Callback, AFunctionMayCallBackWhenItIsCopied)
{
    VCallback<void()> callback;

    callback.Set(VCallingCopy(callback));

    EXPECT_TRUE(callback());
    callback.Clear();
}

TEST(Callback, MayBeChangedAndCalledByManyThreads)
{
    VCallback<void(int)> callback;
    std::atomic<int> called{0};
    std::atomic<int> returnedTrue{0};
    const auto work = [&] {
        for (int i = 0; i < 2000; ++i) {
            switch (i % 4) {
            case 0:
                callback.Set([&called](int) { ++called; });
                break;
            case 1:
            case 2:
                returnedTrue += callback(i) ? 1 : 0;
                break;
            default:
                callback.Clear();
                break;
            }
        }
    };

    std::vector<std::thread> threads;
    threads.reserve(4);
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back(work);
    }
    for (std::thread& thread : threads) {
        thread.join();
    }

    EXPECT_EQ(called, returnedTrue);
    EXPECT_FALSE(callback.IsSet());
}

struct VCallable
{
    int operator()(int left, const std::string& right)
    {
        Right = right;
        return left + 1;
    }
    std::string Right;
};

TEST(CallableSharedPtr, CallsWhatItShares)
{
    const auto callable = std::make_shared<VCallable>();
    const NotificationSystem::VCallableSharedPtr<int, VCallable> shared(callable);

    EXPECT_EQ(8, shared(7, "right"));
    EXPECT_EQ("right", callable->Right);
}

TEST(CallableSharedPtr, KeepsItsObjectWhileItIsBound)
{
    auto callable = std::make_shared<VCallable>();
    const std::weak_ptr<VCallable> watched = callable;
    boost::function<void()> bound = boost::bind(
        NotificationSystem::VCallableSharedPtr<int, VCallable>(callable), 1, std::string("text"));

    callable.reset();
    bound();

    EXPECT_EQ("text", watched.lock()->Right);
    bound.clear();
    EXPECT_TRUE(watched.expired());
}

} // namespace
