#include "NSDBonjour/BonjourRegistrar.h"

#include "NSDBonjour/DnsServiceErrorText.h"

#include <QSocketNotifier>

#include <arpa/inet.h>

namespace {

// Deliberate: not the port on which the server listens. Devices expect this one in the
// advertisement and connect to the other; neither follows from the other.
constexpr std::uint16_t advertisedPort = 810;

} // namespace

VBonjourRegistrar::VBonjourRegistrar(const VDnsServiceCalls& dnsServiceCalls)
    : calls(dnsServiceCalls), context(std::make_unique<VContext>())
{
    context->Registrar = this;
    // A signal of its own, so that the work is done on the thread to which this object has moved.
    connect(this, &VBonjourRegistrar::Register, this, &VBonjourRegistrar::OnRegister);
}

VBonjourRegistrar::~VBonjourRegistrar()
{
    delete notifier; // before the library closes the socket that it watches
    if (context->Service != nullptr) {
        calls.RefDeallocate(context->Service);
    }
}

void VBonjourRegistrar::OnRegister(const QString& name)
{
    RegisterService({name, QStringLiteral("_korva._tcp."), QStringLiteral("local.")},
                    advertisedPort);
}

void VBonjourRegistrar::RegisterService(const VNSDService& service, std::uint16_t port)
{
    if (context->Service != nullptr) {
        emit error(QStringLiteral("Already registered a service"));
        return;
    }
    if (CallRegister(service, port)) {
        ServeSocket();
    }
}

bool VBonjourRegistrar::CallRegister(const VNSDService& service, std::uint16_t port)
{
    const QByteArray name = service.Name.toUtf8();
    const QByteArray type = service.RegisteredType.toUtf8();
    const QByteArray domain = service.ReplyDomain.toUtf8();

    const DNSServiceErrorType result =
        calls.Register(&context->Service, 0, 0, name.constData(), type.constData(),
                       domain.isEmpty() ? nullptr : domain.constData(), nullptr, htons(port), 0,
                       nullptr, &VBonjourRegistrar::OnRegistered, context.get());
    if (result != kDNSServiceErr_NoError) {
        context->Service = nullptr; // what the library leaves there after a failure is not said
        ReportError(result);
        return false;
    }
    return true;
}

void VBonjourRegistrar::ServeSocket()
{
    const int socket = calls.RefSockFD(context->Service);
    if (socket == -1) {
        emit error(QStringLiteral("Invalid Socks"));
        return;
    }
    notifier = new QSocketNotifier(socket, QSocketNotifier::Read, this);
    // By its text: of the signal's two forms the one with the number has no member that can be
    // named.
    connect(notifier, SIGNAL(activated(int)), this, SLOT(BonjourSocketReadyRead()));
}

void VBonjourRegistrar::BonjourSocketReadyRead()
{
    const DNSServiceErrorType result = calls.ProcessResult(context->Service);
    if (result != kDNSServiceErr_NoError) {
        // A socket whose daemon is gone stays readable: until this thread ends, which may be never
        // in a host without an event loop, it would be told of without end.
        notifier->setEnabled(false);
        ReportError(result);
    }
}

void VBonjourRegistrar::OnRegistered(DNSServiceRef /*service*/, DNSServiceFlags /*flags*/,
                                     DNSServiceErrorType errorCode, const char* name,
                                     const char* type, const char* domain, void* context)
{
    VBonjourRegistrar& registrar = *static_cast<VContext*>(context)->Registrar;
    if (errorCode != kDNSServiceErr_NoError) {
        registrar.ReportError(errorCode); // the texts mean nothing then
        return;
    }
    registrar.registeredService = {QString::fromUtf8(name), QString::fromUtf8(type),
                                   QString::fromUtf8(domain)};
    emit registrar.serviceRegistered(registrar.registeredService);
}

void VBonjourRegistrar::ReportError(DNSServiceErrorType errorCode)
{
    emit error(QString::fromLatin1(DnsServiceErrorText(errorCode)));
}
