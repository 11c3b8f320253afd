#include "notification/MakeShared.h"

#include "notification/Support.h"

#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <type_traits>
#include <utility>

using NotificationTest::SlotOf;

namespace {

class VProbe : public KVR::VShared
{
public:
    VProbe(std::string text, std::unique_ptr<int> number)
        : Text(std::move(text)), Number(std::move(number))
    {
    }

    void OnCreated() override
    {
        ++Created;
        FromHook = std::static_pointer_cast<VProbe>(shared_from_this());
        HookThread = std::this_thread::get_id();
    }

    void OnReserved() override { ++Reserved; }

    const std::string Text;
    const std::unique_ptr<int> Number;
    int Created = 0;
    int Reserved = 0;
    std::weak_ptr<VProbe> FromHook;
    std::thread::id HookThread;
};

class VHidden : public KVR::VShared
{
public:
    bool IsCreated() const { return created; }

protected:
    VHidden() = default;

private:
    void OnCreated() override { created = true; }

    bool created = false;
};

class VThrowing : public KVR::VShared
{
public:
    explicit VThrowing(bool& flag) : destroyed(flag) {}
    ~VThrowing() override { destroyed = true; }

private:
    void OnCreated() override { throw std::runtime_error("not created"); }

    bool& destroyed;
};

class VPlain : public KVR::VShared
{
};

TEST(Shared, ClassesAreAbstractAndOnlyTheFinalFormIsNot)
{
    EXPECT_TRUE(std::is_abstract<VPlain>::value);
    EXPECT_FALSE(std::is_abstract<MakeSharedDetail::VSharedFinal<VPlain>>::value);
    EXPECT_TRUE((std::is_base_of<VPlain, MakeSharedDetail::VSharedFinal<VPlain>>::value));
}

TEST(Shared, SlotsAreInOrder)
{
    EXPECT_EQ(0u, SlotOf(&KVR::VShared::OnCreated));
    EXPECT_EQ(1u, SlotOf(&KVR::VShared::OnReserved));

    // The abstract operation and the destructor lie before what a class adds.
    class VAdding : public KVR::VShared
    {
    public:
        virtual void Added() {}
    };
    EXPECT_EQ(3u + NotificationTest::destructorSlots, SlotOf(&VAdding::Added));
}

TEST(MakeShared, ForwardsTheArguments)
{
    const auto probe = KVR::MakeShared<VProbe>("text", std::make_unique<int>(5));

    EXPECT_EQ("text", probe->Text);
    EXPECT_EQ(5, *probe->Number);
}

TEST(MakeShared, RunsOnCreatedOnceAndOnTheCallersThread)
{
    const auto probe = KVR::MakeShared<VProbe>("", nullptr);

    EXPECT_EQ(1, probe->Created);
    EXPECT_EQ(std::this_thread::get_id(), probe->HookThread);
    EXPECT_EQ(0, probe->Reserved);
}

TEST(MakeShared, GivesOnCreatedItsOwnSharedPointer)
{
    const auto probe = KVR::MakeShared<VProbe>("", nullptr);

    EXPECT_EQ(probe, probe->FromHook.lock());
}

TEST(MakeShared, ReturnsTheOnlyReference)
{
    const auto probe = KVR::MakeShared<VProbe>("", nullptr);

    EXPECT_EQ(1, probe.use_count());
}

TEST(MakeShared, MakesClassesWithHiddenConstructorAndHook)
{
    EXPECT_TRUE(KVR::MakeShared<VHidden>()->IsCreated());
}

TEST(MakeShared, RunsTheEmptyHookOfAClassThatHasNone)
{
    EXPECT_NE(nullptr, KVR::MakeShared<VPlain>());
}

TEST(MakeShared, DestroysAnObjectWhoseOnCreatedThrows)
{
    bool destroyed = false;

    EXPECT_THROW(KVR::MakeShared<VThrowing>(destroyed), std::runtime_error);
    EXPECT_TRUE(destroyed);
}

} // namespace
