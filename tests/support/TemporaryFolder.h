#pragma once

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <string>

namespace TestSupport {

/// A folder of a test's own, empty at first and gone with this object.
class VTemporaryFolder
{
public:
    VTemporaryFolder()
    {
        std::string pattern = (std::filesystem::temp_directory_path() / "quorix-test-XXXXXX");
        if (mkdtemp(pattern.data()) == nullptr) {
            throw std::runtime_error("no temporary folder");
        }
        path = pattern;
    }

    ~VTemporaryFolder()
    {
        std::error_code error; // what cannot be removed is no test's concern
        std::filesystem::remove_all(path, error);
    }

    VTemporaryFolder(const VTemporaryFolder&) = delete;
    VTemporaryFolder& operator=(const VTemporaryFolder&) = delete;

    /// Returns the folder itself, or the path of a name in it.
    std::string Path() const { return path.string(); }
    std::string Path(const std::string& name) const { return (path / name).string(); }

    /// Returns how many entries the folder has.
    std::size_t Count() const
    {
        return static_cast<std::size_t>(
            std::distance(std::filesystem::directory_iterator(path), {}));
    }

private:
    std::filesystem::path path;
};

/// Returns the bytes of a file, or a text in brackets if it cannot be read.
inline std::string ContentOf(const std::string& path)
{
    std::ifstream stream(path, std::ios::binary);
    if (!stream) {
        return "(no file)";
    }
    return {std::istreambuf_iterator<char>(stream), {}};
}

inline void WriteFile(const std::string& path, const std::string& content)
{
    std::ofstream stream(path, std::ios::binary | std::ios::trunc);
    stream << content;
    stream.close();
    if (!stream) {
        throw std::runtime_error("cannot write " + path);
    }
}

} // namespace TestSupport
