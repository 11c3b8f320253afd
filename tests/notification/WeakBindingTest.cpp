#include "notification/WeakBinding.h"

#include "notification/Callback.h"
#include "notification/MultiCallback.h"

#include <boost/bind/bind.hpp>
#include <gtest/gtest.h>

#include <memory>
#include <string>

namespace {

class VTarget : public std::enable_shared_from_this<VTarget>
{
public:
    ~VTarget()
    {
        if (destroyed != nullptr) {
            *destroyed = true;
        }
    }

    void OnEvent(const std::wstring& name, int number)
    {
        Name = name;
        Number = number;
        ++Calls;
    }

    /// Lets go of the last reference outside, and says whether this object outlived that.
    void OnRelease(std::shared_ptr<VTarget>* outside, bool* livedOn)
    {
        destroyed = &isDestroyed;
        outside->reset();
        *livedOn = !isDestroyed;
        destroyed = nullptr;
    }

    std::wstring Name;
    int Number = 0;
    int Calls = 0;

private:
    static bool isDestroyed;
    bool* destroyed = nullptr;
};

bool VTarget::isDestroyed = false;

boost::function<void(const std::wstring&, int)> BoundWeakly(const std::shared_ptr<VTarget>& target)
{
    const std::weak_ptr<VTarget> self = target;
    return boost::bind(&VTarget::OnEvent, boost::bind(&KVR::LockOrDeregister<VTarget>, self),
                       boost::placeholders::_1, boost::placeholders::_2);
}

TEST(WeakBinding, LocksALivingTarget)
{
    const auto target = std::make_shared<VTarget>();

    EXPECT_EQ(target, KVR::LockOrDeregister(std::weak_ptr<VTarget>(target)));
}

TEST(WeakBinding, ThrowsForADeadTarget)
{
    EXPECT_THROW(KVR::LockOrDeregister(std::weak_ptr<VTarget>()),
                 KVR::VDeregisterWeakCallbackException);
}

TEST(WeakBinding, PassesArgumentsToTheMemberFunction)
{
    const auto target = std::make_shared<VTarget>();

    BoundWeakly(target)(L"name", 7);

    EXPECT_EQ(L"name", target->Name);
    EXPECT_EQ(7, target->Number);
}

TEST(WeakBinding, DoesNotKeepTheTarget)
{
    auto target = std::make_shared<VTarget>();
    const std::weak_ptr<VTarget> watched = target;
    const boost::function<void(const std::wstring&, int)> function = BoundWeakly(target);

    target.reset();

    EXPECT_TRUE(watched.expired());
}

TEST(WeakBinding, HoldsTheTargetForTheLengthOfTheCall)
{
    auto target = std::make_shared<VTarget>();
    const std::weak_ptr<VTarget> self = target;
    bool livedOn = false;
    const boost::function<void()> function = boost::bind(
        &VTarget::OnRelease, boost::bind(&KVR::LockOrDeregister<VTarget>, self), &target, &livedOn);

    function();

    EXPECT_TRUE(livedOn);
    EXPECT_TRUE(self.expired());
}

TEST(WeakBinding, LeavesAMultiCallbackAtTheFirstCallAfterTheTarget)
{
    NotificationSystem::VMultiCallback<void(const std::wstring&, int)> callback;
    auto target = std::make_shared<VTarget>();
    callback.Add(BoundWeakly(target));

    target.reset();
    EXPECT_EQ(1u, callback.Count()); // it goes at the next call, not with its target

    EXPECT_FALSE(callback(L"", 0));
    EXPECT_EQ(0u, callback.Count());
}

TEST(WeakBinding, LeavesASingleCallbackAtTheFirstCallAfterTheTarget)
{
    NotificationSystem::VCallback<void(const std::wstring&, int)> callback;
    auto target = std::make_shared<VTarget>();
    callback.Set(BoundWeakly(target));
    EXPECT_TRUE(callback(L"", 0));

    target.reset();
    EXPECT_TRUE(callback.IsSet());

    EXPECT_FALSE(callback(L"", 0));
    EXPECT_FALSE(callback.IsSet());
}

} // namespace
