#include "NSDBonjour/DnsServiceErrorText.h"

#include <gtest/gtest.h>

#include <limits>

namespace {

struct VErrorCase
{
    std::int32_t Error;
    const char* Text;
};

// clang-format off
const VErrorCase errorCases[] = {
    {0,      "No Error"},
    {-65537, "Unknown Error"},
    {-65538, "No Such Name"},
    {-65539, "No Memory"},
    {-65540, "Bad Param"},
    {-65541, "Bad Reference"},
    {-65542, "Bad State"},
    {-65543, "Bad Flags"},
    {-65544, "Unsupported"},
    {-65545, "Not Initialized"},
    {-65546, "Unrecognised Error"},
    {-65547, "Already Registered"},
    {-65548, "Name Conflict"},
    {-65549, "Invalid"},
    {-65550, "Firewall"},
    {-65551, "Incompatible - Client library incompatible with daemon"},
    {-65552, "Bad Interface Index"},
    {-65553, "Refused"},
    {-65554, "No Such Record"},
    {-65555, "No Auth"},
    {-65556, "No Such Key"},
    {-65557, "NAT Traversal"},
    {-65558, "Double NAT"},
    {-65559, "Unrecognised Error"},
    {-65560, "Bad Sig"},
    {-65561, "Bad Key"},
    {-65562, "Transient"},
    {-65563, "Service Not Running - Background daemon not running"},
    {-65564, "NAT Port Mapping Unsupported - NAT doesn't support PCP, NAT-PMP or UPnP"},
    {-65565, "NAT Port Mapping Disabled - NAT supports PCP, NAT-PMP or UPnP, but it's disabled by the administrator"},
    {-65566, "No Router - No router currently configured (probably no network connectivity)"},
    {-65567, "Polling Mode"},
    {-65568, "Timeout"},
    {-65569, "Unrecognised Error"},
    {-65536, "Unrecognised Error"},
    {-1,     "Unrecognised Error"},
    {1,      "Unrecognised Error"},
    {std::numeric_limits<std::int32_t>::min(), "Unrecognised Error"},
    {std::numeric_limits<std::int32_t>::max(), "Unrecognised Error"},
};
// clang-format on

} // namespace

TEST(DnsServiceErrorText, EveryCodeHasItsWords)
{
    for (const VErrorCase& errorCase : errorCases) {
        EXPECT_STREQ(errorCase.Text, DnsServiceErrorText(errorCase.Error)) << errorCase.Error;
    }
}
