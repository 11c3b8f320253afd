#pragma once

namespace QuorixHost {

/// Returns whether the application's colours are light text on dark. [gui]
bool IsDarkPalette();

/// Gives the whole application, Quick views too, a light or a dark set of colours. [gui]
void SetPalette(bool dark);

} // namespace QuorixHost
