#include "CameraBench.h"
#include "CameraCommands.h"
#include "Console.h"
#include "DebugServices/ThreadName.h"
#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataWriter.h"
#include "io/Values.h"

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include <chrono>
#include <cmath>
#include <string>
#include <thread>
#include <vector>

using namespace QuorixHost;
using CameraTest::VCounter;
using testing::IsEmpty;

namespace {

/// A console over the four cameras that a host commonly has.
class CameraConsole : public CameraTest::CameraBench
{
protected:
    CameraConsole()
    {
        for (std::uint32_t number = 1; number <= 4; ++number) {
            cameras->AddCamera(number);
        }
        const VCameraServices services = {store, hardware, cameras, selection};
        AddCameraCommands(console, services);
        AddCameraState(console, services);
    }

    /// Waits until a thread of that name is in the answer to `locks`, and returns it.
    std::string AwaitInLocks(const std::string& thread)
    {
        std::string locks;
        const auto deadline = std::chrono::steady_clock::now() + CameraTest::limit;
        while (locks.find(thread) == std::string::npos &&
               std::chrono::steady_clock::now() < deadline) {
            std::this_thread::yield();
            locks = console.Answer("locks");
        }
        return locks;
    }

    const std::shared_ptr<VCameraSelection> selection = std::make_shared<VCameraSelection>();
    VConsole console;
};

} // namespace

TEST_F(CameraConsole, SetWritesWhatTheUserAsksForAndGetShowsIt)
{
    const char* const cases[][3] = {
        {"Device qx:1 StrobeIntensity", "0.75", R"(ok "0.75")"},
        {"Device qx:1 StrobeIntensity", "  5 ", R"(ok "5.0")"},
        {"Device qx:1 Threshold", "1e-1", R"(ok "0.1")"},
        {"Device qx:1 ShutterDuration", "0.5", R"(ok "0.5")"},
        {"Device qx:1 GreyscaleMode", "NoEdges", R"(ok "NoEdges")"},
        {"Device qx:1 GreyscaleMode", "All \t", R"(ok "All")"},
        {"Device qx:1 Name", "blank at the end ", R"(ok "blank at the end ")"},
        {"Device qx:1 Name", "Left of the stage", R"(ok "Left of the stage")"},
        {"Device qx:1 Name", R"("a, b \"c\"")", R"(ok "a, b \"c\"")"},
        {"Device qx:1 Name", "\"\"", R"(ok "")"},
        {"Device qx:1 Name", "\xD0\xBC\xF0\x9F\x98\x80", "ok \"\xD0\xBC\xF0\x9F\x98\x80\""},
        {"Device qx:1 UserId", "4294967295", R"(ok "4294967295")"},
        {"Device qx:1 DisplayType", "Other", R"(ok "Other")"},
        {"System Gen6System EnableTapToSelect", "true", R"(ok "true")"},
        {"System Gen6System EnableTapToSelect", "false ", R"(ok "false")"},
    };
    for (const auto& [parameter, value, shown] : cases) {
        EXPECT_EQ("ok", console.Answer(std::string("set ") + parameter + " " + value)) << parameter;
        EXPECT_EQ(shown, console.Answer(std::string("get ") + parameter)) << parameter;
    }
}

TEST_F(CameraConsole, AProposalIsShownAtOnceAndTheConfirmedValueAfterwards)
{
    EXPECT_EQ("ok", console.Answer("set Device qx:1 StrobeIntensity 5"));
    EXPECT_EQ(R"(ok "5.0")", console.Answer("get Device qx:1 StrobeIntensity"));

    Confirm();

    EXPECT_EQ(R"(ok "1.0")", console.Answer("get Device qx:1 StrobeIntensity"));
}

TEST_F(CameraConsole, ModeStoresAnyGreyscaleNumber)
{
    for (const char* number : {"0", "5", "6", "-1", "2147483647", "-2147483648"}) {
        EXPECT_EQ("ok", console.Answer(std::string("mode 1 ") + number));
        EXPECT_EQ(number, nlohmann::json::parse(
                              console.Answer("state").substr(3))["cameras"][0]["GreyscaleMode"]
                              .dump());
    }
    // A number without a name has no text.
    EXPECT_EQ(R"(ok "")", console.Answer("get Device qx:1 GreyscaleMode"));
    EXPECT_EQ("ok", console.Answer("mode 1 2"));
    EXPECT_EQ(R"(ok "All")", console.Answer("get Device qx:1 GreyscaleMode"));
}

TEST_F(CameraConsole, SelectReplacesTheSelection)
{
    const auto selected = [this] {
        return nlohmann::json::parse(console.Answer("state").substr(3))["selection"].dump();
    };

    EXPECT_EQ("[]", selected());
    EXPECT_EQ("ok", console.Answer("select 2,1"));
    EXPECT_EQ("[2,1]", selected());
    EXPECT_EQ("ok", console.Answer("select  3 , 4294967295 "));
    EXPECT_EQ("[3,4294967295]", selected());
    EXPECT_EQ("ok", console.Answer("select"));
    EXPECT_EQ("[]", selected());
}

TEST_F(CameraConsole, NotifyFiresTheNotificationAsOftenAsTold)
{
    int notified = 0;
    Camera(2, "Threshold")->GetChangedCallback().Add([&] { ++notified; });

    EXPECT_EQ("ok", console.Answer("notify Device qx:2 Threshold 1000"));
    Drain();

    EXPECT_EQ(1000, notified);
}

TEST_F(CameraConsole, AddAndRemoveBringAndTakeACamera)
{
    EXPECT_EQ("ok", console.Answer("add 9"));
    EXPECT_EQ(R"(ok "Camera 9")", console.Answer("get Device qx:9 Name"));
    EXPECT_EQ("error: there is a camera 9 already", console.Answer("add 9"));
    EXPECT_EQ("ok", console.Answer("remove 9"));
    EXPECT_EQ("error: there is no device qx:9 of the class Device",
              console.Answer("get Device qx:9 Name"));
    EXPECT_EQ("error: there is no camera 9", console.Answer("remove 9"));
    EXPECT_EQ("ok", console.Answer("add 0"));
    EXPECT_EQ("ok", console.Answer("add 4294967295"));
}

TEST_F(CameraConsole, BadInputIsAnsweredInWordsAndChangesNothing)
{
    // clang-format off
    const char* const cases[][2] = {
        {"set", "expected a device's class"},
        {"set Device", "expected a device's id"},
        {"set Device qx:1", "expected a parameter's name"},
        {"set Device qx:1 StrobeIntensity", "expected a value"},
        {"set Device qx:1 StrobeIntensity   ", "expected a value"},
        {"set Device qx:1 StrobeIntensity bright", "'bright' is no value of StrobeIntensity"},
        {"set Device qx:1 StrobeIntensity 0.7x", "'0.7x' is no value of StrobeIntensity"},
        {"set Device qx:1 StrobeIntensity 0.7 0.8", "'0.7 0.8' is no value of StrobeIntensity"},
        {"set Device qx:1 StrobeIntensity 0,7", "'0,7' is no value of StrobeIntensity"},
        {"set Device qx:1 UserId -1", "'-1' is no value of UserId"},
        {"set Device qx:1 UserId 4294967296", "'4294967296' is no value of UserId"},
        {"set Device qx:1 GreyscaleMode No Edges", "'No Edges' is no value of GreyscaleMode"},
        {"set Device qx:1 GreyscaleMode 6", "'6' is no value of GreyscaleMode"},
        {"set Device qx:1 Name a, b", "'a, b' is no value of Name"},
        {"set System Gen6System EnableTapToSelect 1", "'1' is no value of EnableTapToSelect"},
        {"set System Gen6System EnableTapToSelect truex", "'truex' is no value of EnableTapToSelect"},
        {"set Device qx:9 StrobeIntensity 0.7", "there is no device qx:9 of the class Device"},
        {"set Device 1 StrobeIntensity 0.7", "there is no device 1 of the class Device"},
        {"set device qx:1 StrobeIntensity 0.7", "there is no device qx:1 of the class device"},
        {"set Device qx:2 ShutterDuration 0.7", "qx:2 has no parameter ShutterDuration"},
        {"set Device qx:3 Threshold 0.7", "qx:3 has no parameter Threshold"},
        {"set Device qx:1 strobeintensity 0.7", "qx:1 has no parameter strobeintensity"},
        {"set Device qx:4 Threshold 0.7", "Device.qx:4.Settings.Threshold refuses to be changed"},
        {"get Device qx:1", "expected a parameter's name"},
        {"get Device qx:1 Name x", "unexpected 'x'"},
        {"get Device qx:3 Threshold", "qx:3 has no parameter Threshold"},
        {"mode", "expected a camera's number"},
        {"mode 1", "expected a number"},
        {"mode x 1", "'x' is no camera's number"},
        {"mode 9 1", "there is no device qx:9 of the class Device"},
        {"mode 1 None", "'None' is no number of 32 bits"},
        {"mode 1 2147483648", "'2147483648' is no number of 32 bits"},
        {"mode 1 1 1", "unexpected '1'"},
        {"select 1,", "'' is no camera's number"},
        {"select ,1", "'' is no camera's number"},
        {"select 1,x,2", "'x' is no camera's number"},
        {"select 1 2", "'1 2' is no camera's number"},
        {"select -1", "'-1' is no camera's number"},
        {"select 4294967296", "'4294967296' is no camera's number"},
        {"notify Device qx:1 StrobeIntensity", "expected a count"},
        {"notify Device qx:1 StrobeIntensity 0", "'0' is no count from 1 to 1000000"},
        {"notify Device qx:1 StrobeIntensity -1", "'-1' is no count from 1 to 1000000"},
        {"notify Device qx:1 StrobeIntensity 1000001", "'1000001' is no count from 1 to 1000000"},
        {"notify Device qx:1 StrobeIntensity 1 1", "unexpected '1'"},
        {"notify Device qx:3 Threshold 1", "qx:3 has no parameter Threshold"},
        {"add", "expected a camera's number"},
        {"add x", "'x' is no camera's number"},
        {"add 1", "there is a camera 1 already"},
        {"add 5 6", "unexpected '6'"},
        {"add 4294967296", "'4294967296' is no camera's number"},
        {"remove", "expected a camera's number"},
        {"remove 9", "there is no camera 9"},
        {"remove 1 2", "unexpected '2'"},
        {"locks now", "unexpected 'now'"},
        {"state now", "unexpected 'now'"},
    };
    // clang-format on
    EXPECT_EQ("ok", console.Answer("select 2"));
    int notified = 0;
    Camera(1, "StrobeIntensity")->GetChangedCallback().Add([&] { ++notified; });
    const std::string before = console.Answer("state");

    for (const auto& [line, reason] : cases) {
        EXPECT_EQ(std::string("error: ") + reason, console.Answer(line)) << line;
    }
    Drain();

    EXPECT_EQ(before, console.Answer("state"));
    EXPECT_EQ(0, notified);
    EXPECT_THAT(timers.Delays(), IsEmpty());
}

TEST_F(CameraConsole, StateTellsEveryCameraWithTheSettingsThatItHas)
{
    console.Answer("select 2,3");
    console.Answer("set System Gen6System EnableTapToSelect true");

    EXPECT_EQ(
        R"(ok {"cameras":[)"
        R"({"DisplayType":"Universal","GreyscaleMode":1,"Name":"Camera 1","ShutterDuration":0.1,)"
        R"("StrobeIntensity":0.5,"Threshold":0.25,"UserId":101,"id":1},)"
        R"({"DisplayType":"Optical","GreyscaleMode":1,"Name":"Camera 2",)"
        R"("StrobeIntensity":0.5,"Threshold":0.25,"UserId":102,"id":2},)"
        R"({"DisplayType":"Video","GreyscaleMode":1,"Name":"Camera 3","ShutterDuration":0.1,)"
        R"("StrobeIntensity":0.5,"UserId":103,"id":3},)"
        R"({"DisplayType":"Calibrating","GreyscaleMode":1,"Name":"Camera 4",)"
        R"("ShutterDuration":0.1,"StrobeIntensity":0.5,"Threshold":0.25,"UserId":104,"id":4}],)"
        R"("control":{},"dialog":null,"selection":[2,3],"tapToSelect":true})",
        console.Answer("state"));
}

TEST_F(CameraConsole, StateShowsTheProposalOfANumberThatIsNone)
{
    EXPECT_TRUE(Camera(1, "StrobeIntensity")->SetValue(MakeDoubleValue(std::nan(""))));

    EXPECT_TRUE(
        nlohmann::json::parse(console.Answer("state").substr(3))["cameras"][0]["StrobeIntensity"]
            .is_null());
}

TEST_F(CameraConsole, StateTellsTheDevicesThatTheStoreHasUnderControl)
{
    {
        VDataWriter writer(*store);
        writer.SetValue(VDataToken(VDataPath{"Control", "a.b", "Connected"}), MakeBoolValue(true));
        writer.SetValue(VDataToken(VDataPath{"Control", "a.b", "Name"}),
                        MakeStringValue("Wand \"1\""));
        writer.SetValue(VDataToken(VDataPath{"Control", "c", "Name"}), MakeStringValue("\xff"));
    }

    EXPECT_EQ("{\"a.b\":{\"Connected\":true,\"Name\":\"Wand \\\"1\\\"\"},"
              "\"c\":{\"Connected\":false,\"Name\":\"\xEF\xBF\xBD\"}}",
              nlohmann::json::parse(console.Answer("state").substr(3))["control"].dump());
}

TEST_F(CameraConsole, LocksTellsWhoHoldsAndWhoWaits)
{
    EXPECT_EQ("ok []", console.Answer("locks"));

    VCounter writing, release;
    std::uint64_t changeId = 0;
    std::thread holder([&] {
        DebugServices::SetThreadName("Holder");
        const VDataWriter writer(*store);
        changeId = writer.GetCurrentChangeId();
        writing.CountUp();
        release.WaitFor(1);
    });
    ASSERT_TRUE(writing.WaitFor(1));
    std::thread waiter([&] {
        DebugServices::SetThreadName("Waiter");
        const VDataWriter writer(*store);
    });
    const std::string locks = AwaitInLocks("Waiter");
    release.CountUp();
    holder.join();
    waiter.join();

    const auto lock = [](const char* thread, std::uint64_t id, const char* waiting) {
        return R"({"changeId":)" + std::to_string(id) + R"(,"readLocks":0,"thread":")" + thread +
               R"(","waiting":)" + waiting + R"(,"writeLocks":1,"writer":true})";
    };
    EXPECT_EQ("ok [" + lock("Holder", changeId, "false") + "," +
                  lock("Waiter", changeId + 1, "true") + "]",
              locks);
    EXPECT_EQ("ok []", console.Answer("locks"));
}

TEST_F(CameraConsole, StateAndLocksAreToldFromWithinNestedViewsWhileAWriterWaits)
{
    std::thread waiter;
    std::string state;
    std::string locks;
    {
        VDataWriter writer(*store);
        writer.SetValue(VDataToken(VDataPath{"Control", "a", "Name"}), MakeStringValue("pending"));
        const VDataReader reader(*store);
        waiter = std::thread([&] {
            DebugServices::SetThreadName("Waiter");
            const VDataWriter queued(*store);
        });
        AwaitInLocks("Waiter");
        state = console.Answer("state");
        locks = console.Answer("locks");
    }
    waiter.join();

    const nlohmann::json told = nlohmann::json::parse(state.substr(3));
    EXPECT_EQ(4U, told["cameras"].size());
    EXPECT_EQ(R"({"a":{"Connected":false,"Name":"pending"}})", told["control"].dump());
    const nlohmann::json holders = nlohmann::json::parse(locks.substr(3));
    ASSERT_EQ(2U, holders.size());
    EXPECT_EQ(1, holders[0]["readLocks"]);
    EXPECT_EQ(1, holders[0]["writeLocks"]);
    EXPECT_EQ(false, holders[0]["waiting"]);
    EXPECT_EQ(true, holders[1]["waiting"]);
    EXPECT_EQ(holders[0]["changeId"].get<int>() + 1, holders[1]["changeId"].get<int>());
    EXPECT_EQ("ok []", console.Answer("locks"));
}

TEST_F(CameraConsole, StateIsToldWhileAReaderPutsOffACommitAndAWriterWaits)
{
    std::thread waiter;
    std::string state;
    {
        const VDataReader reader(*store);
        std::thread([&] {
            DebugServices::SetThreadName("Gone");
            VDataWriter writer(*store);
            writer.RemoveAll(VDataPath("Device.*"));
        }).join();
        waiter = std::thread([&] {
            DebugServices::SetThreadName("Waiter");
            const VDataWriter queued(*store);
        });
        AwaitInLocks("Waiter");
        state = console.Answer("state");
        EXPECT_NE(std::string::npos, console.Answer("locks").find("(a thread that has ended)"));
    }
    waiter.join();

    const nlohmann::json told = nlohmann::json::parse(state.substr(3));
    EXPECT_EQ("Camera 1", told["cameras"][0]["Name"]);
    EXPECT_EQ("ok []", console.Answer("locks"));
}
