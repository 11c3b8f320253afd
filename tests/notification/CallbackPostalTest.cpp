#include "notification/CallbackPostal.h"

#include "notification/AsioPostalService.h"
#include "notification/Support.h"

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

using NotificationSystem::VAsioPostalService;
using NotificationSystem::VCallbackPostal;
using NotificationTest::SlotOf;
using NotificationTest::VImmediatePostalService;
using NotificationTest::VLastWord;
using NotificationTest::VLatch;
using NotificationTest::VManualPostalService;

namespace {

TEST(CallbackPostal, SlotsAreInOrder)
{
    typedef KVR::ICallbackPostal<void()> ICallbackPostal;

    EXPECT_EQ(3u + NotificationTest::destructorSlots, SlotOf(&ICallbackPostal::SetOn));
    EXPECT_EQ(4u + NotificationTest::destructorSlots, SlotOf(&ICallbackPostal::SetDirect));
}

TEST(CallbackPostal, WithNothingSetReturnsFalseAndRunsNothing)
{
    const auto service = std::make_shared<VManualPostalService>();
    VCallbackPostal<void()> callback(service);

    EXPECT_FALSE(callback());
    EXPECT_FALSE(callback.IsSet());
    EXPECT_EQ(0u, callback.Clear());
    EXPECT_TRUE(service->Queue.empty());
}

TEST(CallbackPostal, SetDeliversOnTheDefaultService)
{
    const auto service = std::make_shared<VManualPostalService>();
    VCallbackPostal<void()> callback(service);
    int calls = 0;
    callback.Set([&calls] { ++calls; });

    EXPECT_TRUE(callback.IsSet());
    EXPECT_TRUE(callback());
    EXPECT_EQ(0, calls);
    EXPECT_EQ(1, service->Deliver());
    EXPECT_EQ(1, calls);
    EXPECT_EQ(std::vector<std::uintptr_t>{0}, service->Tokens);
}

TEST(CallbackPostal, SetWithoutADefaultServiceDeliversDirectly)
{
    VCallbackPostal<void()> callback;
    std::thread::id thread;
    callback.Set([&thread] { thread = std::this_thread::get_id(); });

    EXPECT_TRUE(callback());
    EXPECT_EQ(std::this_thread::get_id(), thread);
}

TEST(CallbackPostal, SetOnDeliversOnTheGivenService)
{
    const auto byDefault = std::make_shared<VManualPostalService>();
    const auto given = std::make_shared<VManualPostalService>();
    VCallbackPostal<void()> callback(byDefault);
    int calls = 0;
    callback.SetOn([&calls] { ++calls; }, given);

    EXPECT_TRUE(callback());

    EXPECT_TRUE(byDefault->Queue.empty());
    EXPECT_EQ(1, given->Deliver());
    EXPECT_EQ(1, calls);
}

TEST(CallbackPostal, SetOnNoServiceDeliversDirectly)
{
    const auto byDefault = std::make_shared<VManualPostalService>();
    VCallbackPostal<void()> callback(byDefault);
    int calls = 0;
    callback.SetOn([&calls] { ++calls; }, nullptr);

    EXPECT_TRUE(callback());
    EXPECT_EQ(1, calls);
    EXPECT_TRUE(byDefault->Queue.empty());
}

TEST(CallbackPostal, SetDirectDeliversWithinTheCall)
{
    const auto byDefault = std::make_shared<VManualPostalService>();
    VCallbackPostal<void()> callback(byDefault);
    int calls = 0;
    callback.SetDirect([&calls] { ++calls; });

    EXPECT_TRUE(callback());
    EXPECT_EQ(1, calls);
    EXPECT_TRUE(byDefault->Queue.empty());
}

TEST(CallbackPostal, EachWayOfSettingReplacesTheFunctionAndItsService)
{
    const auto byDefault = std::make_shared<VManualPostalService>();
    const auto given = std::make_shared<VManualPostalService>();
    VCallbackPostal<void()> callback(byDefault);
    std::string called;
    callback.SetOn([&called] { called += "on "; }, given);
    callback.SetDirect([&called] { called += "direct "; });
    callback.Set([&called] { called += "default "; });

    EXPECT_TRUE(callback());

    EXPECT_EQ("", called);
    EXPECT_EQ(0, given->Deliver());
    EXPECT_EQ(1, byDefault->Deliver());
    EXPECT_EQ("default ", called);
}

TEST(CallbackPostal, ClearDropsTheFunctionAndItsService)
{
    const auto given = std::make_shared<VManualPostalService>();
    VCallbackPostal<void()> callback;
    callback.SetOn([] { FAIL() << "called"; }, given);

    EXPECT_EQ(1u, callback.Clear());

    EXPECT_EQ(1, given.use_count());
    EXPECT_EQ(0u, callback.Clear());
    EXPECT_FALSE(callback.IsSet());
    EXPECT_FALSE(callback());
    EXPECT_TRUE(given->Queue.empty());
}

TEST(CallbackPostal, APostedCallCarriesCopiesOfItsArguments)
{
    const auto service = std::make_shared<VManualPostalService>();
    VCallbackPostal<void(const std::wstring&, int)> callback(service);
    std::wstring text;
    int number = 0;
    callback.Set([&](const std::wstring& first, int second) {
        text = first;
        number = second;
    });
    std::wstring given = L"as it was called";

    EXPECT_TRUE(callback(given, 4));
    given = L"changed later";
    service->Deliver();

    EXPECT_EQ(L"as it was called", text);
    EXPECT_EQ(4, number);
}

TEST(CallbackPostal, ADirectCallHandsOnAReferenceItself)
{
    VCallbackPostal<void(int&)> callback;
    callback.Set([](int& number) { ++number; });
    int number = 1;

    EXPECT_TRUE(callback(number));
    EXPECT_EQ(2, number);
}

TEST(CallbackPostal, APostedCallRunsWhatIsSetAtItsDelivery)
{
    const auto service = std::make_shared<VManualPostalService>();
    VCallbackPostal<void()> callback(service);
    std::string called;
    callback.Set([&called] { called += "first"; });
    EXPECT_TRUE(callback());

    callback.Set([&called] { called += "second"; });
    service->Deliver();

    EXPECT_EQ("second", called);
}

TEST(CallbackPostal, APostedCallRunsNothingAfterClear)
{
    const auto service = std::make_shared<VManualPostalService>();
    VCallbackPostal<void()> callback(service);
    callback.Set([] { FAIL() << "called"; });
    EXPECT_TRUE(callback());

    callback.Clear();
    callback.Set([] { FAIL() << "called for a call before it was set"; });

    EXPECT_EQ(1, service->Deliver());
}

TEST(CallbackPostal, APostedCallOutlivesTheCallback)
{
    const auto service = std::make_shared<VManualPostalService>();
    auto callback = std::make_unique<VCallbackPostal<void()>>(service);
    int calls = 0;
    callback->Set([&calls] { ++calls; });
    EXPECT_TRUE((*callback)());

    callback.reset();
    service->Deliver();

    EXPECT_EQ(1, calls);
}

TEST(CallbackPostal, ADeadTargetIsFoundAtDeliveryAndTheNextCallReturnsFalse)
{
    const auto service = std::make_shared<VManualPostalService>();
    VCallbackPostal<void()> callback(service);
    callback.Set([] { throw KVR::VDeregisterWeakCallbackException(); });

    EXPECT_TRUE(callback()); // nobody knows yet
    service->Deliver();

    EXPECT_FALSE(callback.IsSet());
    EXPECT_FALSE(callback());
    EXPECT_TRUE(service->Queue.empty());
}

TEST(CallbackPostal, ADeadTargetOfADirectCallReturnsFalse)
{
    VCallbackPostal<void()> callback;
    callback.Set([] { throw KVR::VDeregisterWeakCallbackException(); });

    EXPECT_FALSE(callback());
    EXPECT_FALSE(callback.IsSet());
}

TEST(CallbackPostal, ThePostedResultIsReadAfterPosting)
{
    VCallbackPostal<void()> callback(std::make_shared<VImmediatePostalService>());
    callback.Set([] { throw KVR::VDeregisterWeakCallbackException(); });

    EXPECT_FALSE(callback());
}

TEST(CallbackPostal, CanBeSetAgainAfterItsTargetDied)
{
    VCallbackPostal<void()> callback;
    callback.Set([] { throw KVR::VDeregisterWeakCallbackException(); });
    EXPECT_FALSE(callback());
    EXPECT_FALSE(callback()); // drops the emptied place

    int calls = 0;
    callback.Set([&calls] { ++calls; });

    EXPECT_TRUE(callback());
    EXPECT_EQ(1, calls);
}

TEST(CallbackPostal, ACallPostedBeforeTheTargetWasFoundDeadRunsNothingThatWasSetSince)
{
    const auto service = std::make_shared<VManualPostalService>();
    VCallbackPostal<void()> callback(service);
    callback.Set([] { throw KVR::VDeregisterWeakCallbackException(); });
    callback();
    callback();
    service->Queue.front()(); // finds it dead
    service->Queue.pop_front();

    EXPECT_FALSE(callback()); // drops the emptied place
    callback.Set([] { FAIL() << "called for a call before it was set"; });

    EXPECT_EQ(1, service->Deliver());
}

TEST(CallbackPostal, LetsOtherExceptionsOfADirectCallPass)
{
    VCallbackPostal<void()> callback;
    callback.Set([] { throw std::runtime_error("out"); });

    EXPECT_THROW(callback(), std::runtime_error);
    EXPECT_TRUE(callback.IsSet());
}

TEST(CallbackPostal, RunsADirectFunctionWithNoLockHeld)
{
    VCallbackPostal<void()> callback;
    std::string log;
    callback.Set([&] {
        log += callback.IsSet() ? "set " : "not set ";
        log += callback.Clear() == 1 ? "cleared " : "not cleared ";
        log += callback() ? "called" : "not called";
    });

    EXPECT_TRUE(callback());
    EXPECT_EQ("set cleared not called", log);
}

TEST(CallbackPostal, FunctionsAndServicesMayCallBackWhenTheyAreReleased)
{
    VCallbackPostal<void()> callback;
    int words = 0;
    const std::function<void()> word = [&] {
        callback.IsSet();
        ++words;
    };
    const auto set = [&] {
        callback.SetOn([held = std::make_shared<VLastWord>(word)] {},
                       std::make_shared<VManualPostalService>(word));
    };

    set();
    EXPECT_EQ(0, words);
    set(); // releases a function and a service
    EXPECT_EQ(2, words);
    callback.SetDirect([held = std::make_shared<VLastWord>(word)] {});
    EXPECT_EQ(4, words);
    callback.Clear();
    EXPECT_EQ(5, words);
    set();
    callback.Clear();
    EXPECT_EQ(7, words);
}

TEST(CallbackPostal, DeliversOnTheThreadOfARealService)
{
    const auto service = std::make_shared<VAsioPostalService>("Delivery", 1, 0);
    VCallbackPostal<void(std::string)> callback(service);
    std::thread::id thread;
    VLatch delivered;
    callback.Set([&](const std::string&) {
        thread = std::this_thread::get_id();
        delivered.CountDown();
    });

    EXPECT_TRUE(callback("text"));

    ASSERT_TRUE(delivered.Wait());
    EXPECT_NE(std::this_thread::get_id(), thread);
}

TEST(CallbackPostal, MayBeChangedAndCalledByManyThreads)
{
    const auto service = std::make_shared<VAsioPostalService>("Delivery", 2, 0);
    VCallbackPostal<void(int)> callback(service);
    std::atomic<int> called{0};
    const auto function = [&called](int) { ++called; };
    const auto work = [&] {
        for (int i = 0; i < 500; ++i) {
            switch (i % 6) {
            case 0:
                callback.Set(function);
                break;
            case 2:
                callback.SetOn(function, service);
                break;
            case 4:
                callback.SetDirect(function);
                break;
            case 5:
                callback.Clear();
                break;
            default:
                callback(i);
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
    callback.Set(function);
    service->Stop();

    const int before = called;
    EXPECT_TRUE(service->Start(1));
    EXPECT_TRUE(callback(0));
    service->Stop();
    EXPECT_EQ(before + 1, called);
}

} // namespace
