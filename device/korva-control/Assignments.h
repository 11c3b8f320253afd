#pragma once

#include "ControlStreamClient/Records.h"

#include <string>
#include <vector>

/// Cuts each "NAME=VALUE" at its first "="; the value may hold more of them. Throws VError of the
/// kind Usage for a text without one.
ControlStream::VParameters ParseAssignments(const std::vector<std::string>& texts);
