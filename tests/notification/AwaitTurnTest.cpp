#include "notification/AwaitTurn.h"

#include "Support.h"
#include "notification/AsioPostalService.h"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <memory>

TEST(AwaitTurn, WaitsForWhatRunsAndForWhatWaits)
{
    NotificationSystem::VAsioPostalService service("Turns", 1, 0);
    std::atomic<int> done{0};
    for (int i = 0; i < 1000; ++i) {
        service.Post([&done] { ++done; }, 0);
    }

    EXPECT_TRUE(KVR::AwaitTurn(service, std::chrono::seconds(60)));

    EXPECT_EQ(1000, done);
}

TEST(AwaitTurn, EndsAtTheLimitAndItsTurnMayComeLater)
{
    const auto service = std::make_unique<NotificationTest::VManualPostalService>();

    EXPECT_FALSE(KVR::AwaitTurn(*service, std::chrono::milliseconds(1)));

    EXPECT_EQ(1, service->Deliver());
}
