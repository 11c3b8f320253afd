#include "cameras/CameraSelection.h"

#include "support/LogCapture.h"

#include <gmock/gmock.h>

#include <atomic>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

using namespace QuorixHost;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

using Filter = std::vector<std::int32_t>;

class CameraSelection : public testing::Test
{
protected:
    void Select(const std::vector<std::string>& ids, const Filter& filter = {1})
    {
        std::vector<VSelectionEntry> entries;
        for (const std::string& id : ids) {
            entries.emplace_back(id);
        }
        selection.GetView()->SetSelection(entries, filter);
    }

    std::vector<std::string> Selected(const Filter& filter = {1})
    {
        std::vector<VSelectionEntry> entries{VSelectionEntry("left over")};
        selection.GetView()->GetSelection(filter, entries);
        std::vector<std::string> ids;
        for (const VSelectionEntry& entry : entries) {
            std::string id = "-";
            (void)entry.GetDeviceId(id);
            ids.push_back(id);
        }
        return ids;
    }

    VCameraSelection selection;
};

} // namespace

TEST_F(CameraSelection, IsReplacedAndKeepsItsOrder)
{
    EXPECT_THAT(Selected(), IsEmpty());
    Select({"qx:2", "qx:1"});
    EXPECT_THAT(Selected(), ElementsAre("qx:2", "qx:1"));
    Select({"qx:3"});
    EXPECT_THAT(Selected(), ElementsAre("qx:3"));
    Select({});
    EXPECT_THAT(Selected(), IsEmpty());
}

TEST_F(CameraSelection, OnlyAFilterThatHolds1MeansCameras)
{
    Select({"qx:1"});
    Select({"qx:2"}, {2});
    Select({"qx:2"}, {});

    EXPECT_THAT(Selected(), ElementsAre("qx:1"));
    EXPECT_THAT(Selected({0, 1}), ElementsAre("qx:1"));
    EXPECT_THAT(Selected({2}), IsEmpty());
    EXPECT_THAT(Selected({}), IsEmpty());
}

TEST_F(CameraSelection, EntriesThatNameNoDeviceAreKept)
{
    selection.GetView()->SetSelection({VSelectionEntry(), VSelectionEntry("qx:1")}, {1});

    EXPECT_THAT(Selected(), ElementsAre("-", "qx:1"));
}

TEST_F(CameraSelection, NotifiesOnceForEachChangeClearingIncluded)
{
    int cameras = 0;
    int others = 0;
    selection.GetSelectionChangedCallback({1}).Add([&] { ++cameras; });
    selection.GetSelectionChangedCallback({2}).Add([&] { ++others; });

    Select({"qx:1"});
    EXPECT_EQ(1, cameras);
    Select({"qx:1"}); // the same
    EXPECT_EQ(1, cameras);
    Select({"qx:1", "qx:2"});
    EXPECT_EQ(2, cameras);
    Select({"qx:2", "qx:1"});
    EXPECT_EQ(3, cameras);
    Select({});
    EXPECT_EQ(4, cameras);
    Select({});
    Select({"qx:9"}, {2});
    EXPECT_EQ(4, cameras);
    EXPECT_EQ(0, others);
}

TEST_F(CameraSelection, AChangeWithinANotificationIsNotifiedBehindIt)
{
    std::vector<std::string> order;
    selection.GetSelectionChangedCallback({1}).Add([&] {
        const std::string id = Selected().front();
        order.push_back("begin " + id);
        if (id == "qx:1") {
            Select({"qx:2"});
        }
        order.push_back("end " + id);
    });

    Select({"qx:1"});

    EXPECT_THAT(order, ElementsAre("begin qx:1", "end qx:1", "begin qx:2", "end qx:2"));
}

TEST_F(CameraSelection, AListenerThatThrowsIsLoggedAndTheNextChangeIsNotified)
{
    const TestSupport::VLogCapture log;
    int notified = 0;
    selection.GetSelectionChangedCallback({1}).Add([&]() {
        if (++notified == 1) {
            throw std::runtime_error("no");
        }
        if (notified == 2) {
            throw 7;
        }
    });

    Select({"qx:1"});
    Select({"qx:2"});
    Select({"qx:3"});

    EXPECT_EQ(3, notified);
    ASSERT_EQ(2U, log.Messages().size());
    EXPECT_EQ("A listener to the selection failed: no", log.Messages()[0].Text);
    EXPECT_EQ("A listener to the selection failed with an unknown exception",
              log.Messages()[1].Text);
}

TEST_F(CameraSelection, TheLastNotificationOfManyThreadsSeesTheLastChange)
{
    constexpr int changes = 300;
    std::atomic<int> notified{0};
    std::atomic<bool> inside{false};
    std::vector<std::string> seen;
    selection.GetSelectionChangedCallback({1}).Add([&] {
        EXPECT_FALSE(inside.exchange(true)); // one at a time
        seen = Selected();
        ++notified;
        inside = false;
    });

    std::vector<std::thread> users;
    for (int user = 0; user < 3; ++user) {
        users.emplace_back([this, user] {
            for (int i = 0; i < changes; ++i) {
                Select({"qx:" + std::to_string(user * changes + i)});
            }
        });
    }
    for (std::thread& user : users) {
        user.join();
    }

    EXPECT_EQ(3 * changes, notified);
    EXPECT_EQ(Selected(), seen);
}

TEST_F(CameraSelection, AViewOutlivesItsSource)
{
    std::shared_ptr<ICameraSelectionView> view;
    {
        VCameraSelection gone;
        view = gone.GetView();
    }
    view->SetSelection({VSelectionEntry("qx:1")}, {1});

    std::vector<VSelectionEntry> entries;
    view->GetSelection({1}, entries);
    EXPECT_EQ(1U, entries.size());
}
