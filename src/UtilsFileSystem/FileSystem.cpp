#include "UtilsFileSystem/FileSystem.h"

#include "utils/LogStatement.h"

#include <boost/filesystem/operations.hpp>

#include <climits>
#include <exception>

namespace UtilsFileSystem {

namespace {

bool IsPathText(const std::string& text)
{
    return text.find('\0') == std::string::npos;
}

boost::filesystem::file_status StatusOf(const boost::filesystem::path& path)
{
    if (!IsPathText(path.native())) {
        return boost::filesystem::file_status(boost::filesystem::file_not_found);
    }
    boost::system::error_code error;
    return boost::filesystem::status(path, error);
}

void RequirePathText(const boost::filesystem::path& path)
{
    if (!IsPathText(path.native())) {
        throw boost::filesystem::filesystem_error(
            "a path with a zero byte",
            boost::system::error_code(EINVAL, boost::system::system_category()));
    }
}

/// Makes the folders. Throws where one cannot be made.
void CreateFolders(const boost::filesystem::path& path)
{
    // A path that the system cannot take is refused first: making its parents would call itself
    // once for each component, and a text from a file may hold a million of them.
    if (path.native().size() >= PATH_MAX) {
        throw boost::filesystem::filesystem_error(
            "boost::filesystem::create_directories",
            boost::system::error_code(ENAMETOOLONG, boost::system::system_category()));
    }
    RequirePathText(path);
    boost::filesystem::create_directories(path);
}

template <typename Stream>
void Open(Stream& stream, const boost::filesystem::path& path, std::ios_base::openmode mode)
{
    if (!IsPathText(path.native())) {
        stream.setstate(std::ios_base::failbit);
        return;
    }
    stream.open(MakeLongPath(path.string()).c_str(), mode);
}

/// Runs the operation on one file. @return false if it threw
bool RunOn(const boost::filesystem::path& folder, const boost::filesystem::path& file,
           const boost::function<void(const boost::filesystem::path&)>& operation)
{
    const char* reason = "unknown exception";
    try {
        operation(file);
        return true;
    } catch (const std::exception& exception) {
        KVR_LOG("UtilsFileSystem", 2, "Failed operation on files in [%1%]: [%2%]", folder.string(),
                exception.what());
    } catch (...) {
        KVR_LOG("UtilsFileSystem", 2, "Failed operation on files in [%1%]: [%2%]", folder.string(),
                reason);
    }
    return false;
}

} // namespace

boost::filesystem::path MakeLongPath(const std::string& path)
{
    return boost::filesystem::path(path);
}

void OpenInput(std::ifstream& stream, const boost::filesystem::path& path,
               std::ios_base::openmode mode)
{
    Open(stream, path, mode);
}

void OpenOutput(std::ofstream& stream, const boost::filesystem::path& path,
                std::ios_base::openmode mode)
{
    Open(stream, path, mode);
}

bool FileExists(const boost::filesystem::path& path)
{
    const boost::filesystem::file_status status = StatusOf(path);
    return boost::filesystem::exists(status) && !boost::filesystem::is_directory(status);
}

bool FolderExists(const boost::filesystem::path& path)
{
    return boost::filesystem::is_directory(StatusOf(path));
}

void EnsureFolder(const boost::filesystem::path& path)
{
    const boost::filesystem::file_type type = StatusOf(path).type();
    if (type != boost::filesystem::status_error && type != boost::filesystem::file_not_found) {
        return;
    }
    try {
        CreateFolders(path);
    } catch (const std::exception& exception) {
        KVR_LOG("UtilsFileSystem", 2, "Unable to create path %1%: %2%", path.string(),
                exception.what());
    }
}

void ForEachFile(const boost::filesystem::path& folder,
                 const boost::function<void(const boost::filesystem::path&)>& operation)
{
    try {
        RequirePathText(folder);
        for (const auto& entry : boost::filesystem::directory_iterator(folder)) {
            if (boost::filesystem::is_regular_file(StatusOf(entry.path())) &&
                !RunOn(folder, entry.path(), operation)) {
                return;
            }
        }
    } catch (const std::exception&) {
        KVR_LOG("UtilsFileSystem", 2, "Failed finding files in folder: [%1%]", folder.string());
    }
}

} // namespace UtilsFileSystem
