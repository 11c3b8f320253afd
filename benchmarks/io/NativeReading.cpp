#include "NativeReading.h"

#include "comparison/Comparison.h"
#include "io/NativeTypes.h"

#include <array>
#include <cstdint>
#include <cstring>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

namespace {

// Ten million bytes, which no cache of a processor holds together with where they are copied to.
constexpr std::size_t samples = 1250000;

// A flat array is read with at least half the rate of a copy.
constexpr double mostBesideCopy = 2;

// What a reader for older values may take where nothing changed.
constexpr double mostBesideCurrent = 1.1;

struct VFlat
{
    std::array<double, samples> values;
};

struct VMixed
{
    std::array<double, samples / 2> values;
    std::int32_t rows = 0;
    std::int32_t columns = 0;
    std::vector<double> list;
};

struct VRecord
{
    std::int32_t id = 0;
    std::int32_t flags = 0;
    double position[3] = {};
    bool visible = false;
    std::string label;
    std::vector<std::int16_t> history;
};

} // namespace

// clang-format off
template <> struct KVR::IO::NativeStruct<VFlat>
{
    static constexpr const char* Name = "Flat";
    template <typename Visitor> static void Visit(Visitor&& member) { member("Values", &VFlat::values); }
};

template <> struct KVR::IO::NativeStruct<VMixed>
{
    static constexpr const char* Name = "Mixed";
    template <typename Visitor> static void Visit(Visitor&& member)
    {
        member("Values", &VMixed::values);
        member("Rows", &VMixed::rows);
        member("Columns", &VMixed::columns);
        member("List", &VMixed::list);
    }
};

template <> struct KVR::IO::NativeStruct<VRecord>
{
    static constexpr const char* Name = "Record";
    template <typename Visitor> static void Visit(Visitor&& member)
    {
        member("Id", &VRecord::id);
        member("Flags", &VRecord::flags);
        member("Position", &VRecord::position);
        member("Visible", &VRecord::visible);
        member("Label", &VRecord::label);
        member("History", &VRecord::history);
    }
};
// clang-format on

namespace {

using namespace KVR::IO;
using ByteVector = std::vector<unsigned char>;

void Require(bool good, const char* what)
{
    if (!good) {
        throw std::runtime_error(what);
    }
}

template <typename T>
ByteVector BytesOf(const T& object)
{
    ByteVector bytes;
    Require(AppendNative(bytes, object), "the object was not written");
    return bytes;
}

/// Reads an object beside copying its bytes.
template <typename T>
nlohmann::json BesideCopy(unsigned rounds, const T& object)
{
    const ByteVector bytes = BytesOf(object);
    const auto read = std::make_unique<T>();
    VNativeReader<T> reader;
    Require(reader.Read(bytes, *read) && BytesOf(*read) == bytes, "the object was not read");

    ByteVector copy(bytes.size());
    return Compare(
        rounds, 1, [&] { Require(reader.Read(bytes, *read), "the object was not read"); },
        [&] {
            std::memcpy(copy.data(), bytes.data(), bytes.size());
            Require(std::memcmp(copy.data(), bytes.data(), 1) == 0, "the bytes were not copied");
        },
        mostBesideCopy);
}

std::vector<VRecord> MakeRecords(std::size_t count)
{
    std::vector<VRecord> records(count);
    for (std::size_t i = 0; i < count; ++i) {
        records[i].id = static_cast<std::int32_t>(i);
        records[i].visible = i % 2 == 0;
        records[i].label = "record " + std::to_string(i);
        records[i].history.resize(i % 8);
    }
    return records;
}

/// Reads records with the reader for older values beside the plain one.
nlohmann::json BesideCurrent(unsigned rounds, std::size_t count)
{
    using Records = std::vector<VRecord>;
    const ByteVector bytes = BytesOf(MakeRecords(count));
    VNativeReader<Records> current;
    VNativeReader<Records> evolving(NativeSchema<Records>());
    Records read;
    Records limitRead;
    Require(evolving.Read(bytes, read) && BytesOf(read) == bytes, "the records were not read");

    return Compare(
        rounds, 1, [&] { Require(evolving.Read(bytes, read), "the records were not read"); },
        [&] { Require(current.Read(bytes, limitRead), "the records were not read"); },
        mostBesideCurrent);
}

} // namespace

nlohmann::json MeasureNativeReading(unsigned rounds, std::size_t count)
{
    const auto flat = std::make_unique<VFlat>();
    flat->values.fill(1.5);
    const auto mixed = std::make_unique<VMixed>();
    mixed->values.fill(2.5);
    mixed->list.assign(samples / 2, 3.5);
    return {
        {"flat_array_beside_copy", BesideCopy(rounds, *flat)},
        {"array_and_list_beside_copy", BesideCopy(rounds, *mixed)},
        {"unchanged_beside_current", BesideCurrent(rounds, count)},
    };
}
