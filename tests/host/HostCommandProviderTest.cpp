#include "HostCommandProvider.h"

#include "QuorixVersion.h"

#include <gmock/gmock.h>

#include <string>
#include <vector>

using QuorixHost::VHostCommandProvider;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Not;

namespace {

VHostCommandProvider MakeProvider(std::vector<std::uint32_t> cameras)
{
    return VHostCommandProvider([cameras] { return cameras; });
}

} // namespace

TEST(HostCommandProvider, AppendsItsNamesToTheList)
{
    std::vector<std::wstring> names = {L"Before"};

    MakeProvider({}).GetCommandNames(names);

    EXPECT_THAT(names, ElementsAre(L"Before", L"Host.Information", L"Host.Echo"));
}

TEST(HostCommandProvider, InformationNamesHostVersionAndCameras)
{
    ControlSystem::IParameters reply;

    const auto result = MakeProvider({1, 2, 10}).ExecuteCommand(L"Host.Information", {}, reply);

    EXPECT_EQ(1, result.Code);
    EXPECT_EQ(L"quorix-host", reply.Get(L"Name"));
    const std::string version = QUORIX_VERSION;
    EXPECT_EQ(std::wstring(version.begin(), version.end()), reply.Get(L"Version"));
    EXPECT_EQ(L"1,2,10", reply.Get(L"Cameras"));
}

TEST(HostCommandProvider, InformationOfAHostWithoutCamerasHasAnEmptyList)
{
    ControlSystem::IParameters reply;

    MakeProvider({}).ExecuteCommand(L"Host.Information", {}, reply);

    EXPECT_EQ(L"", reply.Get(L"Cameras"));
    EXPECT_EQ(3, std::distance(reply.begin(), reply.end()));
}

TEST(HostCommandProvider, EchoSendsEveryParameterBack)
{
    ControlSystem::IParameters input;
    input.Set(L"a", L"1");
    input.Set(L"", L"under no name");
    input.Set(L"empty", L"");
    ControlSystem::IParameters reply;

    const auto result = MakeProvider({}).ExecuteCommand(L"Host.Echo", input, reply);

    EXPECT_EQ(1, result.Code);
    using VPair = std::pair<const std::wstring, std::wstring>;
    EXPECT_THAT(std::vector<VPair>(reply.begin(), reply.end()),
                ElementsAre(VPair(L"", L"under no name"), VPair(L"a", L"1"), VPair(L"empty", L"")));
}

TEST(HostCommandProvider, AnUnknownNameIsCode2AndChangesNothing)
{
    ControlSystem::IParameters reply;

    for (const wchar_t* const name : {L"host.echo", L"Host.Echo2", L"Host", L""}) {
        EXPECT_EQ(2, MakeProvider({1}).ExecuteCommand(name, {}, reply).Code);
    }
    EXPECT_EQ(reply.begin(), reply.end());
}

TEST(HostCommandProvider, DescribesEachCommandAndItsParameters)
{
    VHostCommandProvider provider = MakeProvider({});

    const auto information = provider.GetCommandInformation(L"Host.Information");
    EXPECT_EQ(L"Host.Information", information.Name);
    EXPECT_EQ(L"Tells which host this is and which cameras it has.", information.Description);
    EXPECT_THAT(information.InputParameters, IsEmpty());
    std::vector<std::wstring> names;
    for (const auto& parameter : information.ReplyParameters) {
        EXPECT_THAT(parameter.Description, Not(IsEmpty()));
        names.push_back(parameter.Name);
    }
    EXPECT_THAT(names, ElementsAre(L"Name", L"Version", L"Cameras"));

    const auto echo = provider.GetCommandInformation(L"Host.Echo");
    EXPECT_EQ(L"Host.Echo", echo.Name);
    EXPECT_EQ(L"Sends every parameter back as it came.", echo.Description);
    EXPECT_EQ(1U, echo.InputParameters.size());
    EXPECT_EQ(1U, echo.ReplyParameters.size());
}

TEST(HostCommandProvider, DescribesAnUnknownCommandAsNotFound)
{
    const auto information = MakeProvider({}).GetCommandInformation(L"Host.Unknown");

    EXPECT_EQ(L"", information.Name);
    EXPECT_EQ(L"Command not found.", information.Description);
}
