#pragma once

#include "io/InputStreamAdapter.h"
#include "io/VectorReader.h"

#include <cstddef>
#include <vector>

/// The stream of some bytes, which remembers the size of each read.
class VRecordingStream : public KVR::IInputStream
{
public:
    explicit VRecordingStream(const std::vector<unsigned char>& bytes)
        : cursor(bytes), stream(&cursor)
    {
    }

    bool Read(void* destination, std::size_t count) override
    {
        sizes.push_back(count);
        return stream.Read(destination, count);
    }

    bool IsPastEnd() const override { return stream.IsPastEnd(); }

    std::uint64_t GetPosition() const { return cursor.GetPosition(); }

    std::vector<std::size_t> sizes;

private:
    KVR::IO::Detail::VVectorReader cursor;
    KVR::IInputStreamAdapter<KVR::IO::Detail::VVectorReader> stream;
};
