#include "ControlSystem.h"

#include "support/LogCapture.h"

#include <gmock/gmock.h>

#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

using QuorixHost::VControlSystem;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

/// Lists the names it was made with, and answers each command with its own label.
class VLabelledProvider : public ControlSystem::ICommandProvider
{
public:
    VLabelledProvider(std::wstring label, std::vector<std::wstring> names, std::int32_t code = 1)
        : label(std::move(label)), names(std::move(names)), code(code)
    {
    }

    void GetCommandNames(std::vector<std::wstring>& list) override
    {
        list.insert(list.end(), names.begin(), names.end());
    }

    ControlSystem::ICommandInformation GetCommandInformation(const std::wstring& name) override
    {
        ControlSystem::ICommandInformation information;
        information.Name = name;
        information.Description = label;
        return information;
    }

    ControlSystem::IResult ExecuteCommand(const std::wstring& name,
                                          const ControlSystem::IParameters& input,
                                          ControlSystem::IParameters& reply) override
    {
        reply.Set(L"Label", label);
        reply.Set(L"Name", name);
        reply.Set(L"Input", input.Get(L"Input"));
        thread = std::this_thread::get_id();
        ControlSystem::IResult result;
        result.Code = code;
        return result;
    }

    std::thread::id thread;

private:
    const std::wstring label;
    const std::vector<std::wstring> names;
    const std::int32_t code;
};

class VThrowingProvider : public ControlSystem::ICommandProvider
{
public:
    void GetCommandNames(std::vector<std::wstring>& names) override
    {
        names.push_back(L"Throws");
        names.push_back(L"ThrowsInt");
    }

    ControlSystem::ICommandInformation GetCommandInformation(const std::wstring&) override
    {
        throw std::runtime_error("no information");
    }

    ControlSystem::IResult ExecuteCommand(const std::wstring& name,
                                          const ControlSystem::IParameters&,
                                          ControlSystem::IParameters&) override
    {
        if (name == L"ThrowsInt") {
            throw 7;
        }
        throw std::runtime_error("it broke");
    }
};

class VNamelessProvider : public VThrowingProvider
{
public:
    void GetCommandNames(std::vector<std::wstring>&) override
    {
        throw std::runtime_error("no names");
    }
};

class VEventProvider : public ControlSystem::IEventProvider
{
public:
    VEventProvider(std::wstring label, std::vector<std::wstring> names)
        : label(std::move(label)), names(std::move(names))
    {
    }

    void GetEventNames(std::vector<std::wstring>& list) override
    {
        list.insert(list.end(), names.begin(), names.end());
    }

    ControlSystem::IEventInformation GetEventInformation() override
    {
        ControlSystem::IEventInformation information;
        information.Description = label;
        return information;
    }

    ControlSystem::IResult CheckEvent() override { return {1}; }

private:
    const std::wstring label;
    const std::vector<std::wstring> names;
};

/// What came back of a command.
struct VOutcome
{
    int successes = 0;
    int failures = 0;
    std::int32_t code = -1;
    ControlSystem::IParameters reply;
};

VOutcome Execute(VControlSystem& system, const std::wstring& name,
                 const ControlSystem::IParameters& input = {})
{
    VOutcome outcome;
    system.ExecuteCommand(
        name, input,
        [&](const ControlSystem::IParameters& reply) {
            ++outcome.successes;
            outcome.reply = reply;
        },
        [&](ControlSystem::IResult result) {
            ++outcome.failures;
            outcome.code = result.Code;
        });
    return outcome;
}

} // namespace

TEST(ControlSystem, ListsCommandsInOrderOfRegistration)
{
    VControlSystem system;
    system.AddCommandProvider(
        std::make_shared<VLabelledProvider>(L"1", std::vector<std::wstring>{L"b", L"a"}));
    system.AddCommandProvider(
        std::make_shared<VLabelledProvider>(L"2", std::vector<std::wstring>{L"c"}));

    EXPECT_THAT(system.GetCommandList(0), ElementsAre(L"b", L"a", L"c"));
}

TEST(ControlSystem, IsEmptyWithoutProviders)
{
    VControlSystem system;

    EXPECT_THAT(system.GetCommandList(0), IsEmpty());
    EXPECT_THAT(system.GetEventList(0), IsEmpty());
}

TEST(ControlSystem, GivesACommandToTheFirstProviderThatListsIt)
{
    VControlSystem system;
    system.AddCommandProvider(
        std::make_shared<VLabelledProvider>(L"1", std::vector<std::wstring>{L"x"}));
    system.AddCommandProvider(
        std::make_shared<VLabelledProvider>(L"2", std::vector<std::wstring>{L"y", L"x"}));
    ControlSystem::IParameters input;
    input.Set(L"Input", L"in");

    const VOutcome outcome = Execute(system, L"x", input);

    EXPECT_EQ(1, outcome.successes);
    EXPECT_EQ(0, outcome.failures);
    EXPECT_EQ(L"1", outcome.reply.Get(L"Label"));
    EXPECT_EQ(L"x", outcome.reply.Get(L"Name"));
    EXPECT_EQ(L"in", outcome.reply.Get(L"Input"));
    EXPECT_EQ(L"2", Execute(system, L"y").reply.Get(L"Label"));
}

TEST(ControlSystem, RunsACommandOnTheCallersThread)
{
    VControlSystem system;
    const auto provider =
        std::make_shared<VLabelledProvider>(L"1", std::vector<std::wstring>{L"x"});
    system.AddCommandProvider(provider);

    std::thread::id caller;
    std::thread([&] {
        caller = std::this_thread::get_id();
        Execute(system, L"x");
    }).join();

    EXPECT_EQ(caller, provider->thread);
}

TEST(ControlSystem, FailsAnUnknownCommandWithCode2)
{
    VControlSystem system;
    system.AddCommandProvider(
        std::make_shared<VLabelledProvider>(L"1", std::vector<std::wstring>{L"System.X"}));

    for (const wchar_t* const name : {L"system.x", L"System", L"System.X ", L""}) {
        const VOutcome outcome = Execute(system, name);
        EXPECT_EQ(0, outcome.successes);
        EXPECT_EQ(1, outcome.failures);
        EXPECT_EQ(2, outcome.code);
    }
}

TEST(ControlSystem, HandsOverOnlyTheCodeOfAFailure)
{
    VControlSystem system;
    system.AddCommandProvider(
        std::make_shared<VLabelledProvider>(L"1", std::vector<std::wstring>{L"x"}, 15));

    const VOutcome outcome = Execute(system, L"x");

    EXPECT_EQ(0, outcome.successes);
    EXPECT_EQ(1, outcome.failures);
    EXPECT_EQ(15, outcome.code);
}

TEST(ControlSystem, TurnsAProvidersExceptionIntoCode0)
{
    TestSupport::VLogCapture log;
    VControlSystem system;
    system.AddCommandProvider(std::make_shared<VThrowingProvider>());

    for (const wchar_t* const name : {L"Throws", L"ThrowsInt"}) {
        const VOutcome outcome = Execute(system, name);
        EXPECT_EQ(0, outcome.successes);
        EXPECT_EQ(1, outcome.failures);
        EXPECT_EQ(0, outcome.code);
    }
    EXPECT_EQ(2U, log.Messages().size());
}

TEST(ControlSystem, LetsAnExceptionOfTheReplyFunctionPassWithoutASecondReply)
{
    VControlSystem system;
    system.AddCommandProvider(
        std::make_shared<VLabelledProvider>(L"1", std::vector<std::wstring>{L"x"}));
    int failures = 0;

    EXPECT_THROW(system.ExecuteCommand(
                     L"x", {},
                     [](const ControlSystem::IParameters&) { throw std::runtime_error("sent"); },
                     [&](ControlSystem::IResult) { ++failures; }),
                 std::runtime_error);
    EXPECT_EQ(0, failures);
}

TEST(ControlSystem, InformationOfAnUnknownCommandIsAFreshRecord)
{
    VControlSystem system;
    system.AddCommandProvider(
        std::make_shared<VLabelledProvider>(L"1", std::vector<std::wstring>{L"x"}));

    const ControlSystem::ICommandInformation unknown = system.GetCommandInformation(L"y");

    EXPECT_EQ(L"", unknown.Name);
    EXPECT_EQ(L"Command not found.", unknown.Description);
    EXPECT_EQ(L"1", system.GetCommandInformation(L"x").Description);
}

TEST(ControlSystem, AProviderThatThrowsOnAQuestionIsAnsweredForByAFreshRecord)
{
    TestSupport::VLogCapture log;
    VControlSystem system;
    system.AddCommandProvider(std::make_shared<VThrowingProvider>());
    system.AddCommandProvider(std::make_shared<VNamelessProvider>());

    EXPECT_EQ(L"Command not found.", system.GetCommandInformation(L"Throws").Description);
    EXPECT_THAT(system.GetCommandList(0), ElementsAre(L"Throws", L"ThrowsInt"));
    EXPECT_EQ(2U, log.Messages().size());
}

TEST(ControlSystem, ARemovedProviderIsGone)
{
    VControlSystem system;
    const auto first = std::make_shared<VLabelledProvider>(L"1", std::vector<std::wstring>{L"x"});
    const auto second = std::make_shared<VLabelledProvider>(L"2", std::vector<std::wstring>{L"x"});
    system.AddCommandProvider(first);
    system.AddCommandProvider(second);

    system.RemoveCommandProvider(first);

    EXPECT_EQ(1, first.use_count());
    EXPECT_THAT(system.GetCommandList(0), ElementsAre(L"x"));
    EXPECT_EQ(L"2", Execute(system, L"x").reply.Get(L"Label"));
}

TEST(ControlSystem, EmptyAndUnknownProvidersChangeNothing)
{
    VControlSystem system;
    const auto provider =
        std::make_shared<VLabelledProvider>(L"1", std::vector<std::wstring>{L"x"});

    system.AddCommandProvider(nullptr);
    system.AddEventProvider(nullptr);
    system.RemoveCommandProvider(nullptr);
    system.RemoveCommandProvider(provider);
    system.RemoveEventProvider(nullptr);

    EXPECT_THAT(system.GetCommandList(0), IsEmpty());
    EXPECT_THAT(system.GetEventList(0), IsEmpty());
}

TEST(ControlSystem, AProviderMayBeRemovedWhileItRuns)
{
    /// Takes itself out of the dispatcher when it runs.
    class VLeavingProvider : public VLabelledProvider
    {
    public:
        explicit VLeavingProvider(VControlSystem& system)
            : VLabelledProvider(L"leaving", {L"x"}), system(system)
        {
        }
        ControlSystem::IResult ExecuteCommand(const std::wstring& name,
                                              const ControlSystem::IParameters& input,
                                              ControlSystem::IParameters& reply) override
        {
            system.RemoveCommandProvider(self.lock());
            return VLabelledProvider::ExecuteCommand(name, input, reply);
        }
        VControlSystem& system;
        std::weak_ptr<ControlSystem::ICommandProvider> self;
    };
    VControlSystem system;
    std::weak_ptr<ControlSystem::ICommandProvider> weak;
    {
        const auto provider = std::make_shared<VLeavingProvider>(system);
        provider->self = provider;
        weak = provider;
        system.AddCommandProvider(provider);
    }

    EXPECT_EQ(1, Execute(system, L"x").successes);
    EXPECT_TRUE(weak.expired());
    EXPECT_EQ(2, Execute(system, L"x").code);
}

TEST(ControlSystem, EventInformationIsTheProvidersOwn)
{
    VControlSystem system;
    system.AddEventProvider(
        std::make_shared<VEventProvider>(L"1", std::vector<std::wstring>{L"e"}));
    const auto second = std::make_shared<VEventProvider>(L"2", std::vector<std::wstring>{L"f"});
    system.AddEventProvider(second);

    EXPECT_THAT(system.GetEventList(0), ElementsAre(L"e", L"f"));
    EXPECT_EQ(L"2", system.GetEventInformation(L"f").Description);
    EXPECT_EQ(L"", system.GetEventInformation(L"g").Description);

    system.RemoveEventProvider(second);
    EXPECT_THAT(system.GetEventList(0), ElementsAre(L"e"));
}

TEST(ControlSystem, AnEventReachesEveryListenerBeforeFireEventReturns)
{
    VControlSystem system;
    std::vector<std::wstring> heard;
    const auto listener = [&](const std::wstring& name,
                              const ControlSystem::IParameters& parameters) {
        heard.push_back(name + L":" + parameters.Get(L"Id"));
    };
    system.GetEventNotification().Add(listener);
    const std::uint64_t second = system.GetEventNotification().Add(listener);
    ControlSystem::IParameters parameters;
    parameters.Set(L"Id", L"7");

    EXPECT_EQ(1, system.FireEvent(L"Event.X", parameters).Code);
    EXPECT_THAT(heard, ElementsAre(L"Event.X:7", L"Event.X:7"));

    system.GetEventNotification().Remove(second);
    system.FireEvent(L"Event.Y", {});
    EXPECT_THAT(heard, ElementsAre(L"Event.X:7", L"Event.X:7", L"Event.Y:"));
}
