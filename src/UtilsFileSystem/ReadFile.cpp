#include "UtilsFileSystem/ReadFile.h"

#include "UtilsFileSystem/FileSystem.h"

#include <boost/filesystem/operations.hpp>

namespace UtilsFileSystem {

std::optional<std::string> ReadFile(const boost::filesystem::path& path, std::size_t limit)
{
    boost::system::error_code error;
    if (!boost::filesystem::is_regular_file(path, error)) {
        return std::nullopt;
    }
    std::ifstream stream;
    OpenInput(stream, path, std::ios_base::in | std::ios_base::binary);

    // In pieces, since the size of a file may change while it is read, or not be told at all.
    constexpr std::size_t pieceSize = std::size_t(1) << 20;
    std::string content;
    while (stream) {
        const std::size_t size = content.size();
        const std::size_t left = limit - size;
        // One byte more than is left shows that the file is greater.
        const std::size_t wanted = left < pieceSize ? left + 1 : pieceSize;
        content.resize(size + wanted);
        stream.read(&content[size], static_cast<std::streamsize>(wanted));
        content.resize(size + static_cast<std::size_t>(stream.gcount()));
        if (content.size() > limit) {
            return std::nullopt;
        }
    }
    if (!stream.eof() || stream.bad()) {
        return std::nullopt;
    }
    return content;
}

} // namespace UtilsFileSystem
