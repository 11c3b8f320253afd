#include "notification/GuardedCall.h"

#include <gtest/gtest.h>

#include <dlfcn.h>

#include <memory>
#include <stdexcept>
#include <string>

namespace {

TEST(GuardedCall, CallsAndReturnsTrue)
{
    int sum = 0;
    const boost::function<void(int, int)> function = [&sum](int left, int right) {
        sum = left + right;
    };

    EXPECT_TRUE(KVR::GuardedCall(function, 3, 4));
    EXPECT_EQ(7, sum);
}

TEST(GuardedCall, IgnoresTheResultOfTheFunction)
{
    const boost::function<bool()> function = [] { return false; };

    EXPECT_TRUE(KVR::GuardedCall(function));
}

TEST(GuardedCall, ReturnsFalseForADeadTarget)
{
    const boost::function<void()> function = [] { throw KVR::VDeregisterWeakCallbackException(); };

    EXPECT_FALSE(KVR::GuardedCall(function));
}

TEST(GuardedCall, LetsOtherExceptionsPass)
{
    const boost::function<void()> standard = [] { throw std::runtime_error("out"); };
    const boost::function<void()> other = [] { throw 7; };

    EXPECT_THROW(KVR::GuardedCall(standard), std::runtime_error);
    EXPECT_THROW(KVR::GuardedCall(other), int);
}

TEST(GuardedCall, ThrowsForAnEmptyFunction)
{
    const boost::function<void()> empty;

    try {
        KVR::GuardedCall(empty);
        FAIL() << "returned";
    } catch (const boost::bad_function_call& exception) {
        EXPECT_STREQ("call to empty boost::function", exception.what());
    }
}

TEST(GuardedCall, HandsArgumentsOnWithoutFurtherCopies)
{
    const auto text = std::make_shared<std::string>("text");
    long owners = 0;
    const boost::function<void(const std::shared_ptr<std::string>&)> function =
        [&owners](const std::shared_ptr<std::string>& argument) { owners = argument.use_count(); };

    EXPECT_TRUE(KVR::GuardedCall(function, text));
    EXPECT_EQ(1, owners);
}

TEST(DeregisterWeakCallbackException, IsAStandardException)
{
    EXPECT_THROW(throw KVR::VDeregisterWeakCallbackException(), std::exception);
}

/// A module made like the plug-in, all hidden but what is marked.
class VBorderModule
{
public:
    VBorderModule() : handle(dlopen(QUORIX_BORDER_MODULE, RTLD_NOW | RTLD_LOCAL)) {}
    ~VBorderModule()
    {
        if (handle != nullptr) {
            dlclose(handle);
        }
    }

    VBorderModule(const VBorderModule&) = delete;
    VBorderModule& operator=(const VBorderModule&) = delete;

    void* Find(const char* symbol) const
    {
        return handle != nullptr ? dlsym(handle, symbol) : nullptr;
    }

private:
    void* const handle;
};

TEST(DeregisterWeakCallbackException, IsCaughtBeyondTheBorderOfAModule)
{
    const VBorderModule module;
    const auto throwFromModule =
        reinterpret_cast<void (*)()>(module.Find("ThrowDeregisterWeakCallback"));
    ASSERT_NE(nullptr, throwFromModule);

    EXPECT_FALSE(KVR::GuardedCall(boost::function<void()>(throwFromModule)));
}

TEST(DeregisterWeakCallbackException, HasDefaultVisibilityInAModuleThatHidesItsSymbols)
{
    const VBorderModule module;

    EXPECT_NE(nullptr, module.Find("_ZTIN3KVR32VDeregisterWeakCallbackExceptionE"));
    EXPECT_EQ(nullptr, module.Find("_ZTI22VExceptionOfTheModule")); // the others are hidden
}

} // namespace
