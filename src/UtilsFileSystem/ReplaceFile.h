#pragma once

#include <boost/filesystem/path.hpp>

#include <string>

namespace UtilsFileSystem {

/// Makes `content` the whole content of a file, so that whoever opens it at any moment, and whoever
/// finds it after a crash, has either the old file or the new one.
///
/// The new file is written beside the old one, is on the disk before it takes its place, and takes
/// over its mode. A symbolic link stays, and the file that it leads to is replaced. Where the
/// folder allows no new file the old one is overwritten, the only case in which a failure in the
/// middle can cut it.
///
/// @return false where the file cannot be written: the old one is then as it was. That holds for
///         one that may not be written to, also where its folder would let it be replaced, and for
///         what is no regular file [any]
bool ReplaceFile(const boost::filesystem::path& path, const std::string& content);

} // namespace UtilsFileSystem
