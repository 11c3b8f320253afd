#pragma once

#include "ControlStreamClient/Records.h"
#include "FakeHost/Recording.h"
#include "QuorixPluginControlStreamServer/ControlSystem/ICommandInformation.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IEventInformation.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IParameters.h"

#include <map>
#include <string>
#include <vector>

namespace FakeHost {

/// How a command ended.
struct VRecordedOutcome
{
    std::int32_t Code = 1;
    ControlSystem::IParameters Reply;
};

struct VRecordedEvent
{
    double Seconds = 0; ///< since the first connection
    std::wstring Name;
    ControlSystem::IParameters Parameters;
};

/// What a recording tells of its host.
struct VRecordedDialogue
{
    std::vector<std::wstring> Commands;
    std::vector<std::wstring> Events;
    std::map<std::wstring, ControlSystem::ICommandInformation> CommandInformation;
    std::map<std::wstring, ControlSystem::IEventInformation> EventInformation;
    std::map<std::wstring, std::vector<VRecordedOutcome>> Outcomes; ///< by OutcomeKey
    std::vector<VRecordedEvent> Timeline;
};

/// The key of a command's outcomes: its name alone, or with its parameters.
std::wstring OutcomeKey(const std::wstring& name);
std::wstring OutcomeKey(const std::wstring& name, const ControlSystem::IParameters& parameters);

/// Reads a recording. What in it cannot be read is passed over, as the two sides did.
VRecordedDialogue ReadDialogue(const std::vector<VRecordedMoment>& moments);

} // namespace FakeHost
