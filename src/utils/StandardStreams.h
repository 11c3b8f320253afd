#pragma once

namespace KVR {

/// Fills the places of standard streams that whoever started the program has closed: the next
/// files and connections would get these numbers, and what the program prints would go into them.
/// Nothing can be written to a filled place, and nothing read.
///
/// The first thing a program does, before it has threads.
void FillStandardStreams();

} // namespace KVR
