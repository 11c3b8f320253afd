#pragma once

#include <boost/filesystem/path.hpp>
#include <boost/function.hpp>

#include <fstream>
#include <string>

/// Files and folders without exceptions: what fails is told by a result, by a stream's state or by
/// a line in the log category "UtilsFileSystem".
///
/// Threads: every operation [any]; there is no shared state. A path that holds a zero byte names
/// nothing, although the system would read it as a shorter one.
namespace UtilsFileSystem {

/// Returns the path by which the system opens files whatever the length of their names. Here that
/// is the path itself: only Windows has two forms of one path.
boost::filesystem::path MakeLongPath(const std::string& path);

/// Opens a file through its long path. A failure leaves the stream in its failed state.
void OpenInput(std::ifstream& stream, const boost::filesystem::path& path,
               std::ios_base::openmode mode);
void OpenOutput(std::ofstream& stream, const boost::filesystem::path& path,
                std::ios_base::openmode mode);

/// Returns whether the path exists and is no folder. What is neither a regular file nor a folder
/// counts as a file.
bool FileExists(const boost::filesystem::path& path);

/// Returns whether the path exists and is a folder.
bool FolderExists(const boost::filesystem::path& path);

/// Makes a folder with all its parents if the path does not exist. A file in its place stays.
void EnsureFolder(const boost::filesystem::path& path);

/// Calls the operation for each regular file of the folder, not of its sub-folders, in whatever
/// order the system lists them. An operation that throws ends the walk.
void ForEachFile(const boost::filesystem::path& folder,
                 const boost::function<void(const boost::filesystem::path&)>& operation);

} // namespace UtilsFileSystem
