#include "QuorixPluginControlStreamServer/ControlSystem/ICommandInformation.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IEventInformation.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IParameters.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IResult.h"

#include <gtest/gtest.h>

#include <vector>

namespace {

using namespace ControlSystem;

TEST(Contracts, ParametersGiveTheEmptyTextForAnAbsentNameAndStayUnchanged)
{
    IParameters parameters;

    EXPECT_EQ(L"", parameters.Get(L"absent"));

    EXPECT_TRUE(parameters.begin() == parameters.end());
}

TEST(Contracts, ParametersKeepTheLaterOfTwoValues)
{
    IParameters parameters;
    parameters.Set(L"name", L"first");
    parameters.Set(L"name", L"later");

    EXPECT_EQ(L"later", parameters.Get(L"name"));
}

TEST(Contracts, ParametersAreOrderedByTheCodeUnitsOfTheirNames)
{
    IParameters parameters;
    // By code point the emoji would come last; its first unit is the smaller one.
    const std::vector<std::wstring> inOrder = {L"",      L"B", L"a", L"\u00E9", L"\xD83D\xDE00",
                                               L"\uFF01"};
    for (auto name = inOrder.rbegin(); name != inOrder.rend(); ++name) {
        parameters.Set(*name, *name);
    }

    std::vector<std::wstring> names;
    for (const auto& [name, value] : parameters) {
        names.push_back(name);
    }
    EXPECT_EQ(inOrder, names);
}

TEST(Contracts, FreshCommandInformationSaysThatTheCommandIsNotFound)
{
    const ICommandInformation fresh;

    EXPECT_EQ(L"", fresh.Name);
    EXPECT_EQ(L"Command not found.", fresh.Description);
    EXPECT_TRUE(fresh.InputParameters.empty());
    EXPECT_TRUE(fresh.ReplyParameters.empty());
}

TEST(Contracts, FreshEventInformationIsWhollyEmpty)
{
    const IEventInformation fresh;

    EXPECT_EQ(L"", fresh.Name);
    EXPECT_EQ(L"", fresh.Description);
    EXPECT_TRUE(fresh.Parameters.empty());
}

TEST(Contracts, FreshResultIsASystemError)
{
    EXPECT_EQ(0, IResult().Code);
}

} // namespace
