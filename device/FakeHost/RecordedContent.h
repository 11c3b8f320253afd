#pragma once

#include "FakeHost/IFakeContent.h"
#include "FakeHost/Recording.h"

#include <vector>

namespace FakeHost {

/// A host that says again what it said in a recording: the same lists and descriptions, to each
/// command the outcome that it had, one after the other where it was run several times, and the
/// events with the distances in time that they had, counted from the first device's connection.
///
/// A command with other parameters than any recorded gets the outcomes of the same name. One that
/// was never run fails as unknown.
std::unique_ptr<IFakeContent> MakeRecordedContent(const std::vector<VRecordedMoment>& moments);

} // namespace FakeHost
