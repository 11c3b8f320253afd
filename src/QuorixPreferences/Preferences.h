#pragma once

#include <cstddef>
#include <string>

class IDataStore;
class IHostPaths;

/// The keys of the preferences that every host has.
namespace PreferenceKey {

constexpr char SharedDataFolder[] = "SharedDataFolder"; ///< of the system
constexpr char UserDataFolder[] = "UserDataFolder";     ///< of the system
constexpr char AltToSelect[] = "AltToSelect";           ///< of the user, a Bool

} // namespace PreferenceKey

/// The greatest size of a preference file that is read: such files are small.
constexpr std::size_t GreatestPreferenceFile = std::size_t(16) << 20;

/// Loads "System.Prefs" and "User.Prefs" into the store, over the host's defaults, and puts the
/// default back for every folder in them that is not there.
///
/// Failure: none; what cannot be read or reached ends in defaults and log lines. Threads: the
/// caller's, with one view at a time.
void LoadPreferences(IDataStore& store, IHostPaths& hostPaths);

/// Writes both files, each with its own sub-tree of the store without the read-only items.
///
/// A file is replaced as a whole or left as it was, also where it would be too great to be read
/// again. Nothing is logged about a file that cannot be written. Threads: the caller's.
void SavePreferences(IDataStore& store, IHostPaths& hostPaths);
