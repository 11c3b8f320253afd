#pragma once

#include "QtQuickView/QuickWidget.h"
#include "QtQuickView/QuickWidgetManager.h"

#include <gtest/gtest.h>

#include <QFile>
#include <QQuickItem>
#include <QTemporaryDir>

#include <memory>

/// A folder of QML sources for one test, with a manager that prefers them to compiled-in ones.
class VQmlFolder
{
public:
    VQmlFolder() { EXPECT_TRUE(folder.isValid()); }

    QString Path() const { return folder.path(); }

    void Write(const QString& name, const QByteArray& text) const
    {
        QFile file(folder.filePath(name));
        ASSERT_TRUE(file.open(QIODevice::WriteOnly | QIODevice::Truncate));
        ASSERT_EQ(text.size(), file.write(text));
    }

    /// Writes "View.qml" and loads it.
    void Show(VQuickWidget& widget, const QByteArray& text) const
    {
        Write("View.qml", "import QtQuick 2.0\n" + text);
        widget.SetSource(Path(), "View.qml");
    }

    const std::shared_ptr<VQuickWidgetManager>& Manager() const { return manager; }

private:
    const QTemporaryDir folder;
    const std::shared_ptr<VQuickWidgetManager> manager =
        std::make_shared<VQuickWidgetManager>(folder.path(), true);
};

/// One view of such a folder.
class VQmlView
{
public:
    explicit VQmlView(const QByteArray& text = QByteArray())
    {
        if (!text.isEmpty()) {
            Show(text);
        }
    }

    void Show(const QByteArray& text) { folder.Show(widget, text); }

    VQuickWidget& Widget() { return widget; }
    VQmlFolder& Folder() { return folder; }
    QQuickItem* Root() const { return widget.rootObject(); }
    QVariant Property(const char* name) const { return Root()->property(name); }

    /// Returns the item of that object name, which is one of the view's.
    QQuickItem* Item(const QString& name) const
    {
        return Root()->objectName() == name ? Root() : Root()->findChild<QQuickItem*>(name);
    }

private:
    VQmlFolder folder;
    VQuickWidget widget{folder.Manager()};
};
