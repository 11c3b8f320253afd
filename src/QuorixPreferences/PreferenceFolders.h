#pragma once

#include <string>

class IDataStore;

// One preference of the store, by its key. Each operation takes a view of its own. What the store
// refuses, since the key holds a value of another type, is left as it is. [any]

/// A folder under "Preferences", "System".
void SetSystemFolder(IDataStore& store, const std::string& key, const std::string& folder);

/// Returns "" where there is no such folder.
std::string GetSystemFolder(const IDataStore& store, const std::string& key);

/// A folder under "Preferences", "User".
void SetUserFolder(IDataStore& store, const std::string& key, const std::string& folder);

/// Returns "" where there is no such folder.
std::string GetUserFolder(const IDataStore& store, const std::string& key);

/// A switch under "Preferences", "User".
void SetBool(IDataStore& store, const std::string& key, bool value);

/// The folder for captures, which has a place of its own.
void SetCaptureFolder(IDataStore& store, const std::string& folder);
std::string GetCaptureFolder(const IDataStore& store);
