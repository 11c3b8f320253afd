#include "FakeHost/RecordedDialogue.h"

#include "ControlStreamClient/Error.h"
#include "ControlStreamClient/Message.h"
#include "ControlStreamClient/Utf8.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/ResultText.h"
#include "UtilsRapidXml/ParseXml.h"
#include "utils/WideText.h"

#include <algorithm>
#include <cstring>
#include <deque>
#include <optional>

namespace FakeHost {

namespace {

using namespace ControlStream;
using VNode = rapidxml::xml_node<char>;

/// A request as a device sent it.
struct VRecordedRequest
{
    EMessageKind Reply = EMessageKind::Unknown; // the kind of what answers it
    std::string Correlation;
    std::wstring Name;
    ControlSystem::IParameters Parameters;
};

const VNode* Child(const VNode& parent, const char* name)
{
    return parent.first_node(name, std::strlen(name));
}

std::string ValueOf(const VNode* element)
{
    return element == nullptr ? std::string()
                              : std::string(element->value(), element->value_size());
}

void ReplaceAll(std::string& text, const std::string& from, const std::string& to)
{
    for (std::size_t at = 0; (at = text.find(from, at)) != std::string::npos; at += to.size()) {
        text.replace(at, from.size(), to);
    }
}

/// As the server decodes the value of a parameter.
std::string Decoded(std::string value)
{
    ReplaceAll(value, "&quot;", "\"");
    ReplaceAll(value, "&apos;", "'");
    ReplaceAll(value, "&lt;", "<");
    ReplaceAll(value, "&gt;", ">");
    ReplaceAll(value, "&amp;", "&");
    return value;
}

ControlSystem::IParameters ReadParameters(const VNode& root)
{
    ControlSystem::IParameters parameters;
    const VNode* const list = Child(root, "Parameters");
    const VNode* entry = list == nullptr ? nullptr : Child(*list, "Parameter");
    for (; entry != nullptr; entry = entry->next_sibling()) {
        parameters.Set(KVR::Utf8ToWide(ValueOf(Child(*entry, "Name"))),
                       KVR::Utf8ToWide(Decoded(ValueOf(Child(*entry, "Value")))));
    }
    return parameters;
}

std::optional<VRecordedRequest> ReadRequest(std::string text)
{
    MakeReadable(text);
    rapidxml::xml_document<char> document;
    if (!UtilsRapidXml::ParseXml<rapidxml::parse_non_destructive>(document, text.data())) {
        return std::nullopt;
    }
    VRecordedRequest request;
    if (const VNode* command = Child(document, "ExecuteCommand")) {
        request = {EMessageKind::CommandReply, ValueOf(Child(*command, "Correlation")),
                   KVR::Utf8ToWide(ValueOf(Child(*command, "Name"))), ReadParameters(*command)};
    } else if (const VNode* information = Child(document, "CommandInformation")) {
        request = {EMessageKind::CommandInformation,
                   ValueOf(Child(*information, "Correlation")),
                   KVR::Utf8ToWide(ValueOf(Child(*information, "Name"))),
                   {}};
    } else if (const VNode* event = Child(document, "EventInformation")) {
        request = {EMessageKind::EventInformation, {}, KVR::Utf8ToWide(ValueOf(event)), {}};
    } else {
        return std::nullopt;
    }
    return request;
}

std::vector<std::wstring> ToWide(const std::vector<std::string>& names)
{
    std::vector<std::wstring> wide;
    wide.reserve(names.size());
    for (const std::string& name : names) {
        wide.push_back(KVR::Utf8ToWide(name));
    }
    return wide;
}

ControlSystem::IParameters ToWide(const VParameters& parameters)
{
    ControlSystem::IParameters wide;
    for (const VParameter& parameter : parameters) {
        wide.Set(KVR::Utf8ToWide(parameter.Name), KVR::Utf8ToWide(parameter.Value));
    }
    return wide;
}

std::vector<ControlSystem::IParameterInformation>
ToWide(const std::vector<VParameterInformation>& parameters)
{
    std::vector<ControlSystem::IParameterInformation> wide;
    wide.reserve(parameters.size());
    for (const VParameterInformation& parameter : parameters) {
        wide.push_back({KVR::Utf8ToWide(parameter.Name), KVR::Utf8ToWide(parameter.Description)});
    }
    return wide;
}

/// The first code with this text; only the text goes on the wire. One that no host writes is
/// answered by the text for a code that has none.
std::int32_t CodeOf(const std::string& result)
{
    constexpr std::int32_t last = 46;
    const std::wstring text = KVR::Utf8ToWide(result);
    for (std::int32_t code = 0; code <= last; ++code) {
        if (ControlStreamServer::ResultText(code) == text) {
            return code;
        }
    }
    return last + 1;
}

/// Goes through a recording, with what the devices wait for on each connection.
class VDialogueReader
{
public:
    VRecordedDialogue Read(const std::vector<VRecordedMoment>& moments)
    {
        if (!moments.empty()) {
            start = moments.front().Seconds;
        }
        for (const VRecordedMoment& moment : moments) {
            if (moment.Kind == ERecorded::Device) {
                if (auto request = ReadRequest(moment.Text)) {
                    open[moment.Connection].push_back(std::move(*request));
                }
            } else if (moment.Kind == ERecorded::Host) {
                ReadHost(moment);
            } else {
                open[moment.Connection].clear();
            }
        }
        return std::move(dialogue);
    }

private:
    void ReadHost(const VRecordedMoment& moment)
    {
        VMessage message;
        try {
            message = ParseMessage(moment.Text);
        } catch (const VError&) {
            return; // noise that was recorded with the rest
        }
        switch (message.Kind) {
        case EMessageKind::Commands:
            dialogue.Commands = ToWide(std::get<std::vector<std::string>>(message.Content));
            isListRecorded = true;
            break;
        case EMessageKind::Events:
            dialogue.Events = ToWide(std::get<std::vector<std::string>>(message.Content));
            break;
        case EMessageKind::Event:
            AddEvent(std::get<VEvent>(message.Content), moment);
            break;
        case EMessageKind::CommandInformation:
        case EMessageKind::EventInformation:
        case EMessageKind::CommandReply:
            AddAnswer(moment.Connection, message);
            break;
        case EMessageKind::ServerInformation:
        case EMessageKind::Unknown:
            break;
        }
    }

    /// Every device hears every event, so that those of the connection which heard the first count.
    void AddEvent(const VEvent& event, const VRecordedMoment& moment)
    {
        if (eventConnection == 0) {
            eventConnection = moment.Connection;
        }
        if (eventConnection == moment.Connection) {
            dialogue.Timeline.push_back(
                {moment.Seconds - start, KVR::Utf8ToWide(event.Name), ToWide(event.Parameters)});
        }
    }

    void AddAnswer(unsigned connection, const VMessage& message)
    {
        std::deque<VRecordedRequest>& requests = open[connection];
        const auto request =
            std::find_if(requests.begin(), requests.end(), [&](const VRecordedRequest& candidate) {
                return candidate.Reply == message.Kind &&
                       // The host prints the ampersands of a correlation as entities; the reader of
                       // messages has taken that back.
                       candidate.Correlation == message.Correlation;
            });
        if (request == requests.end()) {
            return;
        }
        if (message.Kind == EMessageKind::CommandReply) {
            AddOutcome(*request, std::get<VCommandReply>(message.Content));
        } else if (message.Kind == EMessageKind::CommandInformation) {
            const auto& information = std::get<VCommandInformation>(message.Content);
            dialogue.CommandInformation[request->Name] = {
                KVR::Utf8ToWide(information.Name), KVR::Utf8ToWide(information.Description),
                ToWide(information.InputParameters), ToWide(information.ReplyParameters)};
        } else {
            const auto& information = std::get<VEventInformation>(message.Content);
            dialogue.EventInformation[request->Name] = {KVR::Utf8ToWide(information.Name),
                                                        KVR::Utf8ToWide(information.Description),
                                                        ToWide(information.Parameters)};
        }
        requests.erase(request);
    }

    void AddOutcome(const VRecordedRequest& request, const VCommandReply& reply)
    {
        if (!isListRecorded &&
            dialogue.Outcomes.find(OutcomeKey(request.Name)) == dialogue.Outcomes.end()) {
            dialogue.Commands.push_back(request.Name); // the best that is known of the list
        }
        const VRecordedOutcome outcome{CodeOf(reply.Result), ToWide(reply.Parameters)};
        dialogue.Outcomes[OutcomeKey(request.Name)].push_back(outcome);
        dialogue.Outcomes[OutcomeKey(request.Name, request.Parameters)].push_back(outcome);
    }

    VRecordedDialogue dialogue;
    bool isListRecorded = false;
    double start = 0;
    unsigned eventConnection = 0;
    std::map<unsigned, std::deque<VRecordedRequest>> open;
};

} // namespace

std::wstring OutcomeKey(const std::wstring& name)
{
    return name;
}

std::wstring OutcomeKey(const std::wstring& name, const ControlSystem::IParameters& parameters)
{
    // No text on the wire can hold a zero.
    std::wstring key = name + L'\0';
    for (const auto& [parameter, value] : parameters) {
        key.append(parameter).append(1, L'\0').append(value).append(1, L'\0');
    }
    return key;
}

VRecordedDialogue ReadDialogue(const std::vector<VRecordedMoment>& moments)
{
    return VDialogueReader().Read(moments);
}

} // namespace FakeHost
