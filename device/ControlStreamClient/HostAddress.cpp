#include "ControlStreamClient/HostAddress.h"

#include "ControlStreamClient/Error.h"

#include <algorithm>
#include <chrono>
#include <exception>
#include <future>
#include <memory>
#include <system_error>
#include <thread>

#include <arpa/inet.h>
#include <netdb.h>

namespace ControlStream {

namespace {

std::future<VLookUpResult> StartLookUp(const std::string& host, const LookUp& lookUp)
{
    auto promise = std::make_shared<std::promise<VLookUpResult>>();
    std::future<VLookUpResult> future = promise->get_future();
    try {
        std::thread([promise, host, lookUp] {
            VLookUpResult result;
            try {
                result = lookUp(host);
            } catch (const std::exception& error) {
                result.Error = error.what(); // nothing may leave the function of a thread
            }
            promise->set_value(result);
        }).detach();
    } catch (const std::system_error& error) {
        throw VError(EErrorKind::NoConnection,
                     "the address of " + host + " cannot be looked up: " + error.what());
    }
    return future;
}

// Nothing wakes who waits for a look-up, so that whoever wants to be asked meanwhile is asked so
// often.
constexpr std::chrono::milliseconds LookUpPart{20};

bool WaitUntil(const std::future<VLookUpResult>& result, const VDeadline& deadline,
               const VWaitPart& onWait)
{
    for (;;) {
        const VDeadline part = onWait ? deadline.Sooner(std::min(onWait(), LookUpPart)) : deadline;
        const int milliseconds = part.PollMilliseconds();
        if (milliseconds < 0) {
            result.wait();
            return true;
        }
        const auto waited = result.wait_for(std::chrono::milliseconds(milliseconds));
        if (waited == std::future_status::ready) {
            return true;
        }
        if (deadline.IsOver()) {
            return false;
        }
    }
}

} // namespace

VLookUpResult LookUpAddresses(const std::string& host)
{
    addrinfo hints{};
    hints.ai_family = AF_INET;
    hints.ai_socktype = SOCK_STREAM;

    VLookUpResult result;
    addrinfo* found = nullptr;
    const int code = getaddrinfo(host.c_str(), nullptr, &hints, &found);
    if (code != 0) {
        result.Error = gai_strerror(code);
        return result;
    }
    for (const addrinfo* entry = found; entry != nullptr; entry = entry->ai_next) {
        result.Addresses.push_back(reinterpret_cast<const sockaddr_in*>(entry->ai_addr)->sin_addr);
    }
    freeaddrinfo(found);
    return result;
}

std::vector<in_addr> FindAddresses(const std::string& host, const VDeadline& deadline,
                                   const LookUp& lookUp, const VWaitPart& onWait)
{
    in_addr address{};
    if (inet_pton(AF_INET, host.c_str(), &address) == 1) {
        return {address};
    }
    std::future<VLookUpResult> result = StartLookUp(host, lookUp);
    if (!WaitUntil(result, deadline, onWait)) {
        throw VError(EErrorKind::TimedOut, "timed out after " + deadline.LimitText() +
                                               ", waiting for the address of " + host);
    }
    VLookUpResult lookedUp = result.get();
    if (lookedUp.Addresses.empty()) {
        throw VError(EErrorKind::NoConnection,
                     "no IPv4 address is known for " + host + ": " + lookedUp.Error);
    }
    return lookedUp.Addresses;
}

} // namespace ControlStream
