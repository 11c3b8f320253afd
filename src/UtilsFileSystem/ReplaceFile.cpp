#include "UtilsFileSystem/ReplaceFile.h"

#include "UtilsFileSystem/FileSystem.h"

#include <boost/filesystem/operations.hpp>

#include <cerrno>
#include <cstdio>
#include <fcntl.h>
#include <random>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

namespace UtilsFileSystem {

namespace {

/// A file descriptor, closed when it goes.
class VDescriptor
{
public:
    explicit VDescriptor(int given = -1) : descriptor(given) {}
    VDescriptor(VDescriptor&& other) noexcept : descriptor(std::exchange(other.descriptor, -1)) {}
    ~VDescriptor()
    {
        if (descriptor >= 0) {
            close(descriptor);
        }
    }

    VDescriptor(const VDescriptor&) = delete;
    VDescriptor& operator=(const VDescriptor&) = delete;
    VDescriptor& operator=(VDescriptor&&) = delete;

    bool IsOpen() const { return descriptor >= 0; }
    int Get() const { return descriptor; }

private:
    int descriptor;
};

/// Returns the file that a path leads to through its symbolic links, also one that is not there.
boost::filesystem::path ResolveLinks(boost::filesystem::path path)
{
    constexpr int mostLinks = 40; // as many as the system follows itself
    for (int links = 0; links < mostLinks; ++links) {
        boost::system::error_code error;
        if (!boost::filesystem::is_symlink(boost::filesystem::symlink_status(path, error))) {
            break;
        }
        const boost::filesystem::path target = boost::filesystem::read_symlink(path, error);
        path = target.is_absolute() ? target : path.parent_path() / target;
    }
    return path;
}

boost::filesystem::path FolderOf(const boost::filesystem::path& path)
{
    const boost::filesystem::path folder = path.parent_path();
    return folder.empty() ? boost::filesystem::path(".") : folder;
}

bool WriteContent(const boost::filesystem::path& path, const std::string& content)
{
    std::ofstream stream;
    OpenOutput(stream, path, std::ios_base::out | std::ios_base::binary | std::ios_base::trunc);
    stream.write(content.data(), static_cast<std::streamsize>(content.size()));
    stream.close();
    return stream.good();
}

/// A new file in a folder, removed again unless it is told to stay.
class VTemporaryFile
{
public:
    explicit VTemporaryFile(const boost::filesystem::path& folder)
    {
        std::random_device random;
        do {
            char name[32];
            std::snprintf(name, sizeof name, ".quorix-%08x%08x", random(), random());
            path = folder / name;
            descriptor = open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        } while (descriptor < 0 && errno == EEXIST);
        failure = descriptor < 0 ? errno : 0;
    }

    ~VTemporaryFile()
    {
        if (descriptor < 0) {
            return;
        }
        close(descriptor);
        if (!moved) {
            unlink(path.c_str());
        }
    }

    VTemporaryFile(const VTemporaryFile&) = delete;
    VTemporaryFile& operator=(const VTemporaryFile&) = delete;

    /// Returns why there is no file, as an error number, or 0 if there is one.
    int Failure() const { return failure; }

    /// Gives the file the mode of another one, and its owner where the system lets it.
    bool ResembleTo(const struct stat& other)
    {
        struct stat own
        {
        };
        if (fstat(descriptor, &own) != 0) {
            return false;
        }
        if (own.st_uid != other.st_uid || own.st_gid != other.st_gid) {
            // Only an administrator's process may; the file of any other becomes its own.
            static_cast<void>(!fchown(descriptor, other.st_uid, other.st_gid));
        }
        return fchmod(descriptor, other.st_mode & 07777) == 0;
    }

    /// Writes the content and waits until it is on the disk.
    bool Fill(const std::string& content)
    {
        return WriteContent(path, content) && fsync(descriptor) == 0;
    }

    /// Puts the file in the place of another one. @return 0, or the error number
    int MoveTo(const boost::filesystem::path& place)
    {
        if (rename(path.c_str(), place.c_str()) != 0) {
            return errno;
        }
        moved = true;
        return 0;
    }

private:
    boost::filesystem::path path;
    int descriptor = -1;
    int failure = 0;
    bool moved = false;
};

/// Waits until a folder's entries are on the disk, if the folder lets itself be opened.
void SyncFolder(const boost::filesystem::path& folder)
{
    const VDescriptor descriptor(open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (descriptor.IsOpen()) {
        // The file has taken its place; that it may lose it in a power failure is nobody's gain.
        static_cast<void>(fsync(descriptor.Get()));
    }
}

/// Whether a failure tells that the folder allows no new file, or not this one in its place.
bool IsRefusal(int error)
{
    return error == EACCES || error == EPERM || error == EBUSY;
}

bool ReplaceInPlace(const boost::filesystem::path& path, const VDescriptor& old,
                    const std::string& content)
{
    return WriteContent(path, content) && fsync(old.Get()) == 0;
}

/// Replaces an existing file, or makes one where `old` is not open.
bool ReplaceResolved(const boost::filesystem::path& path, const VDescriptor& old,
                     const struct stat& status, const std::string& content)
{
    const boost::filesystem::path folder = FolderOf(path);
    int failure = 0;
    {
        VTemporaryFile file(folder);
        failure = file.Failure();
        if (failure == 0) {
            if ((old.IsOpen() && !file.ResembleTo(status)) || !file.Fill(content)) {
                return false;
            }
            failure = file.MoveTo(path);
        }
    }
    if (failure == 0) {
        SyncFolder(folder);
        return true;
    }
    return old.IsOpen() && IsRefusal(failure) && ReplaceInPlace(path, old, content);
}

} // namespace

bool ReplaceFile(const boost::filesystem::path& path, const std::string& content)
{
    if (path.native().find('\0') != std::string::npos) {
        return false;
    }
    const boost::filesystem::path resolved = ResolveLinks(path);
    struct stat status
    {
    };
    if (stat(resolved.c_str(), &status) != 0) {
        return errno == ENOENT && ReplaceResolved(resolved, VDescriptor(), status, content);
    }
    // Asked before it is opened: opening a pipe would wait for its reader.
    if (!S_ISREG(status.st_mode)) {
        return false;
    }
    const VDescriptor old(open(resolved.c_str(), O_WRONLY | O_CLOEXEC));
    return old.IsOpen() && ReplaceResolved(resolved, old, status, content);
}

} // namespace UtilsFileSystem
