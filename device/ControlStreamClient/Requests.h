#pragma once

#include "ControlStreamClient/Records.h"

#include <string>

namespace ControlStream {

// The texts of the requests, as frames carry them.
//
// The host answers a faulty request with silence, which cannot be told from a lost one. So every
// function here throws VError of the kind Usage for what the host would not answer, and for what
// would not arrive as it was given. [any]
//
// The host takes names and correlations as they stand, and decodes entities in the values of
// parameters only. Therefore a name is written unchanged, "&" included, and one with "<" cannot be
// sent at all; an escaped one would be another name.

std::string MakeServerInformationRequest();

/// @param correlation  any text that is not empty; the reply bears it
std::string MakeCommandsRequest(const std::string& correlation);

std::string MakeCommandInformationRequest(const std::string& correlation, const std::string& name);

std::string MakeEventsRequest();

std::string MakeEventInformationRequest(const std::string& name);

/// @param parameters  names as above; a value may be empty, and may hold any text but control
///                    characters other than tab and line ends, and not white space alone
std::string MakeExecuteCommandRequest(const std::string& correlation, const std::string& name,
                                      const VParameters& parameters);

} // namespace ControlStream
