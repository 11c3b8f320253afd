#pragma once

#include "NSDBonjour/DnsServiceCalls.h"

#include <QString>

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <thread>
#include <vector>

/// Stands for the DNS-SD client library: keeps what it is asked and answers as told.
///
/// One at a time, since the library's functions are plain ones. Threads: what the registrar's
/// thread writes is read after that thread has ended or answered by a signal.
class VFakeDnsServices
{
public:
    /// One call of DNSServiceRegister.
    struct VRegistration
    {
        DNSServiceFlags Flags = 1;
        std::uint32_t Interface = 1;
        std::string Name;
        std::string Type;
        std::optional<std::string> Domain;
        std::optional<std::string> Host;
        std::vector<unsigned char> PortBytes;
        std::uint16_t TextLength = 1;
        const void* Text = nullptr;
        std::thread::id Thread;
    };

    VFakeDnsServices();
    ~VFakeDnsServices();

    VFakeDnsServices(const VFakeDnsServices&) = delete;
    VFakeDnsServices& operator=(const VFakeDnsServices&) = delete;

    static const VDnsServiceCalls& Calls();

    /// Makes the socket readable, so that the registrar asks for one result; after as many as
    /// `ResultsBeforeCallBack` the next one calls back.
    void MakeReadable();

    /// Calls the registrar back as the library does from inside DNSServiceProcessResult.
    void CallBack(DNSServiceErrorType error, const char* name, const char* type,
                  const char* domain);

    // What it answers.
    DNSServiceErrorType RegisterAnswer = 0;
    bool LeavesReferenceAfterFailure = false;
    bool HasSocket = true;
    DNSServiceErrorType ProcessAnswer = 0;
    int ResultsBeforeCallBack = -1; // negative: never calls back
    DNSServiceErrorType CallBackError = 0;
    std::function<void()> OnDeallocate; // called before the reference counts as gone

    // What it was asked.
    std::vector<VRegistration> Registrations;
    int Processed = 0;
    int Deallocated = 0;

private:
    static DNSServiceErrorType DNSSD_API Register(DNSServiceRef*, DNSServiceFlags, std::uint32_t,
                                                  const char*, const char*, const char*,
                                                  const char*, std::uint16_t, std::uint16_t,
                                                  const void*, DNSServiceRegisterReply, void*);
    static int DNSSD_API RefSockFD(DNSServiceRef service);
    static DNSServiceErrorType DNSSD_API ProcessResult(DNSServiceRef service);
    static void DNSSD_API RefDeallocate(DNSServiceRef service);

    int sockets[2] = {-1, -1};
    DNSServiceRegisterReply reply = nullptr;
    void* context = nullptr;
};
