#include "ControlStreamClient/EventHandlers.h"

#include <gmock/gmock.h>

#include <stdexcept>

namespace {

using ControlStream::VEvent;
using ControlStream::VEventHandlers;
using testing::ElementsAre;

TEST(EventHandlers, GetTheEventsOfTheirNameInOrder)
{
    VEventHandlers handlers;
    std::vector<std::string> calls;
    handlers.Add("A", [&](const VEvent& event) { calls.push_back("first " + event.Name); });
    handlers.Add("", [&](const VEvent& event) { calls.push_back("all " + event.Name); });
    handlers.Add("A", [&](const VEvent& event) { calls.push_back("second " + event.Name); });
    handlers.Add("B", nullptr);

    handlers.Call({"A", {}});
    handlers.Call({"B", {}});
    handlers.Call({"a", {}});

    EXPECT_THAT(calls, ElementsAre("first A", "all A", "second A", "all B", "all a"));
}

TEST(EventHandlers, AreRemovedById)
{
    VEventHandlers handlers;
    int calls = 0;
    const std::uint64_t id = handlers.Add("A", [&](const VEvent&) { ++calls; });
    EXPECT_NE(0U, id);

    handlers.Remove(id + 1);
    handlers.Call({"A", {}});
    handlers.Remove(id);
    handlers.Call({"A", {}});

    EXPECT_EQ(1, calls);
}

TEST(EventHandlers, MayRemoveAndAddThemselvesWhileTheyAreCalled)
{
    VEventHandlers handlers;
    int calls = 0;
    std::uint64_t id = 0;
    id = handlers.Add("A", [&](const VEvent&) {
        handlers.Remove(id);
        handlers.Add("A", [&](const VEvent&) { calls += 10; });
        ++calls;
    });

    handlers.Call({"A", {}});
    EXPECT_EQ(1, calls);
    handlers.Call({"A", {}});

    EXPECT_EQ(11, calls);
}

TEST(EventHandlers, LetAnExceptionThrough)
{
    VEventHandlers handlers;
    handlers.Add("A", [](const VEvent&) { throw std::runtime_error("no"); });

    EXPECT_THROW(handlers.Call({"A", {}}), std::runtime_error);
}

} // namespace
