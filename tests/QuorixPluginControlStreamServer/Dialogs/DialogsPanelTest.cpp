#include "Dialogs/DialogsSupport.h"
#include "QuorixPluginControlStreamServer/Authorization/ControlPanel.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlManagementDialog.h"
#include "QuorixPluginInterface/IMenuService.h"
#include "QuorixPluginInterface/IPanelService.h"
#include "QuorixPluginInterface/IQuorixGUI.h"

#include <gmock/gmock.h>

using testing::ElementsAre;
using TestSupport::ItemOf;

namespace {

using Calls = std::vector<std::string>;

/// A menu service that keeps what it is given.
class VMenus : public IMenuService
{
public:
    explicit VMenus(Calls& calls) : calls(calls) {}

    void AddAction(const std::vector<std::string>& path, boost::function<void()> function,
                   const std::vector<std::string>& shortcuts) override
    {
        calls.push_back("AddAction");
        Path = path;
        Shortcuts = shortcuts;
        Function = std::move(function);
    }

    std::vector<std::string> Path;
    std::vector<std::string> Shortcuts = {"none was given"};
    boost::function<void()> Function;

private:
    Calls& calls;
};

/// A panel service that keeps what it is given and shows nothing.
class VPanels : public IPanelService
{
public:
    explicit VPanels(Calls& calls) : calls(calls) {}

    void RegisterPanel(const std::string& name, boost::function<QWidget*()> factory) override
    {
        calls.push_back("RegisterPanel " + name);
        Factory = std::move(factory);
    }

    void ShowPanel(const std::string& name, QWidget* widget) override
    {
        calls.push_back("ShowPanel " + name);
        Shown.reset(widget);
    }

    boost::function<QWidget*()> Factory;
    std::unique_ptr<QWidget> Shown;

private:
    Calls& calls;
};

/// A host's GUI, of which a test may take away a part.
class VGui : public IQuorixGUI
{
public:
    std::shared_ptr<VQuickWidgetManager> GetQuickContext() override { return Context; }
    std::shared_ptr<IMenuService> GetMenuService() override { return Menus; }
    std::shared_ptr<IPanelService> GetPanelService() override { return Panels; }

    Calls Received;
    std::shared_ptr<VQuickWidgetManager> Context = TestSupport::MakeQuickContext();
    std::shared_ptr<VMenus> Menus = std::make_shared<VMenus>(Received);
    std::shared_ptr<VPanels> Panels = std::make_shared<VPanels>(Received);
};

class ControlPanel : public TestSupport::VDialogs
{
protected:
    VGui gui;
};

} // namespace

TEST_F(ControlPanel, RegistersThePanelBeforeTheMenuItem)
{
    AddControlPanel(gui, authorization);

    EXPECT_THAT(gui.Received,
                ElementsAre("RegisterPanel Manage Control Authorizations", "AddAction"));
    EXPECT_THAT(gui.Menus->Path, ElementsAre("Settings", "Manage Control Authorizations..."));
    EXPECT_TRUE(gui.Menus->Shortcuts.empty());
}

TEST_F(ControlPanel, ShowsANewDialogEachTimeTheItemIsChosen)
{
    AddControlPanel(gui, authorization);
    gui.Menus->Function();
    ASSERT_NE(nullptr, gui.Panels->Shown);
    EXPECT_EQ(0, ItemOf(*gui.Panels->Shown, "list").property("count").toInt());

    authorization->SetDevices({{"1", {true, "Tablet"}}});
    gui.Menus->Function();

    EXPECT_EQ("ShowPanel Manage Control Authorizations", gui.Received.back());
    EXPECT_EQ(4U, gui.Received.size());
    EXPECT_NE(nullptr, qobject_cast<VQuorixControlManagementDialog*>(gui.Panels->Shown.get()));
    EXPECT_EQ(nullptr, gui.Panels->Shown->parentWidget());
    EXPECT_EQ(1, ItemOf(*gui.Panels->Shown, "list").property("count").toInt());
}

TEST_F(ControlPanel, MakesItsDialogForThePanelToo)
{
    AddControlPanel(gui, authorization);

    const std::unique_ptr<QWidget> made(gui.Panels->Factory());

    EXPECT_NE(nullptr, qobject_cast<VQuorixControlManagementDialog*>(made.get()));
}

TEST_F(ControlPanel, DoesNothingAfterThePanelServiceHasGone)
{
    AddControlPanel(gui, authorization);
    gui.Panels.reset();
    const Calls before = gui.Received;

    gui.Menus->Function();

    EXPECT_EQ(before, gui.Received);
}

TEST_F(ControlPanel, KeepsNeitherTheAuthorizationNorThePanelService)
{
    const std::weak_ptr<VQuorixControlAuthorization> authorizationGone = authorization;
    const std::weak_ptr<VPanels> panelsGone = gui.Panels;
    AddControlPanel(gui, authorization);
    const boost::function<QWidget*()> factory = gui.Panels->Factory;

    authorization.reset();
    EXPECT_TRUE(authorizationGone.expired());
    EXPECT_EQ(nullptr, factory());
    gui.Menus->Function();
    EXPECT_EQ(nullptr, gui.Panels->Shown);

    gui.Panels.reset();
    EXPECT_TRUE(panelsGone.expired());
}

TEST_F(ControlPanel, LeavesOutWhatTheHostHasNot)
{
    gui.Panels.reset();
    AddControlPanel(gui, authorization);
    EXPECT_THAT(gui.Received, ElementsAre("AddAction"));
    EXPECT_NO_THROW(gui.Menus->Function());

    VGui withoutMenus;
    withoutMenus.Menus.reset();
    AddControlPanel(withoutMenus, authorization);
    EXPECT_THAT(withoutMenus.Received, ElementsAre("RegisterPanel Manage Control Authorizations"));
}

TEST_F(ControlPanel, IsNoneWithoutAQuickContextOrAnAuthorization)
{
    gui.Context.reset();
    AddControlPanel(gui, authorization);
    EXPECT_EQ(nullptr, gui.Panels->Factory());

    VGui complete;
    AddControlPanel(complete, nullptr);
    EXPECT_EQ(nullptr, complete.Panels->Factory());
}
