#include "HostCommandProvider.h"

#include "QuorixVersion.h"
#include "utils/WideText.h"

#include <utility>

namespace QuorixHost {
namespace {

constexpr std::int32_t resultOk = 1;
constexpr std::int32_t resultUnknownCommand = 2;

const wchar_t* const informationCommand = L"Host.Information";
const wchar_t* const echoCommand = L"Host.Echo";

std::wstring JoinNumbers(const std::vector<std::uint32_t>& numbers)
{
    std::wstring text;
    for (const std::uint32_t number : numbers) {
        if (!text.empty()) {
            text += L',';
        }
        text += std::to_wstring(number);
    }
    return text;
}

} // namespace

VHostCommandProvider::VHostCommandProvider(
    boost::function<std::vector<std::uint32_t>()> cameraNumbers)
    : cameraNumbers(std::move(cameraNumbers))
{
}

void VHostCommandProvider::GetCommandNames(std::vector<std::wstring>& names)
{
    names.push_back(informationCommand);
    names.push_back(echoCommand);
}

ControlSystem::ICommandInformation
VHostCommandProvider::GetCommandInformation(const std::wstring& name)
{
    ControlSystem::ICommandInformation information;
    if (name == informationCommand) {
        information.Name = name;
        information.Description = L"Tells which host this is and which cameras it has.";
        information.ReplyParameters = {
            {L"Name", L"The name of the host application."},
            {L"Version", L"Its version, as in 1.2.3."},
            {L"Cameras", L"The numbers of the cameras in rising order, separated by commas; empty "
                         L"without cameras."},
        };
    } else if (name == echoCommand) {
        information.Name = name;
        information.Description = L"Sends every parameter back as it came.";
        information.InputParameters = {{L"*", L"Any number of parameters of any names."}};
        information.ReplyParameters = {{L"*", L"Each input parameter with its value."}};
    }
    return information;
}

ControlSystem::IResult VHostCommandProvider::ExecuteCommand(const std::wstring& name,
                                                            const ControlSystem::IParameters& input,
                                                            ControlSystem::IParameters& reply)
{
    ControlSystem::IResult result;
    result.Code = resultOk;
    if (name == informationCommand) {
        Inform(reply);
    } else if (name == echoCommand) {
        reply = input;
    } else {
        result.Code = resultUnknownCommand;
    }
    return result;
}

void VHostCommandProvider::Inform(ControlSystem::IParameters& reply) const
{
    reply.Set(L"Name", L"quorix-host");
    reply.Set(L"Version", KVR::Utf8ToWide(QUORIX_VERSION));
    reply.Set(L"Cameras", JoinNumbers(cameraNumbers()));
}

} // namespace QuorixHost
