#include "ControlSystem.h"
#include "HostApplication.h"
#include "Plugin.h"
#include "QuorixPluginInterface/IPlugin.h"
#include "host/window/WindowSupport.h"
#include "support/TemporaryFolder.h"
#include "support/TestListener.h"
#include "window/PanelService.h"
#include "window/Question.h"

#include <QDialog>
#include <QPointer>
#include <QQuickItem>
#include <QQuickWidget>
#include <QTimer>

#include <chrono>
#include <functional>
#include <memory>
#include <string>

// The built plug-in in the host's window, in one process, from start to stop.

using QuorixHost::VHostWindow;
using QuorixHost::VPlugin;
using TestSupport::MenuItem;

namespace {

const QString menuItem = "Manage Control Authorizations...";
const std::string panelName = "Manage Control Authorizations";

/// Runs `System.Authorize` as a device would. @return the status of its reply
std::string Authorize(IControlSystem& controlSystem, const std::wstring& deviceId = L"tablet-1")
{
    ControlSystem::IParameters input;
    input.Set(L"DeviceId", deviceId);
    input.Set(L"DeviceName", L"Tablet");
    std::wstring status;
    controlSystem.ExecuteCommand(
        L"System.Authorize", input,
        [&](const ControlSystem::IParameters& reply) { status = reply.Get(L"Status"); },
        [](ControlSystem::IResult) {});
    return std::string(status.begin(), status.end());
}

/// Returns the dialog that is open and no question, null where there is none.
QDialog* FindReview()
{
    for (QWidget* const widget : QApplication::topLevelWidgets()) {
        auto* const dialog = qobject_cast<QDialog*>(widget);
        if (dialog != nullptr && dialog->isVisible() && !QuorixHost::IsQuestion(*dialog)) {
            return dialog;
        }
    }
    return nullptr;
}

/// A plug-in that has been started in the host's window.
class WindowPlugin : public TestSupport::VShownWindow
{
protected:
    WindowPlugin() { Start(*window); }

    void Start(IQuorixGUI& gui)
    {
        plugin = std::make_unique<VPlugin>(QUORIX_PLUGIN_LIBRARY);
        EXPECT_TRUE((*plugin)->Start(host));
        EXPECT_TRUE((*plugin)->InitialiseGUI(host, gui));
    }

    void Destroy()
    {
        (*plugin)->Stop();
        plugin.reset();
    }

    std::string Stored(const char* preference)
    {
        const VDataReader reader(*host.Cameras().store);
        return ReadString(
            reader.GetValue(VDataToken(VDataPath{"Preferences", "User", preference})));
    }

    /// Has a device asked about, and answers once the dialog is open.
    void AskAndAnswer(const std::function<void(QDialog&)>& answer)
    {
        bool answered = false;
        QTimer poll;
        QObject::connect(&poll, &QTimer::timeout, [&] {
            QDialog* const question = QuorixHost::FindQuestion();
            if (question != nullptr && !answered) {
                answered = true;
                answer(*question);
            }
        });
        poll.start(0);
        EXPECT_EQ("Pending", Authorize(*host.GetControlSystem()));
        EXPECT_TRUE(TestSupport::WaitFor([&] { return answered; }));
    }

    std::unique_ptr<VPlugin> plugin;
};

/// The host's window with a panel service that a test may let go.
class VOtherGUI : public IQuorixGUI
{
public:
    explicit VOtherGUI(VHostWindow& window) : window(window) {}

    std::shared_ptr<VQuickWidgetManager> GetQuickContext() override
    {
        return window.GetQuickContext();
    }
    std::shared_ptr<IMenuService> GetMenuService() override { return window.GetMenuService(); }
    std::shared_ptr<IPanelService> GetPanelService() override { return Panels; }

    std::shared_ptr<QuorixHost::VPanelService> Panels =
        std::make_shared<QuorixHost::VPanelService>(nullptr);

private:
    VHostWindow& window;
};

} // namespace

TEST_F(WindowPlugin, AddsItsItemToTheMenuAndItsPanel)
{
    EXPECT_TRUE(MenuItem(Window(), "Settings", menuItem).shortcuts().isEmpty());
    EXPECT_EQ(nullptr, FindReview());

    MenuItem(Window(), "Settings", menuItem).trigger();

    ASSERT_NE(nullptr, FindReview());
    EXPECT_EQ("Korva Control", FindReview()->windowTitle());
    EXPECT_EQ(QString::fromStdString(panelName), FindReview()->objectName());
}

TEST_F(WindowPlugin, ShowsTheDevicesThatAreKnownNow)
{
    AskAndAnswer([](QDialog& question) { QuorixHost::PressItem(question, "buttonAllow"); });
    ASSERT_TRUE(TestSupport::WaitFor([] { return QuorixHost::FindQuestion() == nullptr; }));

    MenuItem(Window(), "Settings", menuItem).trigger();
    ASSERT_NE(nullptr, FindReview());
    EXPECT_TRUE(QuorixHost::PressItem(*FindReview(), "resetButton"));
    EXPECT_TRUE(QuorixHost::PressItem(*FindReview(), "buttonOk"));
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    Destroy();

    EXPECT_EQ("", Stored("AllowedControls"));
}

TEST_F(WindowPlugin, KeepsWhatWasRememberedInThePreferences)
{
    AskAndAnswer([](QDialog& question) { QuorixHost::PressItem(question, "buttonAllow"); });
    ASSERT_TRUE(TestSupport::WaitFor([] { return QuorixHost::FindQuestion() == nullptr; }));
    EXPECT_EQ("", Stored("AllowedControls")); // only its end writes the lists

    Destroy();

    // Though the host still has the menu item and the panel's factory.
    EXPECT_EQ("tablet-1;Tablet", Stored("AllowedControls"));
}

TEST_F(WindowPlugin, OffersNothingOnceItHasGone)
{
    Destroy();

    MenuItem(Window(), "Settings", menuItem).trigger();

    EXPECT_EQ(nullptr, FindReview());
    const auto panels =
        std::static_pointer_cast<QuorixHost::VPanelService>(window->GetPanelService());
    EXPECT_FALSE(panels->OpenPanel(panelName));
}

TEST_F(WindowPlugin, MakesItsPanelForTheHostToo)
{
    const auto panels =
        std::static_pointer_cast<QuorixHost::VPanelService>(window->GetPanelService());

    EXPECT_TRUE(panels->OpenPanel(panelName));

    ASSERT_NE(nullptr, FindReview());
    EXPECT_NE(nullptr, FindReview()->findChild<QQuickWidget*>()->rootObject());
}

TEST_F(WindowPlugin, DoesNothingAfterThePanelServiceHasGone)
{
    Destroy();
    window = std::make_unique<VHostWindow>(host, [] {});
    VOtherGUI gui(*window);
    Start(gui);
    gui.Panels.reset();

    MenuItem(window->Window(), "Settings", menuItem).trigger();

    EXPECT_EQ(nullptr, FindReview());
}

TEST_F(WindowPlugin, OffersItsItemAlsoWhereThePortIsTaken)
{
    Destroy();
    window = std::make_unique<VHostWindow>(host, [] {});
    const TestSupport::VTestListener listener(TestSupport::VTestListener::listening, 803);
    Start(*window);

    MenuItem(window->Window(), "Settings", menuItem).trigger();

    EXPECT_NE(nullptr, FindReview());
}

TEST_F(WindowPlugin, AnswersTheRequestsThatWaitOneByOne)
{
    // Each opens a dialog only when the one before it has been answered.
    AskAndAnswer([this](QDialog& question) {
        EXPECT_EQ("Connected", Authorize(*host.GetControlSystem(), L"tablet-2"));
        question.done(0);
    });

    EXPECT_TRUE(TestSupport::WaitFor([] { return QuorixHost::FindQuestion() == nullptr; }));
    AskAndAnswer([](QDialog& question) { question.done(0); });
}

namespace {

/// The whole host, as its program runs it but for the display.
class HostLife : public testing::Test
{
protected:
    using VStop = boost::function<void()>;

    static constexpr std::chrono::seconds runLimit{60};

    /// Runs a host from start to stop.
    ///
    /// @param atWork  called again and again while the host serves, and has to stop it
    /// @return the exit code
    static int Run(const std::function<void(VHostWindow&, const VStop&)>& atWork)
    {
        const TestSupport::VTemporaryFolder data;
        QuorixHost::VOptions options;
        options.plugin = QUORIX_PLUGIN_LIBRARY;
        options.dataFolder = data.Path();
        QTimer poll;
        QuorixHost::VHostApplication application(
            options, [&](QuorixHost::VHost& served, const VStop& stop) {
                host = &served;
                auto window = std::make_unique<VHostWindow>(served, stop);
                QObject::connect(&poll, &QTimer::timeout, &window->Window(),
                                 [&atWork, shown = window.get(), stop] { atWork(*shown, stop); });
                return window;
            });
        poll.start(0);
        QTimer::singleShot(runLimit, &poll, [] {
            ADD_FAILURE() << "the host is not stopped";
            QCoreApplication::quit();
        });
        return application.Run();
    }

    static QuorixHost::VHost* host; // of the application that runs
};

QuorixHost::VHost* HostLife::host = nullptr;

} // namespace

TEST_F(HostLife, EndsWithTheQuestionOpen)
{
    bool asked = false;
    EXPECT_EQ(0, Run([&](VHostWindow& /*window*/, const VStop& stop) {
                  if (!asked) {
                      asked = true;
                      EXPECT_EQ("Pending", Authorize(*host->GetControlSystem()));
                  } else if (QuorixHost::FindQuestion() != nullptr) {
                      stop();
                  }
              }));

    EXPECT_EQ(nullptr, QuorixHost::FindQuestion());
}

TEST_F(HostLife, EndsWithTheReviewOpen)
{
    EXPECT_EQ(0, Run([&](VHostWindow& window, const VStop& stop) {
                  if (FindReview() == nullptr) {
                      MenuItem(window.Window(), "Settings", menuItem).trigger();
                  }
                  EXPECT_NE(nullptr, FindReview());
                  stop();
              }));

    EXPECT_EQ(nullptr, FindReview());
}

TEST_F(HostLife, EndsWithBothOpen)
{
    bool asked = false;
    EXPECT_EQ(0, Run([&](VHostWindow& window, const VStop& stop) {
                  if (!asked) {
                      asked = true;
                      MenuItem(window.Window(), "Settings", menuItem).trigger();
                      Authorize(*host->GetControlSystem());
                  } else if (QuorixHost::FindQuestion() != nullptr) {
                      stop();
                  }
              }));

    EXPECT_EQ(nullptr, QuorixHost::FindQuestion());
    EXPECT_EQ(nullptr, FindReview());
}

TEST_F(HostLife, EndsByTheWindowsClosing)
{
    EXPECT_EQ(0, Run([&](VHostWindow& window, const VStop& /*stop*/) { window.Window().close(); }));
}

TEST_F(HostLife, StartsAndStopsTwentyTimesInOneProcess)
{
    for (int round = 0; round < 20; ++round) {
        bool asked = false;
        ASSERT_EQ(0, Run([&](VHostWindow& window, const VStop& stop) {
                      if (!asked) {
                          asked = true;
                          EXPECT_EQ("Pending", Authorize(*host->GetControlSystem()));
                      } else if (QDialog* const question = QuorixHost::FindQuestion()) {
                          QuorixHost::PressItem(*question, "buttonAllow");
                          MenuItem(window.Window(), "Settings", menuItem).trigger();
                      } else if (FindReview() != nullptr) {
                          stop();
                      }
                  }));
    }
}
