#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <vector>

class VDataStore;

/// How many items lie in one node.
constexpr std::size_t itemsPerDevice = 50;

/// The texts that the bare side builds its document from: what the own side has to make first.
struct VItemTexts
{
    std::string Name;
    std::string Format;
    std::string Value;
};

/// Fills a store with items of plain types, as a host's settings are: names, switches and numbers,
/// fifty of them below each device.
void FillStore(VDataStore& store, std::size_t count);

/// Returns the texts of the same items, in the order of a file.
std::vector<VItemTexts> MakeTexts(std::size_t count);

/// Returns the name of a device, by its place in a file.
std::string DeviceName(std::size_t index);

/// Builds a document from the texts, node by node, and prints it: what any writer of the same file
/// has to do at the least.
std::string BuildAndPrint(const std::vector<VItemTexts>& texts);

/// Parses a text in place and looks at each name and value: what any reader has to do at the least.
///
/// @return the bytes of all names and values
std::size_t ParseAndWalk(std::string text);

/// Writes a store, or what a view of it has pending, and prints it.
std::string SaveStore(VDataStore& store, bool withPendingChange);

/// Parses a text and reads it into a new store.
///
/// @return the store
std::unique_ptr<VDataStore> LoadStore(std::string text);
