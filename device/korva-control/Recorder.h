#pragma once

#include "FakeHost/ByteProxy.h"
#include "FakeHost/Recording.h"

#include <chrono>
#include <fstream>
#include <memory>
#include <string>

/// Writes what goes through a proxy to a file.
///
/// Owns: the file. Threads: MakeFilter and all that its filters do, the proxy's; the rest, before
/// and after the proxy. Failure: VError of the kind Usage where the file cannot be opened; what
/// cannot be written is told by Finish, and the devices notice nothing.
class VRecorder
{
public:
    /// @param overwrite  whether the file may exist
    /// @param host       the host's name and port, for the head
    VRecorder(const std::string& path, bool overwrite, const std::string& host);

    /// Makes the filter that records a connection and changes nothing.
    std::unique_ptr<FakeHost::IByteFilter> MakeFilter(unsigned connection);

    /// Closes the file. Throws std::runtime_error where something could not be written.
    void Finish();

    /// Writes one moment, which is now.
    void Write(unsigned connection, FakeHost::ERecorded kind, const std::string& text = {});

private:
    const std::string name;
    const std::chrono::steady_clock::time_point start = std::chrono::steady_clock::now();
    std::ofstream file;
};
