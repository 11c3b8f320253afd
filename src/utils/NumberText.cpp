#include "utils/NumberText.h"

#include <locale.h>

#include <charconv>
#include <cstdio>
#include <cstring>

namespace KVR {

namespace {

/// Gives the calling thread the "C" locale for its own lifetime.
class VClassicLocale
{
public:
    VClassicLocale() : previous(uselocale(Classic())) {}
    ~VClassicLocale() { uselocale(previous); }

    VClassicLocale(const VClassicLocale&) = delete;
    VClassicLocale& operator=(const VClassicLocale&) = delete;

private:
    static locale_t Classic()
    {
        // Made once and never freed. It cannot fail: the runtime library has this locale built in.
        static const locale_t classic = newlocale(LC_ALL_MASK, "C", nullptr);
        return classic;
    }

    const locale_t previous;
};

struct VSpecialSpelling
{
    const char* Text;
    std::uint32_t FloatBits;
    std::uint64_t DoubleBits;
};

// How the runtime libraries of earlier compilers printed these values, which old files hold.
// clang-format off
constexpr VSpecialSpelling specialSpellings[] = {
    {"1.#INF",   0x7F800000, 0x7FF0000000000000},
    {"-1.#INF",  0xFF800000, 0xFFF0000000000000},
    {"1.#IND",   0x7FC00000, 0x7FF8000000000000},
    {"-1.#IND",  0xFFC00000, 0xFFF8000000000000},
    {"1.#QNAN",  0x7FC00000, 0x7FF8000000000000},
    {"-1.#QNAN", 0xFFC00000, 0xFFF8000000000000},
};
// clang-format on

void SetBits(const VSpecialSpelling& spelling, float& number)
{
    static_assert(sizeof number == sizeof spelling.FloatBits);
    std::memcpy(&number, &spelling.FloatBits, sizeof number);
}

void SetBits(const VSpecialSpelling& spelling, double& number)
{
    static_assert(sizeof number == sizeof spelling.DoubleBits);
    std::memcpy(&number, &spelling.DoubleBits, sizeof number);
}

template <typename T>
std::optional<T> FromSpecialSpelling(const std::string& text)
{
    // Those libraries padded the spellings with zeros to the precision that was asked for.
    const std::string unpadded(text, 0, text.find_last_not_of('0') + 1);
    for (const VSpecialSpelling& spelling : specialSpellings) {
        if (unpadded == spelling.Text) {
            T number = 0;
            SetBits(spelling, number);
            return number;
        }
    }
    return std::nullopt;
}

template <typename T>
std::optional<T> FromText(const std::string& text, const char* format)
{
    T number = 0;
    int consumed = 0;
    int converted = 0;
    {
        const VClassicLocale classicLocale;
        converted = std::sscanf(text.c_str(), format, &number, &consumed);
    }
    // The empty text consumes all of its 0 characters and converts nothing.
    if (converted == 1 && static_cast<std::size_t>(consumed) == text.size()) {
        return number;
    }
    return FromSpecialSpelling<T>(text);
}

/// Reads the whole text as `std::from_chars` does, which takes no "+" by itself.
template <typename T>
std::optional<T> FromDeviceText(const std::string& text)
{
    const char* begin = text.data();
    const char* const end = begin + text.size();
    if (begin != end && *begin == '+') {
        ++begin;
        if (begin != end && *begin == '-') {
            return std::nullopt;
        }
    }
    T number = 0;
    const std::from_chars_result result = std::from_chars(begin, end, number);
    if (result.ec != std::errc() || result.ptr != end) {
        return std::nullopt;
    }
    return number;
}

} // namespace

std::optional<float> TextToFloat(const std::string& text)
{
    return FromText<float>(text, "%f%n");
}

std::optional<double> TextToDouble(const std::string& text)
{
    return FromText<double>(text, "%lf%n");
}

std::optional<std::uint32_t> DeviceTextToUInt32(const std::string& text)
{
    return FromDeviceText<std::uint32_t>(text);
}

std::optional<double> DeviceTextToDouble(const std::string& text)
{
    return FromDeviceText<double>(text);
}

} // namespace KVR
