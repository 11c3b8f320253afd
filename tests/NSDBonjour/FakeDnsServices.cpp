#include "FakeDnsServices.h"

#include <gtest/gtest.h>

#include <sys/socket.h>
#include <unistd.h>

namespace {

VFakeDnsServices* current = nullptr;

/// The reference that the fake gives out; nobody looks into it.
DNSServiceRef Reference()
{
    static char reference;
    return reinterpret_cast<DNSServiceRef>(&reference);
}

std::optional<std::string> OptionalText(const char* text)
{
    return text != nullptr ? std::optional<std::string>(text) : std::nullopt;
}

} // namespace

VFakeDnsServices::VFakeDnsServices()
{
    EXPECT_EQ(nullptr, current);
    current = this;
    EXPECT_EQ(0, socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, sockets));
}

VFakeDnsServices::~VFakeDnsServices()
{
    current = nullptr;
    close(sockets[0]);
    close(sockets[1]);
}

const VDnsServiceCalls& VFakeDnsServices::Calls()
{
    static const VDnsServiceCalls calls = {&Register, &RefSockFD, &ProcessResult, &RefDeallocate};
    return calls;
}

void VFakeDnsServices::MakeReadable()
{
    EXPECT_EQ(1, write(sockets[1], "x", 1));
}

void VFakeDnsServices::CallBack(DNSServiceErrorType error, const char* name, const char* type,
                                const char* domain)
{
    reply(Reference(), 0, error, name, type, domain, context);
}

DNSServiceErrorType VFakeDnsServices::Register(DNSServiceRef* service, DNSServiceFlags flags,
                                               std::uint32_t interface, const char* name,
                                               const char* type, const char* domain,
                                               const char* host, std::uint16_t port,
                                               std::uint16_t textLength, const void* text,
                                               DNSServiceRegisterReply callBack, void* context)
{
    const auto* portBytes = reinterpret_cast<const unsigned char*>(&port);
    current->Registrations.push_back({flags,
                                      interface,
                                      name,
                                      type,
                                      OptionalText(domain),
                                      OptionalText(host),
                                      {portBytes, portBytes + sizeof port},
                                      textLength,
                                      text,
                                      std::this_thread::get_id()});
    current->reply = callBack;
    current->context = context;
    if (current->RegisterAnswer == 0 || current->LeavesReferenceAfterFailure) {
        *service = Reference();
    }
    return current->RegisterAnswer;
}

int VFakeDnsServices::RefSockFD(DNSServiceRef service)
{
    EXPECT_EQ(Reference(), service);
    return current->HasSocket ? current->sockets[0] : -1;
}

DNSServiceErrorType VFakeDnsServices::ProcessResult(DNSServiceRef service)
{
    EXPECT_EQ(Reference(), service);
    char byte = 0;
    EXPECT_EQ(1, read(current->sockets[0], &byte, 1));
    if (current->ResultsBeforeCallBack == current->Processed++) {
        current->CallBack(current->CallBackError, "Name", "_korva._tcp.", "local.");
    }
    return current->ProcessAnswer;
}

void VFakeDnsServices::RefDeallocate(DNSServiceRef service)
{
    EXPECT_EQ(Reference(), service);
    if (current->OnDeallocate) {
        current->OnDeallocate();
    }
    ++current->Deallocated;
}
