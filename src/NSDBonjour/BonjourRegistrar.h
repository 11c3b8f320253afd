#pragma once

#include "NSDBonjour/DnsServiceCalls.h"
#include "NSDBonjour/NSDService.h"

#include <QObject>

#include <cstdint>
#include <memory>

class QSocketNotifier;

/// Advertises the control stream on the local network by DNS-SD, one service in its life.
///
/// Owns: the reference of the client library, which keeps the service advertised until this object
/// is destroyed or the process ends; the notifier of its socket.
/// Threads: lives on a thread with an event loop, [registrar], and does all its work there;
/// `Register` may be emitted on any.
/// Failure: words on the signal `error`. Nothing is retried and no other name is tried.
class VBonjourRegistrar : public QObject
{
    Q_OBJECT

public:
    /// @param calls  what stands for the client library; must outlive this object
    explicit VBonjourRegistrar(const VDnsServiceCalls& calls = LibraryDnsServiceCalls());

    /// Withdraws the advertisement.
    ~VBonjourRegistrar() override;

signals:
    /// Asks for the control stream to be advertised under `name`, UTF-8 of 1 to 63 bytes on the
    /// network. Emitted by whoever owns this object.
    void Register(const QString& name);

    /// Tells in words that something failed. A registration that stands is not touched by it.
    void error(QString text);

    /// Tells that the service is advertised, with the name that it has on the network.
    void serviceRegistered(const VNSDService& service);

private slots:
    void OnRegister(const QString& name);
    void BonjourSocketReadyRead();

protected:
    /// Starts the registration of `service`; an empty domain leaves the choice to the library.
    void RegisterService(const VNSDService& service, std::uint16_t port);

    /// What the last outcome said is registered; all empty before it.
    const VNSDService& RegisteredService() const { return registeredService; }

private:
    /// What the client library hands back to its callback.
    struct VContext
    {
        VBonjourRegistrar* Registrar = nullptr;
        DNSServiceRef Service = nullptr;
    };

    static void DNSSD_API OnRegistered(DNSServiceRef service, DNSServiceFlags flags,
                                       DNSServiceErrorType errorCode, const char* name,
                                       const char* type, const char* domain, void* context);

    bool CallRegister(const VNSDService& service, std::uint16_t port);
    void ServeSocket();
    void ReportError(DNSServiceErrorType errorCode);

    const VDnsServiceCalls& calls;
    const std::unique_ptr<VContext> context;
    QSocketNotifier* notifier = nullptr; // a child of this object
    VNSDService registeredService;
};
