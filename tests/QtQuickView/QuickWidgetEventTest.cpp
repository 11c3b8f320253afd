#include "QmlFolder.h"

#include <QCoreApplication>
#include <QEvent>
#include <QQuickWindow>

TEST(QuickWidgetEvent, WhatTheWindowSaidOfItsSceneGraphStandsAfterwards)
{
    VQmlView view("Item {}");
    QQuickWindow* window = view.Widget().quickWindow();

    for (const int type : {215, 216}) {
        for (const bool persistent : {true, false}) {
            window->setPersistentSceneGraph(persistent);
            QEvent event{static_cast<QEvent::Type>(type)};
            QCoreApplication::sendEvent(&view.Widget(), &event);
            EXPECT_EQ(persistent, window->isPersistentSceneGraph()) << type;
        }
    }
}

TEST(QuickWidgetEvent, TheViewMayMoveFromWindowToWindow)
{
    const VQmlFolder folder;
    QWidget first;
    QWidget second;
    auto* widget = new VQuickWidget(folder.Manager(), &first);
    folder.Show(*widget, "Item {}");
    first.show();

    widget->setParent(&second);
    second.show();
    widget->show();

    EXPECT_NE(nullptr, widget->rootObject());
    EXPECT_TRUE(widget->quickWindow()->isPersistentSceneGraph());
}
