#include "QmlFolder.h"

#include <QDateTime>
#include <QPointer>

namespace {

/// Makes a manager with reloading before any test does without: what Qt keeps of QML on disk is
/// settled once for the process, as it is in a developer's host.
class VDevelopersProcess : public testing::Environment
{
    void SetUp() override { const VQmlFolder folder; }
};

const auto* const developersProcess = testing::AddGlobalTestEnvironment(new VDevelopersProcess);

void SetTime(const QString& path, const QDateTime& time)
{
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::ReadWrite));
    ASSERT_TRUE(file.setFileTime(time, QFileDevice::FileModificationTime));
}

} // namespace

TEST(QuickWidgetReload, MakesTheRootItemAnewAndKeepsTheValues)
{
    VQmlView view;
    view.Widget().SetProperty("text", "kept");
    view.Show("Item { property string text: persistentProperties.text }");
    const QPointer<QQuickItem> before = view.Root();

    view.Widget().ReloadQML();

    EXPECT_TRUE(before.isNull());
    ASSERT_NE(nullptr, view.Root());
    EXPECT_EQ("kept", view.Property("text").toString());
}

TEST(QuickWidgetReload, KeepsWhatTheQmlItselfWroteIntoTheMap)
{
    VQmlView view;
    view.Widget().SetProperty("count", 1);
    view.Show("Item { Component.onCompleted: persistentProperties.count += 1\n"
              "       property int count: persistentProperties.count }");
    ASSERT_EQ(2, view.Property("count").toInt());

    view.Widget().ReloadQML();

    EXPECT_EQ(3, view.Property("count").toInt());
}

TEST(QuickWidgetReload, ShowsWhatTheFileHoldsByNow)
{
    VQmlView view("Item { objectName: 'old' }");
    view.Folder().Write("View.qml", "import QtQuick 2.0\nItem { objectName: 'new' }");

    view.Widget().ReloadQML();

    ASSERT_NE(nullptr, view.Root());
    EXPECT_EQ("new", view.Root()->objectName());
}

TEST(QuickWidgetReload, ShowsAFileThatWasReplacedByOneOfTheSameTime)
{
    VQmlView view;
    const QString path = view.Folder().Path() + "/View.qml";
    const QDateTime time = QDateTime::fromSecsSinceEpoch(1000000000);
    view.Folder().Write("View.qml", "import QtQuick 2.0\nItem { objectName: 'old' }");
    SetTime(path, time);
    view.Widget().SetSource(view.Folder().Path(), "View.qml");
    ASSERT_EQ("old", view.Root()->objectName());
    view.Folder().Write("View.qml", "import QtQuick 2.0\nItem { objectName: 'new' }");
    SetTime(path, time);

    view.Widget().ReloadQML();

    ASSERT_NE(nullptr, view.Root());
    EXPECT_EQ("new", view.Root()->objectName());
}

TEST(QuickWidgetReload, ReadsTheFilesThatTheFileUsesAnewAsWell)
{
    VQmlView view;
    view.Folder().Write("Part.qml", "import QtQuick 2.0\nItem { objectName: 'old' }");
    view.Show("Part {}");
    view.Folder().Write("Part.qml", "import QtQuick 2.0\nItem { objectName: 'new' }");

    view.Widget().ReloadQML();

    ASSERT_NE(nullptr, view.Root());
    EXPECT_EQ("new", view.Root()->objectName());
}

TEST(QuickWidgetReload, StaysWithThePlaceThatWasFoundFirst)
{
    VQmlView view;
    view.Widget().SetSource(view.Folder().Path(), "Compiled.qml");
    view.Folder().Write("Compiled.qml", "import QtQuick 2.0\nItem { objectName: 'onDisk' }");

    view.Widget().ReloadQML();

    ASSERT_NE(nullptr, view.Root());
    EXPECT_EQ("compiledIn", view.Root()->objectName());
}

TEST(QuickWidgetReload, AllViewsOfTheManagerReloadAtItsSignal)
{
    const VQmlFolder folder;
    VQuickWidget first(folder.Manager());
    VQuickWidget second(folder.Manager());
    folder.Show(first, "Item { objectName: 'old' }");
    folder.Show(second, "Item { objectName: 'old' }");
    folder.Write("View.qml", "import QtQuick 2.0\nItem { objectName: 'new' }");

    emit folder.Manager()->OnReloadQML();

    EXPECT_EQ("new", first.rootObject()->objectName());
    EXPECT_EQ("new", second.rootObject()->objectName());
}

TEST(QuickWidgetReload, AViewThatWasMadeWithReloadDisabledIgnoresTheSignal)
{
    const auto manager = std::make_shared<VQuickWidgetManager>(QString(), false);
    VQuickWidget widget(manager);
    widget.SetSource(QString(), "Compiled.qml");
    const QPointer<QQuickItem> before = widget.rootObject();
    ASSERT_FALSE(before.isNull());

    emit manager->OnReloadQML();

    EXPECT_EQ(before, widget.rootObject());
}

TEST(QuickWidgetReload, AFileThatBrokeMeanwhileEmptiesTheViewUntilItIsMended)
{
    VQmlView view("Item { objectName: 'good' }");

    view.Folder().Write("View.qml", "import QtQuick 2.0\nItem {");
    emit view.Folder().Manager()->OnReloadQML();
    EXPECT_EQ(nullptr, view.Root());

    view.Folder().Write("View.qml", "import QtQuick 2.0\nItem { objectName: 'mended' }");
    emit view.Folder().Manager()->OnReloadQML();
    ASSERT_NE(nullptr, view.Root());
    EXPECT_EQ("mended", view.Root()->objectName());
}

TEST(QuickWidgetReload, AViewThatNeverLoadedStaysEmpty)
{
    VQmlView view;

    emit view.Folder().Manager()->OnReloadQML();

    EXPECT_EQ(nullptr, view.Root());
}

TEST(QuickWidgetReload, OneComponentIsLeftAfterManyReloads)
{
    VQmlView view("Item {}");

    for (int round = 0; round < 10; ++round) {
        view.Folder().Write("View.qml", round % 2 == 0 ? "import QtQuick 2.0\nItem {"
                                                       : "import QtQuick 2.0\nItem {}");
        view.Widget().ReloadQML();
    }

    EXPECT_EQ(1, view.Widget().findChildren<QQmlComponent*>().size());
}
