#include "PluginBench.h"
#include "QuorixPluginControlStreamServer/ControlSystem/ICommandProvider.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IEventProvider.h"
#include "QuorixPluginInterface/IHost.h"
#include "QuorixPluginInterface/IPlugin.h"
#include "QuorixPluginInterface/IQuorixGUI.h"
#include "io/Values.h"
#include "support/FakeCameras.h"
#include "support/FakeControlSystem.h"
#include "support/RawClient.h"
#include "support/RefusedCall.h"
#include "support/TestListener.h"

#include <boost/system/system_error.hpp>
#include <gmock/gmock.h>

#include <chrono>
#include <cstdio>
#include <cstring>
#include <dlfcn.h>
#include <memory>
#include <string>
#include <sys/syscall.h>
#include <system_error>
#include <thread>
#include <utility>
#include <vector>

// The plug-in as a host meets it: the built library, its two functions, and the real port.

using PluginBench::CanConnect;
using PluginBench::ComesTrue;
using PluginBench::disconnect;
using PluginBench::port;
using PluginBench::VFakeGUI;
using PluginBench::VLibrary;
using QuorixPluginInterface::IPlugin;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::UnorderedElementsAre;
using TestSupport::VFakeControlSystem;
using TestSupport::VRawClient;

namespace {

const char* const serverInformation =
    R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)"
    R"(<ServerInformation><StreamVersion major="1" minor="0"/></ServerInformation>)";

/// As a plug-in of the tests, with a second one that lacks a system call.
class Plugin : public PluginBench::VLoadedPlugin
{
protected:
    /// Starts another plug-in, to which the kernel refuses a system call.
    /// @return the exception that left Start, empty for none
    std::string FailureWithout(unsigned int systemCall)
    {
        std::string failure;
        IPlugin* const other = library.Create();
        std::thread([&] {
            TestSupport::RefuseCall(systemCall);
            try {
                other->Start(host);
            } catch (const boost::system::system_error& error) {
                failure = error.what();
            }
        }).join();
        library.Destroy(other);
        return failure;
    }
};

/// Returns the place of a virtual operation in the table that the host calls by.
template <typename TOperation>
std::size_t SlotOf(TOperation operation)
{
    std::size_t word = 0; // one more than the offset in the table
    static_assert(sizeof operation == 2 * sizeof word, "a pointer to a member, as this ABI has it");
    std::memcpy(&word, &operation, sizeof word);
    return (word - 1) / sizeof(void*);
}

} // namespace

TEST(PluginLibrary, ExportsItsTwoFunctionsAndNothingElse)
{
    FILE* const table = popen("nm -D --extern-only --defined-only " QUORIX_PLUGIN_LIBRARY, "r");
    ASSERT_NE(nullptr, table);
    std::vector<std::string> names;
    char address[64] = {}, kind[8] = {}, name[1024] = {};
    while (fscanf(table, "%63s %7s %1023s", address, kind, name) == 3) {
        names.push_back(std::string(kind) + " " + name);
    }
    ASSERT_EQ(0, pclose(table));

    EXPECT_THAT(names, UnorderedElementsAre("T CreatePlugin", "T DestroyPlugin"));
}

TEST(PluginLibrary, StaysInMemory)
{
    VLibrary library;

    EXPECT_TRUE(library.StaysWhenClosed());
}

TEST(PluginLibrary, DestroyIgnoresNull)
{
    VLibrary().Destroy(nullptr);
}

TEST(PluginInterface, KeepsTheOrderOfItsSlots)
{
    // The destructor takes the first two.
    EXPECT_EQ(2U, SlotOf(&IPlugin::FirstTextQuery));
    EXPECT_EQ(3U, SlotOf(&IPlugin::SecondTextQuery));
    EXPECT_EQ(4U, SlotOf(&IPlugin::FirstQuery));
    EXPECT_EQ(5U, SlotOf(&IPlugin::SecondQuery));
    EXPECT_EQ(6U, SlotOf(&IPlugin::ThirdQuery));
    EXPECT_EQ(7U, SlotOf(&IPlugin::FourthQuery));
    EXPECT_EQ(8U, SlotOf(&IPlugin::Start));
    EXPECT_EQ(9U, SlotOf(&IPlugin::InitialiseGUI));
    EXPECT_EQ(10U, SlotOf(&IPlugin::Stop));
    EXPECT_EQ(11U, SlotOf(&IPlugin::GetInterfaceVersion));
}

TEST_F(Plugin, AnswersTheHostsQueriesWithTheDefaults)
{
    EXPECT_EQ("", plugin->FirstTextQuery());
    EXPECT_EQ("", plugin->SecondTextQuery());
    EXPECT_TRUE(plugin->FirstQuery());
    EXPECT_TRUE(plugin->SecondQuery());
    EXPECT_TRUE(plugin->ThirdQuery());
    EXPECT_TRUE(plugin->FourthQuery());
    EXPECT_EQ(108131, plugin->GetInterfaceVersion());
}

TEST_F(Plugin, MadeAndDestroyedItStartsNothing)
{
    EXPECT_FALSE(CanConnect());

    Destroy();

    EXPECT_EQ(0U, controlSystem->GetEventNotification().Count());
}

TEST_F(Plugin, StopBeforeStartDoesNothing)
{
    plugin->Stop();
}

TEST_F(Plugin, WithoutADispatcherItStartsWithoutASocket)
{
    EXPECT_TRUE(plugin->Start(hostWithoutServices));

    EXPECT_FALSE(CanConnect());
    plugin->Stop();
    Destroy();
}

TEST_F(Plugin, StartedItServesDevices)
{
    EXPECT_TRUE(plugin->Start(host));

    VRawClient device(port);
    EXPECT_EQ(serverInformation, device.Request("<ServerInformation/>"));
    EXPECT_EQ(1U, controlSystem->GetEventNotification().Count());
}

TEST_F(Plugin, RegistersItsProvidersInOrderAndStopTakesThemBack)
{
    plugin->Start(host);

    ASSERT_EQ(2U, controlSystem->CommandProviders().size());
    std::vector<std::wstring> commands;
    for (const auto& provider : controlSystem->CommandProviders()) {
        provider->GetCommandNames(commands);
    }
    ASSERT_EQ(3U + 14U, commands.size());
    EXPECT_EQ(L"System.Authorize", commands[0]);
    EXPECT_EQ(L"System.Authorize.Cancel", commands[1]);
    EXPECT_EQ(L"System.Heartbeat", commands[2]);
    EXPECT_EQ(L"CameraSettings_EnableStrobes", commands[3]);
    ASSERT_EQ(3U, controlSystem->EventProviders().size());
    std::vector<std::wstring> events;
    for (const auto& provider : controlSystem->EventProviders()) {
        provider->GetEventNames(events);
    }
    EXPECT_THAT(events,
                ElementsAre(L"Event.Authorize", L"Event.Disconnect",
                            L"Event.Cameras.SelectionChanged", L"Event.Cameras.NameChanged",
                            L"Event.Cameras.UserIdChanged", L"Event.Cameras.GreyscaleModeChanged",
                            L"Event.Cameras.SettingChanged", L"Event.Cameras.TapToSelectChanged"));

    plugin->Stop();

    EXPECT_THAT(controlSystem->CommandProviders(), IsEmpty());
    EXPECT_THAT(controlSystem->EventProviders(), IsEmpty());
}

TEST_F(Plugin, AsksForTheHostsServicesInOrder)
{
    plugin->Start(host);

    EXPECT_THAT(host.Asked, ElementsAre("ControlSystem", "Store", "CameraSettingsSource",
                                        "CameraSelectionSource", "PostalService"));
}

TEST_F(Plugin, ItsCommandsReachTheHostsTwoCameraSources)
{
    host.Settings = std::make_shared<TestSupport::VFakeCameraSettings>();
    host.Selection = std::make_shared<TestSupport::VFakeCameraSelection>();
    host.Settings->Add("Device", "qx:7").Add("StrobeIntensity", MakeDoubleValue(0.5));
    host.Selection->View->Selected = {VSelectionEntry("qx:3")};
    plugin->Start(host);
    const auto provider = controlSystem->CommandProviders().at(1);

    ControlSystem::IParameters input, strobe, selection;
    input.Set(L"Param_CameraDeviceId", L"7");
    provider->ExecuteCommand(L"CameraSettings_GetStrobeIntensity", input, strobe);
    provider->ExecuteCommand(L"CameraSettings_GetSelection", input, selection);

    EXPECT_EQ(L"0.5", strobe.Get(L"Param_StrobeIntensity"));
    EXPECT_EQ(L"3", selection.Get(L"Param_CameraSelection"));
}

TEST_F(Plugin, ChangesInTheHostsTwoCameraSourcesBecomeEventsUntilItIsDestroyed)
{
    host.Settings = std::make_shared<TestSupport::VFakeCameraSettings>();
    host.Selection = std::make_shared<TestSupport::VFakeCameraSelection>();
    auto& strobe =
        host.Settings->Add("Device", "qx:7").Add("StrobeIntensity", MakeDoubleValue(0.5));
    host.Selection->View->Selected = {VSelectionEntry("qx:3")};
    plugin->Start(host);
    host.Settings->DeviceAdded("Device", "qx:7");
    VRawClient device(port);
    device.Request("<ServerInformation/>");

    strobe.Changed();
    host.Selection->Changed();

    const std::string begin = R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)"
                              "<Event><Name>Event.Cameras.";
    EXPECT_EQ(begin + "SettingChanged</Name><Parameters>"
                      "<Parameter><Name>CameraId</Name><Value>7</Value></Parameter>"
                      "<Parameter><Name>SettingName</Name><Value>StrobeIntensity</Value>"
                      "</Parameter><Parameter><Name>SettingValue</Name><Value>0.5</Value>"
                      "</Parameter></Parameters></Event>",
              device.ReadFrame());
    EXPECT_EQ(begin + "SelectionChanged</Name><Parameters><Parameter>"
                      "<Name>SelectedCameraIds</Name><Value>3</Value></Parameter></Parameters>"
                      "</Event>",
              device.ReadFrame());

    plugin->Stop();
    Destroy();

    strobe.Changed();
    host.Selection->Changed();
    EXPECT_EQ(disconnect, device.ReadToEnd());
    EXPECT_EQ(0U, strobe.Changed.Count());
    EXPECT_EQ(0U, host.Selection->Changed.Count());
}

TEST_F(Plugin, WithNothingRegisteredItAnswersAndListsNothing)
{
    controlSystem->CommandNames.clear();
    plugin->Start(host);

    VRawClient device(port);

    EXPECT_EQ(serverInformation, device.Request("<ServerInformation/>"));
    EXPECT_EQ(R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)"
              "<Correlation>1</Correlation><Commands/>",
              device.Request("<Commands><Correlation>1</Correlation></Commands>"));
    EXPECT_EQ(R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?><Events/>)",
              device.Request("<Events/>"));
}

TEST_F(Plugin, RunsCommandsWithEntitiesLeftAsTheyStand)
{
    plugin->Start(host);
    VRawClient device(port);

    // The name keeps its entity, and so the reply prints the ampersand as one again.
    EXPECT_EQ(R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)"
              "<CommandReply><Name>Test.Echo</Name><Correlation>a&amp;amp;b</Correlation>"
              "<Result>OK</Result><Parameters><Parameter><Name>x</Name><Value>1</Value>"
              "</Parameter></Parameters></CommandReply>",
              device.Request("<ExecuteCommand><Name>Test.Echo</Name>"
                             "<Correlation>a&amp;b</Correlation><Parameters><Parameter>"
                             "<Name>x</Name><Value>1</Value></Parameter></Parameters>"
                             "</ExecuteCommand>"));
}

TEST_F(Plugin, InitialiseGUIIsTrue)
{
    VFakeGUI gui;
    plugin->Start(host);

    EXPECT_TRUE(plugin->InitialiseGUI(host, gui));
}

TEST_F(Plugin, WithThePortTakenItStartsAndNoDeviceCanConnectToIt)
{
    TestSupport::VTestListener other(TestSupport::VTestListener::listening, port);

    EXPECT_TRUE(plugin->Start(host));

    VRawClient device(port); // reaches the other
    close(other.Accept());
    EXPECT_EQ("", device.ReadToEnd());
    other.Close();
    EXPECT_FALSE(CanConnect()); // also once the port is free
    plugin->Stop();
}

TEST_F(Plugin, AfterStopDevicesStayAndOthersMayConnect)
{
    plugin->Start(host);
    VRawClient before(port);
    before.Request("<ServerInformation/>");

    plugin->Stop();

    VRawClient after(port);
    EXPECT_EQ(serverInformation, before.Request("<ServerInformation/>"));
    EXPECT_EQ(serverInformation, after.Request("<ServerInformation/>"));
    controlSystem->FireEvent(L"Event.X", {});
    const std::string event = R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)"
                              "<Event><Name>Event.X</Name><Parameters/></Event>";
    EXPECT_EQ(event, before.ReadFrame());
    EXPECT_EQ(event, after.ReadFrame());
}

TEST_F(Plugin, DestroyedItClosesEveryConnectionAndThePort)
{
    using namespace std::string_literals;
    plugin->Start(host);
    VRawClient idle(port);
    VRawClient withinAHeader(port);
    VRawClient withinAText(port);
    for (VRawClient* const device : {&idle, &withinAHeader, &withinAText}) {
        device->Request("<ServerInformation/>"); // the server has it on its list
    }
    withinAHeader.Send("\x20\x00"s);
    withinAText.Send("\x20\x00\x00\x00<Serv"s);

    plugin->Stop();
    Destroy(); // would hang if the socket waited for the pending reads

    EXPECT_EQ(disconnect, idle.ReadToEnd());
    EXPECT_EQ(disconnect, withinAHeader.ReadToEnd());
    EXPECT_EQ(disconnect, withinAText.ReadToEnd());
    EXPECT_EQ(0U, controlSystem->GetEventNotification().Count());
    EXPECT_TRUE(ComesTrue([&] { return controlSystem.use_count() == 2; })); // the test and its host
}

TEST_F(Plugin, DestroyedWithoutStopItEndsAsWell)
{
    plugin->Start(host);
    VRawClient device(port);
    device.Request("<ServerInformation/>");

    Destroy();

    // The dispatcher still has the providers, and with them the authorization: nobody is told.
    EXPECT_EQ("", device.ReadToEnd());
}

TEST_F(Plugin, StartsAgainAtOnceOnTheSamePort)
{
    for (int i = 0; i < 3; ++i) {
        EXPECT_TRUE(plugin->Start(host));
        VRawClient device(port);
        EXPECT_EQ(serverInformation, device.Request("<ServerInformation/>"));

        plugin->Stop();
        Destroy(); // the host closes first, so its side of the connection lingers
        plugin = library.Create();
    }
}

TEST_F(Plugin, ASecondStartIsNotGuardedAndLosesThePort)
{
    plugin->Start(host);
    VRawClient device(port);
    device.Request("<ServerInformation/>");

    EXPECT_TRUE(plugin->Start(host));

    EXPECT_TRUE(ComesTrue([] { return !CanConnect(); }));
    EXPECT_EQ("", device.ReadToEnd());
    EXPECT_EQ(1U, controlSystem->GetEventNotification().Count());
}

TEST_F(Plugin, AnExceptionOutOfTheSocketLeavesStart)
{
    EXPECT_EQ("epoll: Too many open files", FailureWithout(SYS_epoll_create1));
    EXPECT_EQ("open: Too many open files", FailureWithout(SYS_socket));

    EXPECT_TRUE(plugin->Start(host));
    EXPECT_TRUE(CanConnect());
}

TEST_F(Plugin, WithoutTheComputersNameAnExceptionLeavesStartWhichListensByThen)
{
    std::string failure;
    std::thread([&] {
        TestSupport::RefuseCall(SYS_uname);
        try {
            plugin->Start(host);
        } catch (const boost::system::system_error& error) {
            failure = error.what();
        }
    }).join();

    EXPECT_EQ("Too many open files", failure);
    VRawClient device(port);
    EXPECT_EQ(serverInformation, device.Request("<ServerInformation/>"));
    EXPECT_EQ(2U, controlSystem->CommandProviders().size());
}
