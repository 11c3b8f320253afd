#pragma once

#include <string>

/// Returns the name under which people know this host: "<application> on <computer>", as UTF-8.
///
/// Throws boost::system::system_error where the computer's name cannot be read. [any]
std::string MakeServerName();

/// Returns the same text for the given computer.
std::string MakeServerName(const std::string& computer);
