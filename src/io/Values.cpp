#include "io/Values.h"

#include "Variant/Interning.h"
#include "io/BinaryLayout.h"
#include "io/VectorReader.h"

#include <cstring>
#include <limits>

using KVR::IO::EType;

namespace {

VDataValue EmptyValueOf(EType type)
{
    VDataValue value;
    value.Schema = &KVR::IO::GetUniquePodSchema(type);
    return value;
}

template <typename T>
VDataValue MakeNumberValue(EType type, T number)
{
    VDataValue value = EmptyValueOf(type);
    KVR::IO::Detail::AppendNumber(value.Bytes, number);
    return value;
}

template <typename T>
bool ReadNumber(const VDataValue& value, EType type, T& result)
{
    if (value.EffectiveSchema()->Type != type || value.Bytes.size() != sizeof(T)) {
        return false;
    }
    std::memcpy(&result, value.Bytes.data(), sizeof(T));
    return true;
}

template <typename T>
bool Fits(std::int32_t number)
{
    return number >= std::numeric_limits<T>::min() && number <= std::numeric_limits<T>::max();
}

bool FitsEnum(EType type, std::int32_t number)
{
    switch (type) {
    case EType::Enum8:
        return Fits<std::int8_t>(number);
    case EType::Enum16:
        return Fits<std::int16_t>(number);
    default:
        return type == EType::Enum32;
    }
}

} // namespace

VDataValue MakeBoolValue(bool value)
{
    return MakeNumberValue<std::uint8_t>(EType::Bool, value ? 1 : 0);
}

VDataValue MakeUInt32Value(std::uint32_t value)
{
    return MakeNumberValue(EType::UInt32, value);
}

VDataValue MakeDoubleValue(double value)
{
    return MakeNumberValue(EType::Float64, value);
}

VDataValue MakeStringValue(const std::string& value)
{
    VDataValue result = EmptyValueOf(EType::String);
    static_cast<void>(KVR::IO::Detail::AppendString(result.Bytes, value)); // too long: stays empty
    return result;
}

VDataValue MakeEnumValue(const KVR::IO::ISchema& schema, std::int32_t number)
{
    VDataValue value;
    value.Schema = &KVR::IO::GetUniqueSchema(schema);
    if (FitsEnum(schema.Type, number)) {
        KVR::IO::Detail::AppendEnum(value.Bytes, schema.Type, number);
    }
    return value;
}

bool ReadValue(const VDataValue& value, bool& result)
{
    std::uint8_t number = 0;
    if (!ReadNumber(value, EType::Bool, number)) {
        return false;
    }
    result = number != 0;
    return true;
}

bool ReadValue(const VDataValue& value, std::int8_t& result)
{
    return ReadNumber(value, EType::Int8, result);
}

bool ReadValue(const VDataValue& value, std::int16_t& result)
{
    return ReadNumber(value, EType::Int16, result);
}

bool ReadValue(const VDataValue& value, std::int32_t& result)
{
    return ReadNumber(value, EType::Int32, result);
}

bool ReadValue(const VDataValue& value, std::int64_t& result)
{
    return ReadNumber(value, EType::Int64, result);
}

bool ReadValue(const VDataValue& value, std::uint8_t& result)
{
    return ReadNumber(value, EType::UInt8, result);
}

bool ReadValue(const VDataValue& value, std::uint16_t& result)
{
    return ReadNumber(value, EType::UInt16, result);
}

bool ReadValue(const VDataValue& value, std::uint32_t& result)
{
    return ReadNumber(value, EType::UInt32, result);
}

bool ReadValue(const VDataValue& value, std::uint64_t& result)
{
    return ReadNumber(value, EType::UInt64, result);
}

bool ReadValue(const VDataValue& value, float& result)
{
    return ReadNumber(value, EType::Float32, result);
}

bool ReadValue(const VDataValue& value, double& result)
{
    return ReadNumber(value, EType::Float64, result);
}

bool ReadValue(const VDataValue& value, std::string& result)
{
    std::uint32_t length = 0;
    if (value.EffectiveSchema()->Type != EType::String || value.Bytes.size() < sizeof(length)) {
        return false;
    }
    std::memcpy(&length, value.Bytes.data(), sizeof(length));
    if (value.Bytes.size() - sizeof(length) != length) {
        return false;
    }
    result.assign(value.Bytes.begin() + sizeof(length), value.Bytes.end());
    return true;
}

bool ReadBool(const VDataValue& value)
{
    return !value.Bytes.empty() && value.Bytes.front() != 0;
}

std::uint32_t ReadUInt32OrZero(const VDataValue& value)
{
    std::uint32_t number = 0;
    if (value.Bytes.size() >= sizeof(number)) {
        std::memcpy(&number, value.Bytes.data(), sizeof(number));
    }
    return number;
}

std::string ReadString(const VDataValue& value)
{
    if (value.EffectiveSchema()->Type != EType::String ||
        value.Bytes.size() < sizeof(std::uint32_t)) {
        return std::string();
    }
    KVR::IO::Detail::VVectorReader reader(value.Bytes);
    std::string text;
    return reader.ReadString(text) ? text : std::string();
}
