#include "QuorixPluginInterface/IMenuService.h"
#include "QuorixPluginInterface/IPanelService.h"
#include "host/window/WindowSupport.h"
#include "support/LogCapture.h"
#include "window/PanelService.h"

#include <QDialog>
#include <QPointer>

#include <stdexcept>

using TestSupport::MenuItem;

namespace {

class HostMenu : public TestSupport::VShownWindow
{
};

class HostPanels : public TestSupport::VShownWindow
{
};

} // namespace

TEST_F(HostMenu, AddsAnItemToTheMenuOfThatName)
{
    int chosen = 0;
    window->GetMenuService()->AddAction({"Settings", "Do it..."}, [&] { ++chosen; }, {});

    MenuItem(Window(), "Settings", "Do it...").trigger();

    EXPECT_EQ(1, chosen);
}

TEST_F(HostMenu, MakesMenusThatAreMissing)
{
    window->GetMenuService()->AddAction({"Tools", "More", "Item"}, [] {}, {});
    window->GetMenuService()->AddAction({"Tools", "More", "Second"}, [] {}, {});

    const QAction& more = MenuItem(Window(), "Tools", "More");

    ASSERT_NE(nullptr, more.menu());
    EXPECT_EQ(2, more.menu()->actions().size());
}

TEST_F(HostMenu, GivesAnItemItsShortcuts)
{
    window->GetMenuService()->AddAction({"Settings", "Item"}, [] {}, {"Ctrl+M", "F5"});

    EXPECT_EQ((QList<QKeySequence>{QKeySequence("Ctrl+M"), QKeySequence("F5")}),
              MenuItem(Window(), "Settings", "Item").shortcuts());
}

TEST_F(HostMenu, ShowsTheTextAsItIs)
{
    window->GetMenuService()->AddAction({"Settings", "Salt & pepper"}, [] {}, {});

    EXPECT_NO_THROW(MenuItem(Window(), "Settings", "Salt && pepper")); // as menus write it
}

TEST_F(HostMenu, OutlivesAnItemThatThrows)
{
    const TestSupport::VLogCapture log;
    window->GetMenuService()->AddAction({"Settings", "Fail"},
                                        [] { throw std::runtime_error("broken"); }, {});

    EXPECT_NO_THROW(MenuItem(Window(), "Settings", "Fail").trigger());

    EXPECT_EQ((std::vector<std::string>{"A menu item failed: broken"}), log.Texts("Host"));
}

TEST_F(HostMenu, AddsNothingWithoutAMenuOrAWindow)
{
    const TestSupport::VLogCapture log;
    const std::shared_ptr<IMenuService> service = window->GetMenuService();
    service->AddAction({"Item"}, [] {}, {});
    window.reset();

    service->AddAction({"Settings", "Item"}, [] {}, {});

    EXPECT_EQ(2U, log.Texts("Host").size());
}

TEST_F(HostPanels, ShowsAPanelThatDeletesItselfWhenClosed)
{
    const QPointer<QDialog> panel = new QDialog;

    window->GetPanelService()->ShowPanel("Panel", panel);
    EXPECT_TRUE(panel->isVisible());
    panel->close();
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);

    EXPECT_TRUE(panel.isNull());
}

TEST_F(HostPanels, IgnoresAPanelThatIsNone)
{
    EXPECT_NO_THROW(window->GetPanelService()->ShowPanel("Panel", nullptr));
}

TEST_F(HostPanels, MakesARegisteredPanel)
{
    QPointer<QWidget> made;
    const auto service = std::make_shared<QuorixHost::VPanelService>(&Window());
    service->RegisterPanel("Panel", [&] { return made = new QWidget; });
    service->RegisterPanel("Gone", [] { return nullptr; });

    EXPECT_TRUE(service->OpenPanel("Panel"));
    EXPECT_FALSE(service->OpenPanel("Gone"));
    EXPECT_FALSE(service->OpenPanel("Unknown"));

    ASSERT_FALSE(made.isNull());
    EXPECT_TRUE(made->isVisible());
}

TEST_F(HostPanels, DestroysOpenPanelsBeforeThePluginGoes)
{
    const QPointer<QDialog> closed = new QDialog;
    const QPointer<QDialog> open = new QDialog;
    window->GetPanelService()->ShowPanel("Closed", closed);
    window->GetPanelService()->ShowPanel("Open", open);
    closed->close();
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);

    window->ClosePanels();

    EXPECT_TRUE(open.isNull());
}
