#pragma once

#include <boost/filesystem/path.hpp>

#include <cstddef>
#include <optional>
#include <string>

namespace UtilsFileSystem {

/// Reads a whole regular file.
///
/// @param limit  the greatest size that is taken, so that a wrong path cannot fill the memory
/// @return empty where it cannot be opened or read, is greater, or is no regular file: a pipe would
///         keep its reader waiting without end [any]
std::optional<std::string> ReadFile(const boost::filesystem::path& path, std::size_t limit);

} // namespace UtilsFileSystem
