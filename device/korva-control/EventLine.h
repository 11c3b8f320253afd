#pragma once

#include "ControlStreamClient/Records.h"

#include <chrono>
#include <cstdint>
#include <string>

/// Returns an event as one line for people, made harmless for a terminal.
std::string EventLine(const ControlStream::VEvent& event);

/// Whether an event is about a camera: it bears its number, alone or in a list.
bool IsAboutCamera(const ControlStream::VEvent& event, std::uint32_t camera);

/// Returns a moment in universal time, as "2024-02-29T23:59:59.123Z".
std::string TimeStamp(std::chrono::system_clock::time_point moment);
