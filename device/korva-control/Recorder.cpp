#include "korva-control/Recorder.h"

#include "ControlStreamClient/Error.h"
#include "ControlStreamClient/FrameBuffer.h"

#include <algorithm>
#include <cstring>
#include <filesystem>

namespace {

using ControlStream::VError;
using FakeHost::ERecorded;
using FakeHost::VPassed;

// The longest frame that is recorded. Where one is announced as longer, the stream is broken, and
// nothing behind it can be told.
constexpr std::uint32_t FrameLimit = 64U << 20U;

/// Cuts one side's bytes into frames.
class VSideRecorder
{
public:
    VSideRecorder(VRecorder& owner, unsigned connectionNumber, ERecorded recordedKind)
        : recorder(owner), connection(connectionNumber), kind(recordedKind)
    {
    }

    void Take(const std::string& bytes)
    {
        std::size_t taken = 0;
        while (!broken && taken < bytes.size()) {
            const auto space = frames.GetSpace();
            const std::size_t count = std::min(space.Size, bytes.size() - taken);
            std::memcpy(space.Data, bytes.data() + taken, count);
            frames.Commit(count);
            taken += count;
            WriteWhole();
        }
    }

private:
    void WriteWhole()
    {
        try {
            std::string text;
            while (frames.Take(text)) {
                recorder.Write(connection, kind, text);
            }
        } catch (const VError&) {
            broken = true; // the two sides will find out for themselves
        }
    }

    VRecorder& recorder;
    const unsigned connection;
    const ERecorded kind;
    ControlStream::VFrameBuffer frames{FrameLimit};
    bool broken = false;
};

class VRecordingFilter : public FakeHost::IByteFilter
{
public:
    VRecordingFilter(VRecorder& owner, unsigned connectionNumber)
        : recorder(owner),
          connection(connectionNumber),
          device(owner, connectionNumber, ERecorded::Device),
          host(owner, connectionNumber, ERecorded::Host)
    {
        recorder.Write(connection, ERecorded::Connected);
    }

    ~VRecordingFilter() override { recorder.Write(connection, ERecorded::Closed); }

    VRecordingFilter(const VRecordingFilter&) = delete;
    VRecordingFilter& operator=(const VRecordingFilter&) = delete;

    bool ReadsDevice() override { return true; }

    VPassed FromDevice(const std::string& bytes) override
    {
        device.Take(bytes);
        return {bytes, {}, false};
    }

    VPassed FromHost(const std::string& bytes) override
    {
        host.Take(bytes);
        return {bytes, {}, false};
    }

private:
    VRecorder& recorder;
    const unsigned connection;
    VSideRecorder device;
    VSideRecorder host;
};

} // namespace

VRecorder::VRecorder(const std::string& path, bool overwrite, const std::string& host) : name(path)
{
    if (!overwrite && std::filesystem::exists(path)) {
        throw VError(ControlStream::EErrorKind::Usage,
                     path + " is there already; --overwrite replaces it");
    }
    file.open(path, std::ios::binary | std::ios::trunc);
    if (!file) {
        throw VError(ControlStream::EErrorKind::Usage, path + " cannot be written");
    }
    file << FakeHost::HeadLine(host) << std::endl;
}

std::unique_ptr<FakeHost::IByteFilter> VRecorder::MakeFilter(unsigned connection)
{
    return std::make_unique<VRecordingFilter>(*this, connection);
}

void VRecorder::Finish()
{
    file.close();
    if (!file) {
        throw std::runtime_error(name + " could not be written to its end");
    }
}

/// Each line goes out at once, so that a recording that is broken off is whole up to there.
void VRecorder::Write(unsigned connection, ERecorded kind, const std::string& text)
{
    const std::chrono::duration<double> seconds = std::chrono::steady_clock::now() - start;
    file << FakeHost::ToLine({seconds.count(), connection, kind, text}) << std::endl;
}
