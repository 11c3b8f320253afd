#pragma once

#include "RunningServer.h"

// What the tests of the wire share: how every reply begins, the request that every server answers,
// and how a server may be set.

#define DECLARATION "<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"

inline const char* const Information = "<ServerInformation/>";

inline const VServerMode serverModes[] = {
    {"AsThePlugInSetsIt", false, false},
    {"OnItsOwnPostalService", false, true},
    {"TranslatingEntities", true, false},
    {"TranslatingEntitiesOnItsOwnPostalService", true, true},
};
