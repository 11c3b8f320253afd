#include "DPI/DPIUtils.h"

#include <gtest/gtest.h>

#include <QGuiApplication>
#include <QScreen>

#include <limits>

namespace {

/// A GUI application on one screen that says it has so many logical dots per inch. Qt reads them
/// once in a process, so all tests below use the same number.
class VApplication
{
public:
    VApplication() : application(Prepare(), arguments) {}

private:
    static int& Prepare()
    {
        static int count = 1;
        qputenv("QT_QPA_PLATFORM", "offscreen");
        qputenv("QT_FONT_DPI", "144");
        return count;
    }

    char name[5] = "test";
    char* arguments[2] = {name, nullptr};
    QGuiApplication application;
};

} // namespace

TEST(DPIUtils, WithoutAnApplicationALengthStaysAsItIs)
{
    EXPECT_EQ(450, DPIUtils::Scale(450));
}

TEST(DPIUtils, WithoutAGuiApplicationALengthStaysAsItIs)
{
    int count = 1;
    char name[] = "test";
    char* arguments[] = {name, nullptr};
    const QCoreApplication application(count, arguments);

    EXPECT_EQ(450, DPIUtils::Scale(450));
}

TEST(DPIUtils, ScalesByTheLogicalDotsPerInchOfThePrimaryScreen)
{
    const VApplication application;

    ASSERT_EQ(144.0, QGuiApplication::primaryScreen()->logicalDotsPerInch());
    EXPECT_EQ(675, DPIUtils::Scale(450));
    EXPECT_EQ(0, DPIUtils::Scale(0));
}

TEST(DPIUtils, RoundsToTheNearestPixel)
{
    const VApplication application;

    EXPECT_EQ(2, DPIUtils::Scale(1));
    EXPECT_EQ(5, DPIUtils::Scale(3));
    EXPECT_EQ(-2, DPIUtils::Scale(-1));
}

TEST(DPIUtils, ALengthBeyondAllPixelsStopsAtTheGreatest)
{
    const VApplication application;

    EXPECT_EQ(std::numeric_limits<int>::max(), DPIUtils::Scale(std::numeric_limits<int>::max()));
    EXPECT_EQ(std::numeric_limits<int>::min(), DPIUtils::Scale(std::numeric_limits<int>::min()));
}
