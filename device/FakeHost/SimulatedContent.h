#pragma once

#include "FakeHost/FakeOperator.h"
#include "FakeHost/IFakeContent.h"

#include <cstdint>

namespace FakeHost {

/// Simulated cameras behind the commands and events of the real providers, with a fake operator.
///
/// @param cameras  how many there are, numbered from 1
std::unique_ptr<IFakeContent> MakeSimulatedContent(std::uint32_t cameras,
                                                   const VOperatorOptions& operatorOptions);

} // namespace FakeHost
