#include "window/GreyscaleNames.h"

#include "QuorixDataStoreTypes/GreyscaleMode.h"

namespace QuorixHost {

std::vector<std::pair<std::int32_t, QString>> GreyscaleModes()
{
    std::vector<std::pair<std::int32_t, QString>> modes;
    for (const auto& [name, number] : GreyscaleModeSchema().EnumValues) {
        modes.emplace_back(number, QString::fromStdString(name));
    }
    return modes;
}

QString GreyscaleName(std::int32_t number)
{
    for (const auto& [value, name] : GreyscaleModes()) {
        if (value == number) {
            return name;
        }
    }
    return QString::number(number);
}

} // namespace QuorixHost
