#include "QmlFolder.h"

#include <QDir>
#include <QQmlEngine>
#include <QSignalSpy>

namespace {

/// The one child component in which a failed load leaves its errors.
QQmlComponent* OnlyComponent(const QObject& widget)
{
    const auto components =
        widget.findChildren<QQmlComponent*>(QString(), Qt::FindDirectChildrenOnly);
    return components.size() == 1 ? components.front() : nullptr;
}

QQmlPropertyMap* MapOf(VQuickWidget& widget)
{
    const QVariant map = widget.QmlContext().contextProperty("persistentProperties");
    return qobject_cast<QQmlPropertyMap*>(map.value<QObject*>());
}

} // namespace

TEST(QuickWidget, AnswersToTheNamesOfItsClassAndItsInterface)
{
    VQmlView view;

    EXPECT_EQ(&view.Widget(), view.Widget().qt_metacast("VQuickWidget"));
    EXPECT_EQ(static_cast<IQuickWidget*>(&view.Widget()),
              view.Widget().qt_metacast("IQuickWidget"));
    EXPECT_EQ(static_cast<IQuickWidget*>(&view.Widget()),
              view.Widget().qt_metacast("com.Korva.IQuickWidget"));
    EXPECT_STREQ("com.Korva.IQuickWidget", qobject_interface_iid<IQuickWidget*>());
    EXPECT_EQ(nullptr, view.Widget().qt_metacast("com.Korva.Other"));
}

TEST(QuickWidget, IsFoundAsItsInterfaceByCast)
{
    VQmlView view;
    QObject* object = &view.Widget();

    EXPECT_EQ(static_cast<IQuickWidget*>(&view.Widget()), qobject_cast<IQuickWidget*>(object));
}

TEST(QuickWidget, DeclaresTheReloadSlotAndTheManagerItsSignal)
{
    EXPECT_LE(0, VQuickWidget::staticMetaObject.indexOfSlot("ReloadQML()"));
    EXPECT_LE(0, VQuickWidgetManager::staticMetaObject.indexOfSignal("OnReloadQML()"));
}

TEST(QuickWidget, TakesTheFocusAndPaintsItsWholeAreaOnTop)
{
    VQmlView view;

    EXPECT_EQ(Qt::StrongFocus, view.Widget().focusPolicy());
    EXPECT_TRUE(view.Widget().testAttribute(Qt::WA_OpaquePaintEvent));
    EXPECT_TRUE(view.Widget().testAttribute(Qt::WA_AlwaysStackOnTop));
}

TEST(QuickWidget, SharesTheManagersEngineAndHasItsOwnContextInIt)
{
    const VQmlFolder folder;
    VQuickWidget first(folder.Manager());
    VQuickWidget second(folder.Manager());

    EXPECT_EQ(folder.Manager()->Engine(), first.engine());
    EXPECT_EQ(folder.Manager()->Engine(), second.engine());
    EXPECT_EQ(folder.Manager()->Engine()->rootContext(), first.QmlContext().parentContext());
    EXPECT_NE(&first.QmlContext(), &second.QmlContext());
}

TEST(QuickWidget, TheManagerOwnsTheEngine)
{
    const VQmlFolder folder;

    EXPECT_EQ(folder.Manager().get(), folder.Manager()->Engine()->parent());
}

TEST(QuickWidget, KeepsTheManagerUntilItIsGoneItself)
{
    VQmlFolder folder;
    auto manager = std::make_shared<VQuickWidgetManager>(folder.Path(), true);
    const std::weak_ptr<VQuickWidgetManager> observer = manager;
    auto widget = std::make_unique<VQuickWidget>(std::move(manager));
    folder.Show(*widget, "Item { property string text: persistentProperties.text }");

    EXPECT_FALSE(observer.expired());
    widget.reset();
    EXPECT_TRUE(observer.expired());
}

TEST(QuickWidget, ADyingViewLeavesTheManagerToTheOthers)
{
    const VQmlFolder folder;
    auto dying = std::make_unique<VQuickWidget>(folder.Manager());
    VQuickWidget staying(folder.Manager());
    folder.Show(*dying, "Item {}");
    folder.Show(staying, "Item {}");

    dying.reset();
    emit folder.Manager()->OnReloadQML();

    EXPECT_NE(nullptr, staying.rootObject());
}

TEST(QuickWidget, SetPropertyReachesTheMapAndTellsOfIt)
{
    VQmlView view;
    QSignalSpy changes(MapOf(view.Widget()), &QQmlPropertyMap::valueChanged);

    view.Widget().SetProperty("name", "one");

    ASSERT_EQ(1, changes.count());
    EXPECT_EQ("name", changes[0][0].toString());
    EXPECT_EQ("one", changes[0][1].value<QVariant>().toString());
    EXPECT_EQ("one", MapOf(view.Widget())->value("name").toString());
}

TEST(QuickWidget, SetPropertyWithAnEqualValueTellsNothing)
{
    VQmlView view;
    view.Widget().SetProperty("name", "one");
    QSignalSpy changes(MapOf(view.Widget()), &QQmlPropertyMap::valueChanged);

    view.Widget().SetProperty("name", QString("one"));
    EXPECT_EQ(0, changes.count());

    view.Widget().SetProperty("name", "two");
    EXPECT_EQ(1, changes.count());
}

TEST(QuickWidget, TheQmlReadsTheValuesAndFollowsThem)
{
    VQmlView view;
    view.Widget().SetProperty("text", "first");
    view.Show("Item { property string text: persistentProperties.text }");

    EXPECT_EQ("first", view.Property("text").toString());
    view.Widget().SetProperty("text", "second");
    EXPECT_EQ("second", view.Property("text").toString());
}

TEST(QuickWidget, WhatADialogPutsIntoTheContextIsSeenByItsQmlOnly)
{
    const VQmlFolder folder;
    VQuickWidget with(folder.Manager());
    VQuickWidget without(folder.Manager());
    with.QmlContext().setContextProperty("answer", 42);
    const QByteArray text = "Item { property bool known: typeof answer !== 'undefined' }";

    folder.Show(with, text);
    folder.Show(without, text);

    EXPECT_TRUE(with.rootObject()->property("known").toBool());
    EXPECT_FALSE(without.rootObject()->property("known").toBool());
}

TEST(QuickWidget, IsNamedByTheRelativePath)
{
    VQmlView view;
    view.Widget().SetSource(view.Folder().Path(), "Compiled.qml");

    EXPECT_EQ("Compiled.qml", view.Widget().objectName());
}

TEST(QuickWidget, AFileOnDiskWinsOverTheCompiledInOneWhereReloadIsEnabled)
{
    VQmlView view;
    view.Folder().Write("Compiled.qml", "import QtQuick 2.0\nItem { objectName: 'onDisk' }");

    view.Widget().SetSource(view.Folder().Path(), "Compiled.qml");

    ASSERT_NE(nullptr, view.Root());
    EXPECT_EQ("onDisk", view.Root()->objectName());
    EXPECT_EQ(QUrl::fromLocalFile(view.Folder().Path() + "/Compiled.qml"), view.Widget().source());
}

TEST(QuickWidget, WithoutAFileOnDiskTheCompiledInOneIsTaken)
{
    VQmlView view;

    view.Widget().SetSource(view.Folder().Path(), "Compiled.qml");

    ASSERT_NE(nullptr, view.Root());
    EXPECT_EQ("compiledIn", view.Root()->objectName());
    EXPECT_EQ(QUrl("qrc:/Compiled.qml"), view.Widget().source());
}

TEST(QuickWidget, AFolderOfThatNameIsNoFile)
{
    VQmlView view;
    ASSERT_TRUE(QDir(view.Folder().Path()).mkdir("Compiled.qml"));

    view.Widget().SetSource(view.Folder().Path(), "Compiled.qml");

    ASSERT_NE(nullptr, view.Root());
    EXPECT_EQ("compiledIn", view.Root()->objectName());
}

TEST(QuickWidget, WithReloadDisabledAFileOnDiskIsIgnored)
{
    const VQmlFolder folder;
    folder.Write("Compiled.qml", "import QtQuick 2.0\nItem { objectName: 'onDisk' }");
    VQuickWidget widget(std::make_shared<VQuickWidgetManager>(folder.Path(), false));

    widget.SetSource(folder.Path(), "Compiled.qml");

    ASSERT_NE(nullptr, widget.rootObject());
    EXPECT_EQ("compiledIn", widget.rootObject()->objectName());
}

TEST(QuickWidget, AnotherSourceReplacesTheFirst)
{
    VQmlView view("Item { objectName: 'first' }");

    view.Widget().SetSource(view.Folder().Path(), "Compiled.qml");

    ASSERT_NE(nullptr, view.Root());
    EXPECT_EQ("compiledIn", view.Root()->objectName());
}

TEST(QuickWidget, AMissingFileLeavesTheViewEmpty)
{
    VQmlView view;

    view.Widget().SetSource(view.Folder().Path(), "Nowhere.qml");

    EXPECT_EQ(nullptr, view.Root());
    ASSERT_NE(nullptr, OnlyComponent(view.Widget()));
    EXPECT_TRUE(OnlyComponent(view.Widget())->isError());
}

TEST(QuickWidget, BrokenQmlLeavesTheViewEmptyAndItsErrorsInTheComponent)
{
    VQmlView view("Item {}");

    view.Show("Item { this is no QML }");

    EXPECT_EQ(nullptr, view.Root());
    EXPECT_EQ(QQuickWidget::Null, view.Widget().status());
    ASSERT_NE(nullptr, OnlyComponent(view.Widget()));
    EXPECT_FALSE(OnlyComponent(view.Widget())->errors().isEmpty());
}

TEST(QuickWidget, AGoodFileAfterABrokenOneIsShown)
{
    VQmlView view("Item { this is no QML }");

    view.Show("Item { objectName: 'good' }");

    ASSERT_NE(nullptr, view.Root());
    EXPECT_EQ("good", view.Root()->objectName());
    ASSERT_NE(nullptr, OnlyComponent(view.Widget()));
    EXPECT_FALSE(OnlyComponent(view.Widget())->isError());
}

TEST(QuickWidget, ARootThatIsNoItemLeavesTheViewEmpty)
{
    QObject log;
    VQmlView view;
    view.Widget().QmlContext().setContextProperty("log", &log);

    view.Show("QtObject { Component.onDestruction: log.objectName = 'destroyed' }");

    EXPECT_EQ(nullptr, view.Root());
    EXPECT_EQ("destroyed", log.objectName()); // nobody else would ever do it
}

TEST(QuickWidget, NothingComplainsWhenAViewCloses)
{
    // What QML still refers to must outlive it: a binding that is evaluated afterwards prints.
    static int warnings;
    warnings = 0;
    const QtMessageHandler previous = qInstallMessageHandler(
        [](QtMsgType, const QMessageLogContext&, const QString&) { ++warnings; });
    {
        QObject dialog;
        dialog.setObjectName("dialog");
        VQmlView view;
        view.Widget().QmlContext().setContextProperty("dialog", &dialog);
        view.Widget().SetProperty("map", QVariantMap{{"text", "x"}});
        view.Show("Item { property string a: dialog.objectName\n"
                  "       property string b: persistentProperties.map.text }");
        EXPECT_EQ("dialog", view.Property("a").toString());
    }
    qInstallMessageHandler(previous);

    EXPECT_EQ(0, warnings);
}

TEST(QuickWidgetManager, LooksForModulesOnDiskAndInTheResources)
{
    const VQmlFolder folder;
    const QStringList paths = folder.Manager()->Engine()->importPathList();

    // The developer's module on disk is found first, as the developer's file is.
    const int onDisk = paths.indexOf(QDir(folder.Path()).canonicalPath());
    const int compiledIn = paths.indexOf(QRegExp("qrc:/*|:/*"));
    ASSERT_LE(0, onDisk) << paths.join(' ').toStdString();
    ASSERT_LE(0, compiledIn) << paths.join(' ').toStdString();
    EXPECT_LT(onDisk, compiledIn);
}

TEST(QuickWidgetManager, WithReloadDisabledModulesOnDiskAreNotLookedFor)
{
    const VQmlFolder folder;
    const VQuickWidgetManager manager(folder.Path(), false);

    EXPECT_FALSE(manager.Engine()->importPathList().contains(QDir(folder.Path()).canonicalPath()));
    EXPECT_EQ(folder.Path(), manager.SourceFolder());
    EXPECT_FALSE(manager.IsReloadEnabled());
}
