#pragma once

#include "io/SchemaSamples.h"
#include "io/ValueText.h"

#include <gtest/gtest.h>

#include <cstring>
#include <limits>
#include <ostream>
#include <string>
#include <utility>
#include <vector>

// What the tests of reading value text share: a reading and what it left, and some schemas.

namespace ValueTextReading {

using namespace KVR::IO;

using ByteVector = std::vector<unsigned char>;

struct VReading
{
    bool good;
    ByteVector bytes;
    std::string rest; ///< what was not read

    bool operator==(const VReading& other) const
    {
        return good == other.good && bytes == other.bytes && rest == other.rest;
    }
};

inline std::ostream& operator<<(std::ostream& output, const VReading& reading)
{
    return output << (reading.good ? "good " : "failed ") << testing::PrintToString(reading.bytes)
                  << " rest '" << reading.rest << "'";
}

inline VReading Read(const ISchema& schema, const std::string& text,
                     SchemaTextMode mode = SchemaTextModeNamed)
{
    VReading reading{false, {9, 9, 9}, ""};
    const char* begin = text.data();
    const char* const end = begin + text.size();
    reading.good = TextToBinary(begin, end, schema, reading.bytes, mode);
    reading.rest.assign(begin, end);
    return reading;
}

inline VReading Good(ByteVector bytes, const std::string& rest = "")
{
    return {true, std::move(bytes), rest};
}

inline bool Fails(const ISchema& schema, const std::string& text,
                  SchemaTextMode mode = SchemaTextModeNamed)
{
    return !Read(schema, text, mode).good;
}

template <typename T>
T ReadNumber(EType type, const std::string& text)
{
    const VReading reading = Read(Plain(type), text);
    EXPECT_TRUE(reading.good) << text;
    EXPECT_EQ("", reading.rest);
    T number{};
    EXPECT_EQ(sizeof(T), reading.bytes.size());
    if (reading.bytes.size() == sizeof(T)) {
        std::memcpy(&number, reading.bytes.data(), sizeof(T));
    }
    return number;
}

inline double ReadDouble(const std::string& text)
{
    return ReadNumber<double>(EType::Float64, text);
}

inline float ReadFloat(const std::string& text)
{
    return ReadNumber<float>(EType::Float32, text);
}

inline const ISchema boolean = Plain(EType::Bool);
inline const ISchema byte = Plain(EType::Int8);
inline const ISchema word = Plain(EType::String);
inline const ISchema colour =
    EnumOf(EType::Enum8, {{"Red", 5}, {"Red", 6}, {"Dark red", -1}, {"", 7}});
inline const ISchema pair = NamedTupleOf({{"a", byte}, {"b", byte}});

inline const SchemaTextMode allModes[] = {SchemaTextModePositional, SchemaTextModeNamed,
                                          SchemaTextModeBrief, SchemaTextModeRow,
                                          SchemaTextModeQuotedRow};

inline const double infinity = std::numeric_limits<double>::infinity();

} // namespace ValueTextReading
