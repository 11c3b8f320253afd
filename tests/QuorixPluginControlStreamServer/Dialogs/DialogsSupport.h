#pragma once

#include "QtQuickView/QuickWidget.h"
#include "QtQuickView/QuickWidgetManager.h"
#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixPluginControlStreamServer/Authorization/ControlPreferences.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorization.h"
#include "io/Values.h"
#include "notification/IPostalService.h"
#include "notification/MakeShared.h"
#include "qml/QmlModules.h"
#include "support/WindowWait.h"

#include <QApplication>
#include <QDialog>
#include <QPalette>
#include <QQuickItem>
#include <QTest>
#include <QTimer>
#include <gtest/gtest.h>

#include <chrono>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

// What the tests of the dialogs share: a quick context with the host's modules, and an operator who
// looks for items by name and clicks on them.

namespace TestSupport {

/// A postal service that keeps what is posted until a test delivers it.
class VKeptPosts : public KVR::IPostalService
{
public:
    void Post(boost::function<void()> function, std::uintptr_t /*token*/) override
    {
        posts.push_back(std::move(function));
    }

    /// Delivers what has been posted so far. @return how much it was
    std::size_t Deliver()
    {
        std::vector<boost::function<void()>> delivered;
        delivered.swap(posts);
        for (const auto& function : delivered) {
            function();
        }
        return delivered.size();
    }

private:
    std::vector<boost::function<void()>> posts;
};

/// Returns the palette of a light or of a dark desktop.
inline QPalette MakePalette(bool dark)
{
    return dark ? QPalette(QColor(0x3f, 0x44, 0x4c), QColor(0x26, 0x29, 0x2e))
                : QPalette(QColor(0xe4, 0xe7, 0xeb), QColor(0xf4, 0xf5, 0xf7));
}

inline std::shared_ptr<VQuickWidgetManager> MakeQuickContext()
{
    QuorixHost::InitialiseQmlModules();
    return std::make_shared<VQuickWidgetManager>(QString(), false);
}

/// Returns the view of a dialog. Throws where there is none.
inline VQuickWidget& ViewOf(const QWidget& dialog)
{
    auto* const view = dialog.findChild<QQuickWidget*>();
    if (view == nullptr || view->rootObject() == nullptr) {
        throw std::runtime_error("the dialog is empty");
    }
    return static_cast<VQuickWidget&>(*view);
}

/// Returns all items of that name, children in their order.
inline std::vector<QQuickItem*> ItemsOf(QQuickItem& item, const QString& name)
{
    std::vector<QQuickItem*> items;
    if (item.objectName() == name) {
        items.push_back(&item);
    }
    for (QQuickItem* const child : item.childItems()) {
        const auto below = ItemsOf(*child, name);
        items.insert(items.end(), below.begin(), below.end());
    }
    return items;
}

/// Returns the one item of that name. Throws where there is none.
inline QQuickItem& ItemOf(QQuickItem& item, const QString& name)
{
    const auto items = ItemsOf(item, name);
    if (items.size() != 1) {
        throw std::runtime_error(std::to_string(items.size()) + " items " + name.toStdString());
    }
    return *items.front();
}

inline QQuickItem& ItemOf(const QWidget& dialog, const QString& name)
{
    return ItemOf(*ViewOf(dialog).rootObject(), name);
}

/// Returns where an item lies in its view.
inline QRectF PlaceOf(const QQuickItem& item)
{
    return item.mapRectToScene(QRectF(0, 0, item.width(), item.height()));
}

inline void Click(const QWidget& dialog, const QQuickItem& item)
{
    QTest::mouseClick(&ViewOf(dialog), Qt::LeftButton, {}, PlaceOf(item).center().toPoint());
}

inline void Click(const QWidget& dialog, const QString& name)
{
    Click(dialog, ItemOf(dialog, name));
}

/// Shows a dialog without waiting for its answer, and lets it come up.
inline void Show(QDialog& dialog)
{
    dialog.show();
    if (!TestSupport::WaitForActive(dialog)) {
        throw std::runtime_error("the dialog does not come up");
    }
}

/// How long a dialog may wait for what a test does to it.
constexpr std::chrono::milliseconds unansweredLimit{windowLimit};

/// Calls a function once a modal dialog runs its loop. What it throws fails the test, and so does a
/// dialog that nobody answers; it is then taken down.
inline void OnceAsked(std::function<void(QDialog&)> operatorsDoing)
{
    QTimer::singleShot(0, qApp, [doing = std::move(operatorsDoing)] {
        auto* const dialog = qobject_cast<QDialog*>(QApplication::activeModalWidget());
        ASSERT_NE(nullptr, dialog) << "nobody is asked";
        QTimer::singleShot(unansweredLimit, dialog, [dialog] {
            ADD_FAILURE() << "nobody has answered";
            dialog->done(-1);
        });
        EXPECT_TRUE(TestSupport::WaitForActive(*dialog)); // before that it has no keyboard
        try {
            doing(*dialog);
        } catch (const std::exception& exception) {
            ADD_FAILURE() << exception.what();
            dialog->done(-1);
        }
    });
}

/// Fails the test that runs where QML complains: of a binding, a file or a null object.
class VQmlComplaints
{
public:
    VQmlComplaints() : replaced(qInstallMessageHandler(&VQmlComplaints::OnMessage)) {}
    ~VQmlComplaints() { qInstallMessageHandler(replaced); }

    VQmlComplaints(const VQmlComplaints&) = delete;
    VQmlComplaints& operator=(const VQmlComplaints&) = delete;

private:
    static void OnMessage(QtMsgType /*type*/, const QMessageLogContext& /*context*/,
                          const QString& text)
    {
        if (text.contains("qrc:") || text.contains("QML") || text.contains("file:")) {
            ADD_FAILURE() << text.toStdString();
        }
    }

    const QtMessageHandler replaced;
};

/// What a dialog needs around it.
class VDialogs : public testing::Test
{
protected:
    VDialogs()
    {
        QApplication::setPalette(MakePalette(false));
        authorization = KVR::MakeShared<VQuorixControlAuthorization>(posts, store);
    }
    ~VDialogs() override { QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete); }

    VDataValue Preference(const VDataPath& path) const
    {
        const VDataReader reader(*store);
        return reader.GetValue(VDataToken(path));
    }

    const VQmlComplaints complaints; // to the end, since views complain as they go
    const std::shared_ptr<VQuickWidgetManager> context = MakeQuickContext();
    const std::shared_ptr<VDataStore> store = std::make_shared<VDataStore>();
    const std::shared_ptr<VKeptPosts> posts = std::make_shared<VKeptPosts>();
    std::shared_ptr<VQuorixControlAuthorization> authorization;
};

} // namespace TestSupport
