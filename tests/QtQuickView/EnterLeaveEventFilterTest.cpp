#include "QmlFolder.h"

#include "QtQuickView/EnterLeaveEventFilter.h"
#include "support/LogCapture.h"

#include <gmock/gmock.h>

#include <QCoreApplication>
#include <QEnterEvent>
#include <QQuickWidget>
#include <QTest>
#include <QWindow>

#include <functional>

using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

/// Writes down the hover events of the items that it is put on.
class VHoverRecorder : public QObject
{
public:
    bool eventFilter(QObject* object, QEvent* event) override
    {
        const bool enters = event->type() == QEvent::HoverEnter;
        if (enters || event->type() == QEvent::HoverLeave) {
            names.push_back((enters ? "+" : "-") + object->objectName().toStdString());
            const auto* hover = static_cast<QHoverEvent*>(event);
            position = hover->posF();
            oldPosition = hover->oldPosF();
            modifiers = hover->modifiers();
            if (action) {
                action(object);
            }
        }
        return false;
    }

    std::vector<std::string> names;
    QPointF position;
    QPointF oldPosition;
    Qt::KeyboardModifiers modifiers;
    std::function<void(QObject*)> action;
};

/// A view of 100 by 100 whose items record what they hear from a filter. The events go to the
/// filter alone, as Qt has a hover of its own for the item that lies on top.
class VHoverView
{
public:
    explicit VHoverView(const QByteArray& items)
        : view("Item { objectName: 'root'; width: 100; height: 100\n" + items + "}")
    {
        view.Widget().resize(100, 100);
        for (QQuickItem* item : view.Root()->findChildren<QQuickItem*>()) {
            item->setAcceptHoverEvents(item->property("hovers").toBool());
            item->installEventFilter(&recorder);
        }
        view.Root()->installEventFilter(&recorder);
    }

    void Enter(double x, double y)
    {
        QEnterEvent event(QPointF(x, y), QPointF(x, y), QPointF(x, y));
        EXPECT_FALSE(Send(event));
    }

    void Leave()
    {
        QEvent event(QEvent::Leave);
        EXPECT_FALSE(Send(event));
    }

    bool Send(QEvent& event) { return filter.Filter(&view.Widget(), &event); }

    VQmlView view;
    VHoverRecorder recorder;

private:
    VEnterLeaveEventFilter filter;
};

const QByteArray hovering = "property bool hovers: true;";

const QByteArray nested =
    "Item { objectName: 'a'; x: 10; y: 20; width: 50; height: 50;" + hovering +
    "  Item { objectName: 'a1'; x: 5; y: 5; width: 10; height: 10;" + hovering +
    "}"
    "  Item { objectName: 'outside'; x: 60; y: 0; width: 10; height: 10;" +
    hovering +
    "} }"
    "Item { objectName: 'deaf'; width: 100; height: 100;"
    "  Item { objectName: 'b'; width: 100; height: 100;" +
    hovering + "} }";

} // namespace

TEST(EnterLeaveEventFilter, EntersEveryItemBelowThePointerDepthFirst)
{
    VHoverView hover(nested);

    hover.Enter(17, 27);

    EXPECT_THAT(hover.recorder.names, ElementsAre("+a", "+a1", "+b"));
}

TEST(EnterLeaveEventFilter, EntersAChildThatLiesOutsideItsParent)
{
    VHoverView hover(nested);

    hover.Enter(72, 22);

    EXPECT_THAT(hover.recorder.names, ElementsAre("+outside", "+b"));
}

TEST(EnterLeaveEventFilter, GivesThePositionInTheItemAsNewAndOld)
{
    VHoverView hover("Item { objectName: 'a'; x: 10; y: 20; width: 50; height: 50;" + hovering +
                     "}");

    hover.Enter(17, 28);

    EXPECT_EQ(QPointF(7, 8), hover.recorder.position);
    EXPECT_EQ(QPointF(7, 8), hover.recorder.oldPosition);
}

TEST(EnterLeaveEventFilter, TellsOfTheKeysThatAreHeldDown)
{
    VHoverView hover("Item { objectName: 'a'; width: 50; height: 50;" + hovering + "}");
    QWindow window;
    window.show();

    QTest::keyPress(&window, Qt::Key_Control, Qt::ControlModifier);
    hover.Enter(5, 5);
    EXPECT_EQ(Qt::ControlModifier, hover.recorder.modifiers);
    hover.Leave();
    EXPECT_EQ(Qt::ControlModifier, hover.recorder.modifiers);

    QTest::keyRelease(&window, Qt::Key_Control, Qt::NoModifier);
    hover.Enter(5, 5);
    EXPECT_EQ(Qt::NoModifier, hover.recorder.modifiers);
}

TEST(EnterLeaveEventFilter, LeavesAnItemAloneThatThePointerIsNotOver)
{
    VHoverView hover("Item { objectName: 'a'; x: 10; width: 5; height: 5;" + hovering + "}");

    hover.Enter(50, 50);
    hover.Leave();

    EXPECT_THAT(hover.recorder.names, IsEmpty());
}

TEST(EnterLeaveEventFilter, LeavesAnItemAloneThatTakesNoHoverEvents)
{
    VHoverView hover("Item { objectName: 'a'; width: 100; height: 100 }");

    hover.Enter(50, 50);

    EXPECT_THAT(hover.recorder.names, IsEmpty());
}

// Deliberately the last one only, see the filter.
TEST(EnterLeaveEventFilter, TellsTheItemThatWasEnteredLastOfTheLeaving)
{
    VHoverView hover(nested);
    hover.Enter(17, 27);
    hover.recorder.names.clear();

    hover.Leave();

    EXPECT_THAT(hover.recorder.names, ElementsAre("-b"));
}

TEST(EnterLeaveEventFilter, TellsOfOneLeavingOnce)
{
    VHoverView hover(nested);
    hover.Enter(17, 27);
    hover.Leave();
    hover.recorder.names.clear();

    hover.Leave();

    EXPECT_THAT(hover.recorder.names, IsEmpty());
}

TEST(EnterLeaveEventFilter, AnItemThatIsGoneHearsNothing)
{
    VHoverView hover("Item { objectName: 'a'; width: 100; height: 100;" + hovering + "}");
    hover.Enter(5, 5);
    hover.recorder.names.clear();

    hover.view.Widget().ReloadQML();
    hover.Leave();

    EXPECT_THAT(hover.recorder.names, IsEmpty());
}

TEST(EnterLeaveEventFilter, AHandlerMayDestroyTheItemsThatWouldBeNext)
{
    VHoverView hover(nested);
    hover.recorder.action = [&hover](QObject* object) {
        if (object->objectName() == "a") {
            delete hover.view.Item("a1");
            delete hover.view.Item("deaf");
        }
    };

    hover.Enter(17, 27);

    EXPECT_THAT(hover.recorder.names, ElementsAre("+a"));
}

TEST(EnterLeaveEventFilter, AHandlerMayReloadTheView)
{
    VHoverView hover("Item { objectName: 'a'; width: 100; height: 100;" + hovering + "}");
    hover.recorder.action = [&hover](QObject* object) {
        // Later, as the item that is being told must not go away below its own event.
        QMetaObject::invokeMethod(
            &hover.view.Widget(), [&hover] { hover.view.Widget().ReloadQML(); },
            Qt::QueuedConnection);
        hover.recorder.action = nullptr;
        EXPECT_EQ("a", object->objectName());
    };

    hover.Enter(5, 5);
    QCoreApplication::processEvents();
    hover.Leave();

    EXPECT_THAT(hover.recorder.names, ElementsAre("+a"));
}

TEST(EnterLeaveEventFilter, OtherEventsPass)
{
    VHoverView hover(nested);
    QEvent other(QEvent::FocusIn);

    EXPECT_FALSE(hover.Send(other));

    EXPECT_THAT(hover.recorder.names, IsEmpty());
}

TEST(EnterLeaveEventFilter, AnObjectThatIsNoViewIsTracedOnly)
{
    const TestSupport::VLogLevel level("Qt Korva", 6);
    const TestSupport::VLogCapture log;
    QObject object;
    object.setObjectName("thing");
    VEnterLeaveEventFilter filter;
    QEnterEvent enter{QPointF(), QPointF(), QPointF()};
    QEvent leave(QEvent::Leave);

    EXPECT_FALSE(filter.Filter(&object, &enter));
    EXPECT_FALSE(filter.Filter(&object, &leave));

    EXPECT_THAT(log.Texts("Qt Korva"),
                ElementsAre("Enter event for item 'thing'.", "Leave event for item 'thing'."));
    EXPECT_EQ(6, log.Messages().front().Level);
}

TEST(EnterLeaveEventFilter, AViewWithoutARootIsTracedOnly)
{
    const TestSupport::VLogLevel level("Qt Korva", 6);
    const TestSupport::VLogCapture log;
    QQuickWidget widget;
    VEnterLeaveEventFilter filter;
    QEnterEvent enter{QPointF(), QPointF(), QPointF()};
    QEvent leave(QEvent::Leave);

    EXPECT_FALSE(filter.Filter(&widget, &enter));
    EXPECT_FALSE(filter.Filter(&widget, &leave));

    EXPECT_EQ(2U, log.Texts("Qt Korva").size());
}

TEST(EnterLeaveEventFilter, AnEnterEventOfAnotherClassEntersNothing)
{
    VHoverView hover(nested);
    QEvent enter(QEvent::Enter);

    EXPECT_FALSE(hover.Send(enter));

    EXPECT_THAT(hover.recorder.names, IsEmpty());
}

TEST(EnterLeaveEventFilter, AHoveringMouseAreaKnowsThatThePointerIsInside)
{
    VQmlView view("MouseArea { width: 100; height: 100; hoverEnabled: true }");
    view.Widget().resize(100, 100);
    QEnterEvent enter(QPointF(5, 5), QPointF(5, 5), QPointF(5, 5));
    QCoreApplication::sendEvent(&view.Widget(), &enter);
    EXPECT_TRUE(view.Property("containsMouse").toBool());

    QEvent leave(QEvent::Leave);
    QCoreApplication::sendEvent(&view.Widget(), &leave);
    EXPECT_FALSE(view.Property("containsMouse").toBool());
}
