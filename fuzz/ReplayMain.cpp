// Replays the files of a seed corpus through a fuzz target, in the builds that have no libFuzzer.

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

namespace {

std::vector<std::filesystem::path> FilesOf(const std::filesystem::path& folder)
{
    std::vector<std::filesystem::path> files;
    for (const auto& entry : std::filesystem::directory_iterator(folder)) {
        if (entry.is_regular_file()) {
            files.push_back(entry.path());
        }
    }
    std::sort(files.begin(), files.end());
    return files;
}

} // namespace

int main(int argc, char** argv)
{
    if (argc != 2) {
        std::fprintf(stderr, "usage: %s CORPUS_FOLDER\n", argv[0]);
        return 2;
    }

    const std::vector<std::filesystem::path> files = FilesOf(argv[1]);
    for (const std::filesystem::path& file : files) {
        std::ifstream input(file, std::ios::binary);
        const std::vector<char> bytes{std::istreambuf_iterator<char>(input), {}};
        // Named before it runs, so that the last line tells which input ended the process.
        std::printf("%s\n", file.filename().c_str());
        std::fflush(stdout);
        LLVMFuzzerTestOneInput(reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size());
    }

    std::printf("%zu inputs replayed\n", files.size());
    return files.empty() ? 1 : 0; // an empty corpus would be a test that cannot fail
}
