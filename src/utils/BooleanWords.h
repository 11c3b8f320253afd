#pragma once

namespace KVR {

/// The words of a boolean in texts and files: lower case only.
constexpr char TrueWord[] = "true";
constexpr char FalseWord[] = "false";

/// The name given to a value of an enumeration that has no entry for it.
constexpr char UnspecifiedWord[] = "Unspecified";

} // namespace KVR
