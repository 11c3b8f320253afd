#pragma once

#include "io/IInputStream.h"
#include "io/VectorReader.h"

#include <cstring>

namespace KVR {

/// Makes an input stream of a cursor, which it does not own and moves as it reads. Unlike the
/// cursor's own reads, these return false and do not throw.
///
/// Threads: one thread, the one of the cursor.
template <typename Source>
class IInputStreamAdapter : public IInputStream
{
public:
    explicit IInputStreamAdapter(Source* source_) : source(source_) {}

    /// Moves the cursor by `count` in any case, and copies nothing if that is beyond the end.
    bool Read(void* destination, std::size_t count) override { return Copy(destination, count); }

    bool IsPastEnd() const override { return source->IsPastEnd(); }

    bool ReadParts(const std::vector<Part>& parts) override
    {
        for (const Part& part : parts) {
            if (!Copy(part.first, part.second)) {
                return false;
            }
        }
        return true;
    }

private:
    bool Copy(void* destination, std::size_t count)
    {
        if (!source->Advance(count)) {
            return false;
        }
        if (count != 0) {
            std::memcpy(destination, source->BytesBehind(count), count);
        }
        return true;
    }

    Source* source;
};

extern template class IInputStreamAdapter<IO::Detail::VVectorReader>;

} // namespace KVR
