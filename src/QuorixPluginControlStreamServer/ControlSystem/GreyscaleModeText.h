#pragma once

#include <cstdint>
#include <string>

/// Returns the text by which devices know a stored greyscale number, empty outside the enumeration.
/// It differs from the enumerator's name: devices say "No Edges", the store says NoEdges.
std::wstring GreyscaleModeText(std::uint32_t stored);

/// Returns the number of a text that a device sent, compared exactly and with case.
///
/// Deliberate: a text that is none of the six gives `None` and no error, so that an unknown mode
/// switches greyscale off. Devices rely on it to do so.
std::int32_t GreyscaleModeOfText(const std::wstring& text);
