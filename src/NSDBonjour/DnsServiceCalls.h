#pragma once

#include <dns_sd.h>

/// The functions of the DNS-SD client library that an advertisement needs, so that a test can put
/// others in their place. Each has the signature of the library's own.
struct VDnsServiceCalls
{
    decltype(&DNSServiceRegister) Register;
    decltype(&DNSServiceRefSockFD) RefSockFD;
    decltype(&DNSServiceProcessResult) ProcessResult;
    decltype(&DNSServiceRefDeallocate) RefDeallocate;
};

/// Returns the library's own functions; the table lives as long as the process. [any]
const VDnsServiceCalls& LibraryDnsServiceCalls();
