#pragma once

#include "QuorixDataStore/DataPath.h"

/// Where the choices of control authorization lie among the user's preferences.
namespace ControlPreferences {

/// A text, see ControlLists.
inline VDataPath AllowedControls()
{
    return VDataPath{"Preferences", "User", "AllowedControls"};
}

/// A text, see ControlLists.
inline VDataPath BannedControls()
{
    return VDataPath{"Preferences", "User", "BannedControls"};
}

/// A flag: how the check box of the next question stands.
inline VDataPath RememberControlChoices()
{
    return VDataPath{"Preferences", "User", "RememberControlChoices"};
}

} // namespace ControlPreferences
