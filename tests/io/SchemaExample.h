#pragma once

// The worked example of docs/schemas.md, word for word.

#include "io/NativeTypes.h"

namespace Release1 {

enum class ELens : std::int32_t { Wide = 0, Narrow = 1 };

struct VCalibration
{
    std::string name;
    std::int16_t quality = 0;
    ELens lens = ELens::Wide;
    bool stale = false;
    std::vector<float> residuals;
};

} // namespace Release1

template <>
struct KVR::IO::NativeEnum<Release1::ELens>
{
    static constexpr const char* Name = "ELens";

    template <typename Visitor>
    static void Visit(Visitor&& entry)
    {
        entry("Wide", Release1::ELens::Wide);
        entry("Narrow", Release1::ELens::Narrow);
    }
};

template <>
struct KVR::IO::NativeStruct<Release1::VCalibration>
{
    static constexpr const char* Name = "Calibration";

    template <typename Visitor>
    static void Visit(Visitor&& member)
    {
        member("Name", &Release1::VCalibration::name);
        member("Quality", &Release1::VCalibration::quality);
        member("Lens", &Release1::VCalibration::lens);
        member("Stale", &Release1::VCalibration::stale);
        member("Residuals", &Release1::VCalibration::residuals);
    }
};

namespace Release2 {

enum class ELens : std::int32_t { Macro = 0, Wide = 1, Narrow = 2 };

struct VCalibration
{
    std::string name;
    std::vector<double> residuals;
    ELens lens = ELens::Wide;
    std::int32_t quality = 0;
    std::string operatorName = "unknown";
};

} // namespace Release2

template <>
struct KVR::IO::NativeEnum<Release2::ELens>
{
    static constexpr const char* Name = "ELens";

    template <typename Visitor>
    static void Visit(Visitor&& entry)
    {
        entry("Macro", Release2::ELens::Macro);
        entry("Wide", Release2::ELens::Wide);
        entry("LEGACY_Narrow", Release2::ELens::Narrow);
    }
};

template <>
struct KVR::IO::NativeStruct<Release2::VCalibration>
{
    static constexpr const char* Name = "Calibration";

    template <typename Visitor>
    static void Visit(Visitor&& member)
    {
        member("Name", &Release2::VCalibration::name);
        member("Residuals", &Release2::VCalibration::residuals);
        member("Lens", &Release2::VCalibration::lens);
        member("Quality", &Release2::VCalibration::quality);
        member("OperatorName", &Release2::VCalibration::operatorName);
    }
};

/// Returns the calibration that a value of any release holds, and tells what changed since.
inline bool LoadCalibration(const VDataValue& value, Release2::VCalibration& calibration,
                            std::vector<std::string>& lines)
{
    KVR::IO::VNativeReader<Release2::VCalibration> reader(*value.EffectiveSchema());
    lines = reader.IsReadable() ? reader.GetWarnings() : reader.GetErrors();
    return reader.Read(value.Bytes, calibration);
}
