#include "notification/MultiCallbackPostal.h"

#include "notification/AsioPostalService.h"
#include "notification/Support.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

using NotificationSystem::VAsioPostalService;
using NotificationSystem::VMultiCallbackPostal;
using NotificationTest::SlotOf;
using NotificationTest::VImmediatePostalService;
using NotificationTest::VLastWord;
using NotificationTest::VLatch;
using NotificationTest::VManualPostalService;

namespace {

/// A list with a default service and another one.
class MultiCallbackPostal : public testing::Test
{
protected:
    boost::function<void()> Letter(char letter)
    {
        return [this, letter] { called += letter; };
    }

    const std::shared_ptr<VManualPostalService> byDefault =
        std::make_shared<VManualPostalService>();
    const std::shared_ptr<VManualPostalService> other = std::make_shared<VManualPostalService>();
    VMultiCallbackPostal<void()> callback{byDefault};
    std::string called;
};

TEST_F(MultiCallbackPostal, SlotsAreInOrder)
{
    typedef KVR::IMultiCallbackPostal<void()> IMultiCallbackPostal;

    EXPECT_EQ(4u + NotificationTest::destructorSlots, SlotOf(&IMultiCallbackPostal::AddOn));
    EXPECT_EQ(5u + NotificationTest::destructorSlots, SlotOf(&IMultiCallbackPostal::AddDirect));
}

TEST_F(MultiCallbackPostal, WithoutFunctionsReturnsFalse)
{
    EXPECT_FALSE(callback());
    EXPECT_EQ(0u, callback.Count());
    EXPECT_EQ(0u, callback.Clear());
}

TEST_F(MultiCallbackPostal, AddDeliversOnTheDefaultService)
{
    EXPECT_NE(0u, callback.Add(Letter('a')));

    EXPECT_TRUE(callback());
    EXPECT_EQ("", called);
    EXPECT_EQ(1, byDefault->Deliver());
    EXPECT_EQ("a", called);
    EXPECT_EQ(std::vector<std::uintptr_t>{0}, byDefault->Tokens);
}

TEST_F(MultiCallbackPostal, AddWithoutADefaultServiceDeliversDirectly)
{
    VMultiCallbackPostal<void()> direct;
    direct.Add(Letter('a'));

    EXPECT_TRUE(direct());
    EXPECT_EQ("a", called);
}

TEST_F(MultiCallbackPostal, AddOnDeliversOnTheGivenService)
{
    callback.AddOn(Letter('a'), other);

    EXPECT_TRUE(callback());
    EXPECT_EQ(0, byDefault->Deliver());
    EXPECT_EQ(1, other->Deliver());
    EXPECT_EQ("a", called);
}

TEST_F(MultiCallbackPostal, AddOnNoServiceDeliversDirectly)
{
    callback.AddOn(Letter('a'), nullptr);

    EXPECT_TRUE(callback());
    EXPECT_EQ("a", called);
}

TEST_F(MultiCallbackPostal, AddDirectDeliversWithinTheCall)
{
    std::thread::id thread;
    callback.AddDirect([&thread] { thread = std::this_thread::get_id(); });

    EXPECT_TRUE(callback());
    EXPECT_EQ(std::this_thread::get_id(), thread);
    EXPECT_TRUE(byDefault->Queue.empty());
}

TEST_F(MultiCallbackPostal, AGroupIsPostedOnceAndRunsInOrderOfAdding)
{
    callback.Add(Letter('a'));
    callback.AddOn(Letter('x'), other);
    callback.AddOn(Letter('b'), byDefault);
    callback.Add(Letter('c'));

    EXPECT_TRUE(callback());

    EXPECT_EQ(1, byDefault->Deliver());
    EXPECT_EQ("abc", called);
}

TEST_F(MultiCallbackPostal, SuccessiveCallsArriveInTheirOrder)
{
    VMultiCallbackPostal<void(char)> withLetter(byDefault);
    withLetter.Add([this](char letter) { called += letter; });

    withLetter('a');
    withLetter('b');
    withLetter('c');
    byDefault->Deliver();

    EXPECT_EQ("abc", called);
}

/// Notes when it is posted to.
class VNotingPostalService : public KVR::IPostalService
{
public:
    explicit VNotingPostalService(std::vector<const void*>& notes) : log(notes) {}

    void Post(boost::function<void()>, std::uintptr_t) override { log.push_back(this); }

private:
    std::vector<const void*>& log;
};

TEST_F(MultiCallbackPostal, TheDirectGroupRunsFirstAndOthersArePostedInOrderOfTheirServices)
{
    std::vector<const void*> log;
    std::vector<std::shared_ptr<VNotingPostalService>> services;
    for (int i = 0; i < 8; ++i) {
        services.push_back(std::make_shared<VNotingPostalService>(log));
        callback.AddOn(Letter('a'), services.back());
    }
    callback.AddDirect([&log] { log.push_back(nullptr); });

    EXPECT_TRUE(callback());

    std::vector<const void*> expected{nullptr};
    for (const auto& service : services) {
        expected.push_back(service.get());
    }
    std::sort(expected.begin(), expected.end(), std::less<const void*>());
    EXPECT_EQ(expected, log);
}

TEST_F(MultiCallbackPostal, RemoveFindsAHandleInEveryGroup)
{
    const std::uint64_t handles[] = {
        callback.Add(Letter('a')),
        callback.AddOn(Letter('b'), other),
        callback.AddDirect(Letter('c')),
    };
    EXPECT_EQ(3u, callback.Count());

    for (const std::uint64_t handle : handles) {
        EXPECT_EQ(1u, callback.Remove(handle));
        EXPECT_EQ(0u, callback.Remove(handle));
    }

    EXPECT_EQ(0u, callback.Count());
    EXPECT_FALSE(callback());
}

TEST_F(MultiCallbackPostal, RemoveOfAnUnknownHandleChangesNothing)
{
    const std::uint64_t handle = callback.Add(Letter('a'));
    callback.AddDirect(Letter('b'));

    EXPECT_EQ(0u, callback.Remove(0));
    EXPECT_EQ(0u, callback.Remove(handle + 1));

    EXPECT_EQ(2u, callback.Count());
}

TEST_F(MultiCallbackPostal, EmptyingAGroupErasesItAndAddingMakesANewOne)
{
    const std::uint64_t handle = callback.AddOn(Letter('a'), other);
    EXPECT_TRUE(callback()); // on its way to the group of now

    EXPECT_EQ(1u, callback.Remove(handle));
    EXPECT_TRUE(other->Queue.size() == 1 && other.use_count() == 1); // the group let go of it
    callback.AddOn(Letter('b'), other);

    EXPECT_EQ(1, other->Deliver());
    EXPECT_EQ("", called); // the old group is not the new one
    EXPECT_TRUE(callback());
    EXPECT_EQ(1, other->Deliver());
    EXPECT_EQ("b", called);
}

TEST_F(MultiCallbackPostal, RemoveErasesEveryGroupThatHasBecomeEmpty)
{
    callback.AddOn([] { throw KVR::VDeregisterWeakCallbackException(); }, other);
    const std::uint64_t handle = callback.Add(Letter('a'));
    callback();
    other->Deliver(); // empties its group, which stays
    EXPECT_EQ(2, other.use_count());

    callback.Remove(handle);

    EXPECT_EQ(1, other.use_count());
}

TEST_F(MultiCallbackPostal, ACallErasesAGroupThatHasBecomeEmpty)
{
    callback.AddOn([] { throw KVR::VDeregisterWeakCallbackException(); }, other);
    EXPECT_TRUE(callback()); // nobody knows yet
    EXPECT_EQ(1, other->Deliver());
    EXPECT_EQ(0u, callback.Count());

    EXPECT_FALSE(callback());

    EXPECT_EQ(0, other->Deliver());
    EXPECT_EQ(1, other.use_count());
}

TEST_F(MultiCallbackPostal, ClearEmptiesEveryGroupAndReturnsTheSum)
{
    callback.Add(Letter('a'));
    callback.AddOn(Letter('b'), other);
    callback.AddOn(Letter('c'), other);
    callback.AddDirect(Letter('d'));
    EXPECT_TRUE(callback());
    called.clear();

    EXPECT_EQ(4u, callback.Clear());

    EXPECT_EQ(0u, callback.Count());
    EXPECT_EQ(1, other.use_count());
    other->Deliver();
    byDefault->Deliver();
    EXPECT_EQ("", called);
    EXPECT_FALSE(callback());
}

TEST_F(MultiCallbackPostal, APostedGroupIsReadAtDelivery)
{
    callback.Add(Letter('a'));
    const std::uint64_t handle = callback.Add(Letter('b'));
    EXPECT_TRUE(callback());

    callback.Remove(handle);
    callback.Add(Letter('c'));
    byDefault->Deliver();

    EXPECT_EQ("ac", called);
}

TEST_F(MultiCallbackPostal, APostedCallCarriesCopiesOfItsArguments)
{
    VMultiCallbackPostal<void(const std::wstring&, int)> withArguments(byDefault);
    std::wstring text;
    int number = 0;
    withArguments.Add([&](const std::wstring& first, int second) {
        text = first;
        number = second;
    });
    std::wstring given = L"as it was called";

    EXPECT_TRUE(withArguments(given, 4));
    given = L"changed later";
    byDefault->Deliver();

    EXPECT_EQ(L"as it was called", text);
    EXPECT_EQ(4, number);
}

TEST_F(MultiCallbackPostal, APostedCallOutlivesTheList)
{
    auto list = std::make_unique<VMultiCallbackPostal<void()>>(byDefault);
    list->Add(Letter('a'));
    EXPECT_TRUE((*list)());

    list.reset();
    byDefault->Deliver();

    EXPECT_EQ("a", called);
}

TEST_F(MultiCallbackPostal, TheResultCountsDirectFunctionsByTheirTargets)
{
    callback.AddDirect([] { throw KVR::VDeregisterWeakCallbackException(); });

    EXPECT_FALSE(callback());
    EXPECT_EQ(0u, callback.Count());
}

TEST_F(MultiCallbackPostal, TheResultCountsPostedGroupsByTheirEntriesAfterPosting)
{
    const auto immediate = std::make_shared<VImmediatePostalService>();
    callback.AddOn([] { throw KVR::VDeregisterWeakCallbackException(); }, immediate);
    EXPECT_FALSE(callback());

    callback.AddOn([] { throw KVR::VDeregisterWeakCallbackException(); }, other);
    EXPECT_TRUE(callback());
}

TEST_F(MultiCallbackPostal, OneLiveGroupIsEnough)
{
    callback.AddDirect([] { throw KVR::VDeregisterWeakCallbackException(); });
    callback.Add(Letter('a'));
    EXPECT_TRUE(callback());

    VMultiCallbackPostal<void()> direct;
    direct.AddDirect(Letter('b'));
    direct.AddOn([] { throw KVR::VDeregisterWeakCallbackException(); },
                 std::make_shared<VImmediatePostalService>());
    EXPECT_TRUE(direct());
}

TEST_F(MultiCallbackPostal, AnExceptionOfADirectFunctionPassesAndNothingIsPosted)
{
    callback.Add(Letter('a'));
    callback.AddDirect([] { throw std::runtime_error("out"); });

    EXPECT_THROW(callback(), std::runtime_error);

    EXPECT_TRUE(byDefault->Queue.empty());
    EXPECT_EQ(2u, callback.Count());
}

TEST_F(MultiCallbackPostal, DirectFunctionsMayChangeTheirOwnList)
{
    std::uint64_t self = 0;
    self = callback.AddDirect([&] {
        called += 'x';
        EXPECT_EQ(1u, callback.Remove(self));
        callback.AddDirect(Letter('n'));
        EXPECT_EQ(2u, callback.Count());
    });
    callback.AddDirect(Letter('a'));

    EXPECT_TRUE(callback());
    EXPECT_EQ("xa", called);
    called.clear();
    EXPECT_TRUE(callback());
    EXPECT_EQ("an", called);
}

TEST_F(MultiCallbackPostal, FunctionsAndServicesMayCallBackWhenTheyAreReleased)
{
    int words = 0;
    const std::function<void()> word = [&] {
        callback.Remove(callback.AddDirect([] {}));
        ++words;
    };
    const auto add = [&] {
        return callback.AddOn([held = std::make_shared<VLastWord>(word)] {},
                              std::make_shared<VManualPostalService>(word));
    };

    callback.Remove(add());
    EXPECT_EQ(2, words);
    add();
    callback.Clear();
    EXPECT_EQ(4, words);
}

TEST_F(MultiCallbackPostal, AServiceMayCallBackWhenACallErasesItsGroup)
{
    int words = 0;
    auto service = std::make_shared<VManualPostalService>([&] {
        callback.Remove(callback.AddDirect([] {}));
        ++words;
    });
    callback.AddOn([] { throw KVR::VDeregisterWeakCallbackException(); }, service);
    callback();
    service->Deliver();
    service.reset();
    EXPECT_EQ(0, words); // the emptied group holds it

    EXPECT_FALSE(callback());

    EXPECT_EQ(1, words);
}

TEST_F(MultiCallbackPostal, MayBeChangedDuringCallsOfManyThreads)
{
    const auto service = std::make_shared<VAsioPostalService>("Delivery", 1, 0);
    VMultiCallbackPostal<void(int)> list(service);
    std::atomic<int> posted{0};
    std::atomic<int> direct{0};
    list.Add([&posted](int) { ++posted; });
    list.AddDirect([&direct](int) { ++direct; });

    constexpr int callsOfEach = 300;
    std::vector<std::thread> threads;
    threads.reserve(4);
    for (int i = 0; i < 2; ++i) {
        threads.emplace_back([&] {
            for (int call = 0; call < callsOfEach; ++call) {
                EXPECT_TRUE(list(call));
            }
        });
        threads.emplace_back([&] {
            const auto own = std::make_shared<VAsioPostalService>("Own", 1, 0);
            for (int change = 0; change < callsOfEach; ++change) {
                const std::uint64_t handle = list.AddOn([](int) {}, own);
                EXPECT_LE(3u, list.Count());
                EXPECT_EQ(1u, list.Remove(handle));
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    service->Stop();

    EXPECT_EQ(2 * callsOfEach, direct);
    EXPECT_EQ(2 * callsOfEach, posted);
    EXPECT_EQ(2u, list.Count());
}

TEST_F(MultiCallbackPostal, AddNeverLosesAFunctionToACallThatErasesItsGroup)
{
    const auto immediate = std::make_shared<VImmediatePostalService>();
    std::atomic<bool> ended{false};
    std::vector<std::thread> calling;
    calling.reserve(3);
    for (int i = 0; i < 3; ++i) {
        calling.emplace_back([&] {
            while (!ended) {
                callback();
            }
        });
    }

    int lost = 0;
    for (int i = 0; i < 20000; ++i) {
        const std::uint64_t handle = callback.AddOn([] {}, immediate);
        lost += callback.Remove(handle) == 1 ? 0 : 1;
    }
    ended = true;
    for (std::thread& thread : calling) {
        thread.join();
    }

    EXPECT_EQ(0, lost);
}

} // namespace
