#include "NSDBonjour/DnsServiceCalls.h"

const VDnsServiceCalls& LibraryDnsServiceCalls()
{
    static const VDnsServiceCalls calls = {&DNSServiceRegister, &DNSServiceRefSockFD,
                                           &DNSServiceProcessResult, &DNSServiceRefDeallocate};
    return calls;
}
