#include "QuorixPluginControlStreamServer/ControlSystem/GreyscaleModeText.h"

#include "QuorixDataStoreTypes/GreyscaleMode.h"

#include <array>

namespace {

struct VModeText
{
    EGreyscaleMode mode;
    const wchar_t* text;
};

constexpr std::array<VModeText, 6> modeTexts = {{
    {EGreyscaleMode::Auto, L"Auto"},
    {EGreyscaleMode::None, L"None"},
    {EGreyscaleMode::All, L"All"},
    {EGreyscaleMode::Only, L"Only"},
    {EGreyscaleMode::Edges, L"Edges"},
    {EGreyscaleMode::NoEdges, L"No Edges"},
}};

} // namespace

std::wstring GreyscaleModeText(std::uint32_t stored)
{
    for (const VModeText& entry : modeTexts) {
        if (static_cast<std::uint32_t>(entry.mode) == stored) {
            return entry.text;
        }
    }
    return std::wstring();
}

std::int32_t GreyscaleModeOfText(const std::wstring& text)
{
    for (const VModeText& entry : modeTexts) {
        if (entry.text == text) {
            return static_cast<std::int32_t>(entry.mode);
        }
    }
    return static_cast<std::int32_t>(EGreyscaleMode::None);
}
