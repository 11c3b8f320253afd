#pragma once

#include "ControlStreamClient/Deadline.h"

#include <chrono>
#include <functional>
#include <string>
#include <vector>

#include <netinet/in.h>

namespace ControlStream {

/// What looking up a name gave: addresses, or the reason why there are none.
struct VLookUpResult
{
    std::vector<in_addr> Addresses;
    std::string Error;
};

/// Asked before each part of a wait: returns how long that part may be at most. What it throws ends
/// the wait. An empty one lets the wait go through in one part.
using VWaitPart = std::function<std::chrono::milliseconds()>;

using LookUp = std::function<VLookUpResult(const std::string& host)>;

/// Asks the system's resolver for the IPv4 addresses of a name or of a dotted address. It has time
/// limits of its own, which are longer than a caller commonly wants to wait. [any]
VLookUpResult LookUpAddresses(const std::string& host);

/// Returns the IPv4 addresses of a host, of which there is at least one.
///
/// A dotted address is taken as it is. Any other name is looked up on a thread of its own, the only
/// one that the client ever starts: the resolver cannot be interrupted, so that after a time-out
/// this thread is left to end by itself. [any]
///
/// @throws VError  of the kind NoConnection without an address, TimedOut after the deadline
std::vector<in_addr> FindAddresses(const std::string& host, const VDeadline& deadline,
                                   const LookUp& lookUp = &LookUpAddresses,
                                   const VWaitPart& onWait = VWaitPart());

} // namespace ControlStream
