#pragma once

#include <cstdint>

/// Returns the words for an error code of the DNS-SD client library; a code without any gives
/// "Unrecognised Error". The text is a literal. [any]
const char* DnsServiceErrorText(std::int32_t error);
