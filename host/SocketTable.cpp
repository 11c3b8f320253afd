#include "SocketTable.h"

#include <algorithm>
#include <arpa/inet.h>
#include <cctype>
#include <charconv>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>

namespace QuorixHost {
namespace {

namespace fs = std::filesystem;

/// Reads an address: one or four 32-bit words in hexadecimal, each in the machine's own byte order.
///
/// @return empty for another form
std::string ParseAddress(const std::string& text)
{
    constexpr std::size_t digitsOfWord = 8;
    std::uint32_t words[4] = {};
    const std::size_t count = text.size() / digitsOfWord;
    if (text.size() % digitsOfWord != 0 || (count != 1 && count != 4)) {
        return std::string();
    }
    for (std::size_t i = 0; i < count; ++i) {
        const char* const first = text.data() + i * digitsOfWord;
        if (std::from_chars(first, first + digitsOfWord, words[i], 16).ptr !=
            first + digitsOfWord) {
            return std::string();
        }
    }
    char printed[INET6_ADDRSTRLEN] = {};
    inet_ntop(count == 1 ? AF_INET : AF_INET6, words, printed, sizeof printed);
    return printed;
}

/// Splits ADDRESS:PORT.
bool ParseEnd(const std::string& text, std::string& address, std::uint16_t& port)
{
    const std::size_t colon = text.find(':');
    if (colon == std::string::npos) {
        return false;
    }
    address = ParseAddress(text.substr(0, colon));
    const char* const last = text.data() + text.size();
    return !address.empty() && std::from_chars(text.data() + colon + 1, last, port, 16).ptr == last;
}

bool ParseRow(const std::string& line, VSocketRow& row)
{
    std::istringstream words(line);
    std::string slot, local, remote, timer, retransmits, timeout;
    char colon = 0;
    words >> slot >> local >> remote >> std::hex >> row.state >> row.sendQueue >> colon >>
        row.receiveQueue >> timer >> retransmits >> std::dec >> row.userId >> timeout >> row.inode;
    return words && colon == ':' && ParseEnd(local, row.localAddress, row.localPort) &&
           ParseEnd(remote, row.remoteAddress, row.remotePort);
}

/// Returns the inode of a descriptor's entry "socket:[4711]", 0 for one that is no socket.
std::uint64_t SocketInode(const fs::path& descriptor)
{
    std::error_code error;
    const std::string target = fs::read_symlink(descriptor, error).string();
    std::uint64_t inode = 0;
    // An entry that has gone meanwhile, or that may not be read, is no socket to us.
    if (!error && std::sscanf(target.c_str(), "socket:[%lu]", &inode) != 1) {
        return 0;
    }
    return inode;
}

/// Lists a folder of /proc; what may not be read, or goes away meanwhile, is left out.
std::vector<fs::path> ListFolder(const fs::path& folder)
{
    std::vector<fs::path> paths;
    std::error_code error;
    for (fs::directory_iterator entry(folder, error), end; !error && entry != end;
         entry.increment(error)) {
        paths.push_back(entry->path());
    }
    return paths;
}

bool Holds(const fs::path& process, std::uint64_t inode)
{
    const std::vector<fs::path> descriptors = ListFolder(process / "fd");
    return std::any_of(descriptors.begin(), descriptors.end(),
                       [&](const fs::path& path) { return SocketInode(path) == inode; });
}

bool IsNumber(const std::string& name)
{
    return std::all_of(name.begin(), name.end(), [](unsigned char c) { return std::isdigit(c); });
}

std::string FirstLine(const fs::path& file)
{
    std::ifstream stream(file);
    std::string line;
    std::getline(stream, line);
    return line;
}

} // namespace

std::vector<VSocketRow> ReadSocketTable(std::istream& table)
{
    std::vector<VSocketRow> rows;
    for (std::string line; std::getline(table, line);) {
        VSocketRow row;
        if (ParseRow(line, row)) {
            rows.push_back(row);
        }
    }
    return rows;
}

std::vector<VSocketRow> ReadSocketTables()
{
    std::vector<VSocketRow> rows;
    for (const char* const file : {"/proc/self/net/tcp", "/proc/self/net/tcp6"}) {
        std::ifstream table(file);
        const std::vector<VSocketRow> read = ReadSocketTable(table);
        rows.insert(rows.end(), read.begin(), read.end());
    }
    return rows;
}

std::map<std::uint64_t, int> OwnSockets()
{
    std::map<std::uint64_t, int> sockets;
    for (const fs::path& path : ListFolder("/proc/self/fd")) {
        if (const std::uint64_t inode = SocketInode(path)) {
            sockets[inode] = std::stoi(path.filename().string());
        }
    }
    return sockets;
}

std::string DescribeHolder(std::uint64_t inode)
{
    std::string holders;
    for (const fs::path& path : ListFolder("/proc")) {
        const std::string name = path.filename().string();
        if (IsNumber(name) && Holds(path, inode)) {
            holders += holders.empty() ? "" : ", ";
            holders += "process " + name + " (" + FirstLine(path / "comm") + ")";
        }
    }
    return holders;
}

} // namespace QuorixHost
