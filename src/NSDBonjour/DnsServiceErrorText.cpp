#include "NSDBonjour/DnsServiceErrorText.h"

namespace {

struct VErrorText
{
    std::int32_t Error;
    const char* Text;
};

// By number, as the client library's header lacks the names of the newer codes. Two numbers between
// the first and the last have no text of their own.
// clang-format off
constexpr VErrorText errorTexts[] = {
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
    {-65560, "Bad Sig"},
    {-65561, "Bad Key"},
    {-65562, "Transient"},
    {-65563, "Service Not Running - Background daemon not running"},
    {-65564, "NAT Port Mapping Unsupported - NAT doesn't support PCP, NAT-PMP or UPnP"},
    {-65565, "NAT Port Mapping Disabled - NAT supports PCP, NAT-PMP or UPnP, "
             "but it's disabled by the administrator"},
    {-65566, "No Router - No router currently configured (probably no network connectivity)"},
    {-65567, "Polling Mode"},
    {-65568, "Timeout"},
};
// clang-format on

} // namespace

const char* DnsServiceErrorText(std::int32_t error)
{
    for (const VErrorText& row : errorTexts) {
        if (row.Error == error) {
            return row.Text;
        }
    }
    return "Unrecognised Error";
}
