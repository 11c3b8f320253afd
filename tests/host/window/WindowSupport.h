#pragma once

#include "Host.h"
#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataWriter.h"
#include "io/Values.h"
#include "support/WindowWait.h"
#include "window/HostWindow.h"
#include "window/MainWindow.h"
#include "window/Palette.h"

#include <QAction>
#include <QApplication>
#include <QDir>
#include <QMenu>
#include <QMenuBar>
#include <QTest>
#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>
#include <string>

namespace TestSupport {

/// Returns the menu item of that title and text. Throws where there is none.
inline QAction& MenuItem(const QMainWindow& window, const QString& menu, const QString& text)
{
    for (QAction* const title : window.menuBar()->actions()) {
        if (title->text() != menu) {
            continue;
        }
        for (QAction* const item : title->menu()->actions()) {
            if (item->text() == text) {
                return *item;
            }
        }
    }
    throw std::runtime_error("no menu item " + text.toStdString());
}

/// The host's window above a host with four cameras, without any plug-in.
class VShownWindow : public testing::Test
{
protected:
    VShownWindow()
    {
        QuorixHost::SetPalette(false);
        window->Show();
        if (!TestSupport::WaitForActive(Window())) {
            throw std::runtime_error("the window does not come up");
        }
    }

    QuorixHost::VMainWindow& Window() { return window->Window(); }

    /// Returns the child of that class and name. Throws where there is none.
    template <typename TWidget>
    TWidget& Find(const char* name)
    {
        auto* const widget = Window().findChild<TWidget*>(name);
        if (widget == nullptr) {
            throw std::runtime_error(std::string("no widget ") + name);
        }
        return *widget;
    }

    void Write(const VDataPath& path, const VDataValue& value)
    {
        VDataWriter writer(*host.Cameras().store);
        writer.SetValue(VDataToken(path), value);
    }

    /// Keeps a picture of the window where QUORIX_PICTURES names a folder.
    void KeepPicture(const std::string& name)
    {
        const QString folder = qEnvironmentVariable("QUORIX_PICTURES");
        if (!folder.isEmpty()) {
            const QString file = QString::fromStdString(name) + ".png";
            EXPECT_TRUE(Window().grab().save(QDir(folder).filePath(file)));
        }
    }

    int stopRequests = 0;
    QuorixHost::VHost host{4};
    std::unique_ptr<QuorixHost::VHostWindow> window =
        std::make_unique<QuorixHost::VHostWindow>(host, [this] { ++stopRequests; });
};

} // namespace TestSupport
