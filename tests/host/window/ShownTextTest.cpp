#include "window/ShownText.h"

#include <gtest/gtest.h>

using QuorixHost::longestShownText;
using QuorixHost::ShownLine;

TEST(ShownLine, LeavesAnOrdinaryTextAsItIs)
{
    EXPECT_EQ("", ShownLine(""));
    EXPECT_EQ("Tablet  of <the> unit", ShownLine("Tablet  of <the> unit"));
    EXPECT_EQ(QString(longestShownText, 'a'), ShownLine(QString(longestShownText, 'a')));
}

TEST(ShownLine, MakesOneLineOfMany)
{
    EXPECT_EQ("a b c d e f", ShownLine(QString::fromUtf8("a\nb\rc\u2028d\u2029e\tf")));
}

TEST(ShownLine, CutsATextThatNobodyWouldReadToItsEnd)
{
    EXPECT_EQ(QString(longestShownText, 'a') + QChar(0x2026), ShownLine(QString(1000000, 'a')));
}

TEST(ShownLine, CutsBetweenCharactersOfTwoUnits)
{
    const QString face = QString::fromUtf8("\U0001F600");
    const QString before(longestShownText - 1, 'a');

    EXPECT_EQ(before + QChar(0x2026), ShownLine(before + face + face));
}
