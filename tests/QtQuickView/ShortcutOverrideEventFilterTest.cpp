#include "QmlFolder.h"

#include "QtQuickView/QmlKeysSignals.h"
#include "QtQuickView/ShortcutOverrideEventFilter.h"
#include "support/LogCapture.h"

#include <gmock/gmock.h>

#include <QKeyEvent>

using testing::Contains;
using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;

/// What the signals of such a class carry; nobody here looks into it.
class QQuickKeyEvent
{
};

/// A class of the name of Qt's own, which Qt does not show, with one of its signals only.
class QQuickKeysAttached : public QObject
{
    Q_OBJECT

signals:
    void escapePressed(QQuickKeyEvent* event);
};

namespace {

struct VKeyRow
{
    int Key;
    const char* Signal;
    const char* Handler;
};

// clang-format off
const VKeyRow keyRows[] = {
    {Qt::Key_Asterisk, "asteriskPressed(QQuickKeyEvent*)", "onAsteriskPressed"},
    {Qt::Key_Back, "backPressed(QQuickKeyEvent*)", "onBackPressed"},
    {Qt::Key_Backtab, "backtabPressed(QQuickKeyEvent*)", "onBacktabPressed"},
    {Qt::Key_Call, "callPressed(QQuickKeyEvent*)", "onCallPressed"},
    {Qt::Key_Cancel, "cancelPressed(QQuickKeyEvent*)", "onCancelPressed"},
    {Qt::Key_Context1, "context1Pressed(QQuickKeyEvent*)", "onContext1Pressed"},
    {Qt::Key_Context2, "context2Pressed(QQuickKeyEvent*)", "onContext2Pressed"},
    {Qt::Key_Context3, "context3Pressed(QQuickKeyEvent*)", "onContext3Pressed"},
    {Qt::Key_Context4, "context4Pressed(QQuickKeyEvent*)", "onContext4Pressed"},
    {Qt::Key_Delete, "deletePressed(QQuickKeyEvent*)", "onDeletePressed"},
    {Qt::Key_0, "digit0Pressed(QQuickKeyEvent*)", "onDigit0Pressed"},
    {Qt::Key_1, "digit1Pressed(QQuickKeyEvent*)", "onDigit1Pressed"},
    {Qt::Key_2, "digit2Pressed(QQuickKeyEvent*)", "onDigit2Pressed"},
    {Qt::Key_3, "digit3Pressed(QQuickKeyEvent*)", "onDigit3Pressed"},
    {Qt::Key_4, "digit4Pressed(QQuickKeyEvent*)", "onDigit4Pressed"},
    {Qt::Key_5, "digit5Pressed(QQuickKeyEvent*)", "onDigit5Pressed"},
    {Qt::Key_6, "digit6Pressed(QQuickKeyEvent*)", "onDigit6Pressed"},
    {Qt::Key_7, "digit7Pressed(QQuickKeyEvent*)", "onDigit7Pressed"},
    {Qt::Key_8, "digit8Pressed(QQuickKeyEvent*)", "onDigit8Pressed"},
    {Qt::Key_9, "digit9Pressed(QQuickKeyEvent*)", "onDigit9Pressed"},
    {Qt::Key_Down, "downPressed(QQuickKeyEvent*)", "onDownPressed"},
    {Qt::Key_Enter, "enterPressed(QQuickKeyEvent*)", "onEnterPressed"},
    {Qt::Key_Escape, "escapePressed(QQuickKeyEvent*)", "onEscapePressed"},
    {Qt::Key_Flip, "flipPressed(QQuickKeyEvent*)", "onFlipPressed"},
    {Qt::Key_Hangup, "hangupPressed(QQuickKeyEvent*)", "onHangupPressed"},
    {Qt::Key_Left, "leftPressed(QQuickKeyEvent*)", "onLeftPressed"},
    {Qt::Key_Menu, "menuPressed(QQuickKeyEvent*)", "onMenuPressed"},
    {Qt::Key_No, "noPressed(QQuickKeyEvent*)", "onNoPressed"},
    {Qt::Key_Return, "returnPressed(QQuickKeyEvent*)", "onReturnPressed"},
    {Qt::Key_Right, "rightPressed(QQuickKeyEvent*)", "onRightPressed"},
    {Qt::Key_Select, "selectPressed(QQuickKeyEvent*)", "onSelectPressed"},
    {Qt::Key_Space, "spacePressed(QQuickKeyEvent*)", "onSpacePressed"},
    {Qt::Key_Tab, "tabPressed(QQuickKeyEvent*)", "onTabPressed"},
    {Qt::Key_Up, "upPressed(QQuickKeyEvent*)", "onUpPressed"},
    {Qt::Key_VolumeDown, "volumeDownPressed(QQuickKeyEvent*)", "onVolumeDownPressed"},
    {Qt::Key_VolumeUp, "volumeUpPressed(QQuickKeyEvent*)", "onVolumeUpPressed"},
    {Qt::Key_Yes, "yesPressed(QQuickKeyEvent*)", "onYesPressed"},
};
// clang-format on

class VOpenFilter : public VShortcutOverrideEventFilter
{
public:
    using VShortcutOverrideEventFilter::BuildLookup;
};

/// Asks a filter about a key, as Qt does for an object of the focus chain.
class VKeyQuestion
{
public:
    VKeyQuestion(IQuickWidgetEventFilter& filter, QObject& object, int key)
        : event(QEvent::ShortcutOverride, key, Qt::NoModifier)
    {
        event.ignore(); // as such an event starts
        answer = filter.Filter(&object, &event);
    }

    bool Consumed() const { return answer; }
    bool Accepted() const { return event.isAccepted(); }

private:
    QKeyEvent event;
    bool answer = false;
};

QByteArray ItemWith(const char* handler)
{
    return QByteArray("Item { objectName: 'field'; Keys.") + handler + ": {} }";
}

} // namespace

TEST(ShortcutOverrideEventFilter, TheTableHasTheseRowsAndNoOther)
{
    EXPECT_EQ(37U, std::size(keyRows));
    EXPECT_EQ(std::size(keyRows), QmlKeysSignalMetaMethodLookup.size());
    for (const VKeyRow& row : keyRows) {
        const auto found = QmlKeysSignalMetaMethodLookup.find(row.Key);
        ASSERT_NE(QmlKeysSignalMetaMethodLookup.end(), found) << row.Signal;
        EXPECT_STREQ(row.Signal, found->second);
    }
}

class ShortcutOverrideEventFilterKeys : public testing::TestWithParam<VKeyRow>
{
};

TEST_P(ShortcutOverrideEventFilterKeys, AKeyIsKeptBackByItsHandlerAndByNoOther)
{
    VQmlView with(ItemWith(GetParam().Handler));
    VQmlView without(ItemWith("onPressed"));
    VShortcutOverrideEventFilter filter;
    filter.OnItemAdded(with.Root());

    const VKeyQuestion own(filter, *with.Root(), GetParam().Key);
    const VKeyQuestion other(filter, *without.Root(), GetParam().Key);

    EXPECT_TRUE(own.Consumed());
    EXPECT_TRUE(own.Accepted());
    EXPECT_FALSE(other.Consumed());
    EXPECT_FALSE(other.Accepted());
    for (const VKeyRow& row : keyRows) {
        if (row.Key != GetParam().Key) {
            EXPECT_FALSE(VKeyQuestion(filter, *with.Root(), row.Key).Consumed()) << row.Signal;
        }
    }
}

INSTANTIATE_TEST_SUITE_P(AllRows, ShortcutOverrideEventFilterKeys, testing::ValuesIn(keyRows),
                         [](const auto& row) { return std::string(row.param.Handler); });

TEST(ShortcutOverrideEventFilter, AKeyOutsideTheTableIsNeverKeptBack)
{
    VQmlView view(ItemWith("onPressed"));
    VShortcutOverrideEventFilter filter;
    filter.OnItemAdded(view.Root());
    const TestSupport::VLogLevel level("Qt Korva", 6);
    const TestSupport::VLogCapture log;

    const VKeyQuestion question(filter, *view.Root(), Qt::Key_F1);

    EXPECT_FALSE(question.Consumed());
    EXPECT_FALSE(question.Accepted());
    EXPECT_THAT(log.Texts("Qt Korva"), IsEmpty());
}

TEST(ShortcutOverrideEventFilter, BeforeTheFirstItemWithKeysNothingIsKnown)
{
    VQmlView view(ItemWith("onEscapePressed"));
    VShortcutOverrideEventFilter filter;
    const TestSupport::VLogLevel level("Qt Korva", 6);
    const TestSupport::VLogCapture log;

    const VKeyQuestion question(filter, *view.Root(), Qt::Key_Escape);

    EXPECT_FALSE(question.Consumed());
    EXPECT_THAT(log.Texts("Qt Korva"), IsEmpty());
}

TEST(ShortcutOverrideEventFilter, LooksAtShortcutOverridesOnly)
{
    VQmlView view(ItemWith("onEscapePressed"));
    VShortcutOverrideEventFilter filter;
    filter.OnItemAdded(view.Root());

    for (const QEvent::Type type : {QEvent::KeyPress, QEvent::KeyRelease, QEvent::Shortcut}) {
        QKeyEvent event(type, Qt::Key_Escape, Qt::NoModifier);
        event.ignore();
        EXPECT_FALSE(filter.Filter(view.Root(), &event));
        EXPECT_FALSE(event.isAccepted());
    }
}

TEST(ShortcutOverrideEventFilter, AnEventOfAnotherClassIsLogged)
{
    VQmlView view(ItemWith("onEscapePressed"));
    VShortcutOverrideEventFilter filter;
    filter.OnItemAdded(view.Root());
    const TestSupport::VLogCapture log;
    QEvent event(QEvent::ShortcutOverride);

    EXPECT_FALSE(filter.Filter(view.Root(), &event));

    EXPECT_THAT(log.Texts("Qt Korva"),
                ElementsAre("VShortcutOverrideEventFilter::eventFilter dynamic_cast failed."));
    EXPECT_EQ(2, log.Messages().front().Level);
}

TEST(ShortcutOverrideEventFilter, TracesEachWayThatAKeyMayGo)
{
    VQmlView view("Item { objectName: 'field'; Keys.onEscapePressed: {}\n"
                  "       Item { objectName: 'plain' } }");
    VShortcutOverrideEventFilter filter;
    filter.OnItemAdded(view.Root());
    QObject object;
    object.setObjectName("thing");
    const TestSupport::VLogLevel level("Qt Korva", 6);
    const TestSupport::VLogCapture log;

    EXPECT_FALSE(VKeyQuestion(filter, object, Qt::Key_Escape).Consumed());
    EXPECT_FALSE(VKeyQuestion(filter, *view.Item("plain"), Qt::Key_Escape).Consumed());
    EXPECT_FALSE(VKeyQuestion(filter, *view.Root(), Qt::Key_Tab).Consumed());
    EXPECT_TRUE(VKeyQuestion(filter, *view.Root(), Qt::Key_Escape).Consumed());

    EXPECT_THAT(log.Texts("Qt Korva"),
                ElementsAre("Skipping ShortcutOverride event filtering for non QQuickItem 'thing'.",
                            "Could not find QQuickKeysAttached child for item 'plain'.",
                            "No signal connection for item 'field', key 'Key_Tab'.",
                            "Intercepting ShortcutOverride event for item 'field', key "
                            "'Key_Escape'."));
    for (const TestSupport::VLoggedMessage& message : log.Messages()) {
        EXPECT_EQ(6, message.Level) << message.Text;
    }
}

TEST(ShortcutOverrideEventFilter, LearnsTheSignalsFromTheFirstItemOnly)
{
    VQmlView plain("Item {}");
    VQmlView first(ItemWith("onEscapePressed"));
    VQmlView second(ItemWith("onTabPressed"));
    VShortcutOverrideEventFilter filter;
    const TestSupport::VLogLevel level("Qt Korva", 6);
    const TestSupport::VLogCapture log;

    filter.OnItemAdded(plain.Root());
    EXPECT_THAT(log.Texts("Qt Korva"), IsEmpty());
    filter.OnItemAdded(first.Root());
    EXPECT_EQ(37U, log.Texts("Qt Korva").size());
    filter.OnItemAdded(second.Root());
    EXPECT_EQ(37U, log.Texts("Qt Korva").size());

    for (const VKeyRow& row : keyRows) {
        EXPECT_THAT(log.Texts("Qt Korva"),
                    Contains("Adding QMetaMethod for signal '" + std::string(row.Signal) +
                             "' to QmlKeysSignalMetaMethodLookup."));
    }
    EXPECT_TRUE(VKeyQuestion(filter, *second.Root(), Qt::Key_Tab).Consumed());
}

TEST(ShortcutOverrideEventFilter, AMetaObjectOfAnotherClassBuildsNothing)
{
    VOpenFilter filter;
    const TestSupport::VLogCapture log;

    filter.BuildLookup(QQuickItem::staticMetaObject);

    EXPECT_THAT(log.Texts("Qt Korva"),
                ElementsAre("Failed building Qml Keys signal lookup map, expected QMetaObject for "
                            "type 'QQuickKeysAttached' got 'QQuickItem'."));
    EXPECT_EQ(2, log.Messages().front().Level);
}

TEST(ShortcutOverrideEventFilter, ASignalThatIsNotThereIsLoggedAndItsKeyNeverKeptBack)
{
    QQuickItem item;
    auto* keys = new QQuickKeysAttached;
    keys->setParent(&item);
    QObject::connect(keys, &QQuickKeysAttached::escapePressed, keys, [] {});
    VOpenFilter filter;
    const TestSupport::VLogCapture log;

    filter.OnItemAdded(&item);

    EXPECT_EQ(36U, log.Texts("Qt Korva").size());
    EXPECT_THAT(log.Texts("Qt Korva"),
                Contains("Failed building Qml Keys signal lookup map, could not find QMetaMethod "
                         "for signal 'tabPressed(QQuickKeyEvent*)'."));
    for (const TestSupport::VLoggedMessage& message : log.Messages()) {
        EXPECT_EQ(2, message.Level);
    }
    EXPECT_TRUE(VKeyQuestion(filter, item, Qt::Key_Escape).Consumed());
    EXPECT_FALSE(VKeyQuestion(filter, item, Qt::Key_Tab).Consumed());
}

#include "ShortcutOverrideEventFilterTest.moc"
