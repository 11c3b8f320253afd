#include "QmlFolder.h"

#include "QtQuickView/EnterLeaveEventFilter.h"
#include "QtQuickView/QuickWidgetEventFilterDispatcher.h"
#include "QtQuickView/ShortcutOverrideEventFilter.h"
#include "support/LogCapture.h"

#include <gmock/gmock.h>

#include <QChildEvent>
#include <QCoreApplication>

#include <string>
#include <vector>

using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

const QEvent::Type userEvent = QEvent::User;

/// What filters were asked, in order.
struct VCalls
{
    std::vector<std::string> Added;
    std::vector<std::string> Filtered;
};

/// A filter that writes down what it is asked and answers as told.
class VRecordingFilter : public IQuickWidgetEventFilter
{
public:
    VRecordingFilter(std::string filterName, VCalls& filterCalls, bool consumes = false)
        : name(std::move(filterName)), calls(filterCalls), answer(consumes)
    {
    }

    void OnItemAdded(QObject* item) override
    {
        calls.Added.push_back(name + ":" + item->objectName().toStdString());
    }

    bool Filter(QObject* object, QEvent* event) override
    {
        if (event->type() == userEvent) {
            calls.Filtered.push_back(name + ":" + object->objectName().toStdString());
        }
        return answer && event->type() == userEvent;
    }

private:
    const std::string name;
    VCalls& calls;
    const bool answer;
};

/// A dispatcher whose own filters are replaced.
class VTestDispatcher : public VQuickWidgetEventFilterDispatcher
{
public:
    VTestDispatcher() { filters.clear(); }

    void Append(const std::string& name, bool consumes = false)
    {
        filters.push_back(std::make_unique<VRecordingFilter>(name, calls, consumes));
    }

    VCalls calls;
};

/// Shows which filters a dispatcher starts with.
class VOpenDispatcher : public VQuickWidgetEventFilterDispatcher
{
public:
    const std::vector<std::unique_ptr<IQuickWidgetEventFilter>>& Filters() const { return filters; }
};

/// An object that counts the events that reach it.
class VReceiver : public QObject
{
public:
    bool event(QEvent* event) override
    {
        count += event->type() == userEvent ? 1 : 0;
        return QObject::event(event);
    }

    int count = 0;
};

void SendUserEvent(QObject& object)
{
    QEvent event(userEvent);
    QCoreApplication::sendEvent(&object, &event);
}

const QByteArray tree = "Item { objectName: 'root'\n"
                        "  Item { objectName: 'a'; Item { objectName: 'a1' } }\n"
                        "  Item { objectName: 'b' } }";

} // namespace

TEST(QuickWidgetEventFilterDispatcher, StartsWithEnterAndLeaveAndThenShortcuts)
{
    const VOpenDispatcher dispatcher;

    ASSERT_EQ(2U, dispatcher.Filters().size());
    EXPECT_NE(nullptr, dynamic_cast<VEnterLeaveEventFilter*>(dispatcher.Filters()[0].get()));
    EXPECT_NE(nullptr, dynamic_cast<VShortcutOverrideEventFilter*>(dispatcher.Filters()[1].get()));
}

TEST(QuickWidgetEventFilterDispatcher, TellsEveryFilterOfEveryItemParentsFirst)
{
    VQmlView view(tree);
    VTestDispatcher dispatcher;
    dispatcher.Append("1");
    dispatcher.Append("2");

    dispatcher.Install(view.Widget());

    EXPECT_THAT(dispatcher.calls.Added,
                ElementsAre("1:root", "2:root", "1:a", "2:a", "1:a1", "2:a1", "1:b", "2:b"));
}

TEST(QuickWidgetEventFilterDispatcher, SeesTheEventsOfEveryItem)
{
    VQmlView view(tree);
    VTestDispatcher dispatcher;
    dispatcher.Append("1");
    dispatcher.Install(view.Widget());

    for (const char* name : {"root", "a1", "b"}) {
        SendUserEvent(*view.Item(name));
    }

    EXPECT_THAT(dispatcher.calls.Filtered, ElementsAre("1:root", "1:a1", "1:b"));
}

TEST(QuickWidgetEventFilterDispatcher, SeesTheEventsOfTheWidgetItselfAsWell)
{
    VQmlView view(tree);
    VTestDispatcher dispatcher;
    dispatcher.Append("1");
    dispatcher.Install(view.Widget());

    SendUserEvent(view.Widget());

    EXPECT_THAT(dispatcher.calls.Filtered, ElementsAre("1:View.qml"));
}

TEST(QuickWidgetEventFilterDispatcher, ChildrenOfTheWidgetAreNoItems)
{
    VQmlView view(tree);
    VTestDispatcher dispatcher;
    dispatcher.Append("1");
    dispatcher.Install(view.Widget());
    dispatcher.calls.Added.clear();

    auto* child = new QObject(&view.Widget());
    SendUserEvent(*child);

    EXPECT_THAT(dispatcher.calls.Added, IsEmpty());
    EXPECT_THAT(dispatcher.calls.Filtered, IsEmpty());
}

TEST(QuickWidgetEventFilterDispatcher, AViewWithoutARootIsLeftAlone)
{
    VQmlView view;
    VTestDispatcher dispatcher;
    dispatcher.Append("1");
    const TestSupport::VLogLevel level("Qt Korva", 6);
    const TestSupport::VLogCapture log;

    dispatcher.Install(view.Widget());
    SendUserEvent(view.Widget());

    EXPECT_THAT(dispatcher.calls.Added, IsEmpty());
    EXPECT_THAT(dispatcher.calls.Filtered, IsEmpty());
    EXPECT_THAT(log.Texts("Qt Korva"), IsEmpty());
}

TEST(QuickWidgetEventFilterDispatcher, TheFirstFilterThatConsumesEndsTheWalk)
{
    VReceiver receiver;
    VTestDispatcher dispatcher;
    dispatcher.Append("1");
    dispatcher.Append("2", true);
    dispatcher.Append("3");
    receiver.installEventFilter(&dispatcher);

    SendUserEvent(receiver);

    EXPECT_THAT(dispatcher.calls.Filtered, ElementsAre("1:", "2:"));
    EXPECT_EQ(0, receiver.count);
}

TEST(QuickWidgetEventFilterDispatcher, AnEventThatNobodyConsumesArrives)
{
    VReceiver receiver;
    VTestDispatcher dispatcher;
    dispatcher.Append("1");
    dispatcher.Append("2");
    receiver.installEventFilter(&dispatcher);

    SendUserEvent(receiver);

    EXPECT_THAT(dispatcher.calls.Filtered, ElementsAre("1:", "2:"));
    EXPECT_EQ(1, receiver.count);
}

TEST(QuickWidgetEventFilterDispatcher, AnObjectThatComesLaterIsFilteredWithAllBelowIt)
{
    QObject parent;
    VTestDispatcher dispatcher;
    dispatcher.Append("1");
    parent.installEventFilter(&dispatcher);
    QObject late;
    late.setObjectName("late");
    QObject below(&late);
    below.setObjectName("below");

    late.setParent(&parent);
    SendUserEvent(below);
    late.setParent(nullptr);

    EXPECT_THAT(dispatcher.calls.Added, ElementsAre("1:late", "1:below"));
    EXPECT_THAT(dispatcher.calls.Filtered, ElementsAre("1:below"));
}

TEST(QuickWidgetEventFilterDispatcher, OnlyAnAddedChildMattersAndNoChildEventIsConsumed)
{
    QObject parent;
    QObject child;
    VTestDispatcher dispatcher;
    dispatcher.Append("1", true);

    for (const QEvent::Type type : {QEvent::ChildPolished, QEvent::ChildRemoved}) {
        QChildEvent event(type, &child);
        EXPECT_FALSE(dispatcher.eventFilter(&parent, &event));
    }
    EXPECT_THAT(dispatcher.calls.Added, IsEmpty());

    QChildEvent added(QEvent::ChildAdded, &child);
    EXPECT_FALSE(dispatcher.eventFilter(&parent, &added));
    EXPECT_THAT(dispatcher.calls.Added, ElementsAre("1:"));
}

TEST(QuickWidgetEventFilterDispatcher, AChildEventOfAnotherClassIsLoggedAndGoesOnToTheFilters)
{
    QObject parent;
    VOpenDispatcher dispatcher;
    const TestSupport::VLogCapture log;

    for (const QEvent::Type type :
         {QEvent::ChildAdded, QEvent::ChildPolished, QEvent::ChildRemoved}) {
        QEvent event(type);
        EXPECT_FALSE(dispatcher.eventFilter(&parent, &event));
    }

    const std::string text = "VQuickWidgetEventFilterDispatcher::eventFilter dynamic_cast failed.";
    EXPECT_THAT(log.Texts("Qt Korva"), ElementsAre(text, text, text));
    EXPECT_EQ(2, log.Messages().front().Level);
}

TEST(QuickWidgetEventFilterDispatcher, TracesWhatItInstalls)
{
    VQmlView view;
    const TestSupport::VLogLevel level("Qt Korva", 6);
    const TestSupport::VLogCapture log;

    view.Show("Item { objectName: 'top' }");
    QObject late;
    late.setObjectName("late");
    late.setParent(view.Root());
    late.setParent(nullptr);

    EXPECT_THAT(log.Texts("Qt Korva"),
                Contains("Installing event filter for root QQuickItem 'top' of VQuickWidget "
                         "'View.qml'."));
    EXPECT_THAT(log.Texts("Qt Korva"), Contains("Installing event filter for child item 'late'."));
    for (const TestSupport::VLoggedMessage& message : log.Messages()) {
        EXPECT_EQ(6, message.Level) << message.Text;
    }
}

TEST(QuickWidgetEventFilterDispatcher, SaysNothingAtTheUsualLevel)
{
    const TestSupport::VLogCapture log;

    VQmlView view(tree);

    EXPECT_THAT(log.Texts("Qt Korva"), IsEmpty());
}

TEST(QuickWidgetEventFilterDispatcher, ADyingDispatcherLeavesTheViewsBehindUnfiltered)
{
    VQmlView view(tree);
    auto dispatcher = std::make_unique<VTestDispatcher>();
    dispatcher->Append("1");
    dispatcher->Install(view.Widget());

    dispatcher.reset();
    SendUserEvent(*view.Item("a1"));

    EXPECT_NE(nullptr, view.Root());
}
