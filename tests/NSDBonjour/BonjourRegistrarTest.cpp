#include "FakeDnsServices.h"

#include "NSDBonjour/BonjourRegistrar.h"

#include <gmock/gmock.h>

#include <QCoreApplication>
#include <QPointer>
#include <QSignalSpy>
#include <QSocketNotifier>

#include <memory>

using testing::ElementsAre;

namespace {

/// A registrar whose inner operation and record a test may use.
class VOpenRegistrar : public VBonjourRegistrar
{
public:
    VOpenRegistrar() : VBonjourRegistrar(VFakeDnsServices::Calls()) {}

    using VBonjourRegistrar::RegisteredService;
    using VBonjourRegistrar::RegisterService;
};

/// A registrar on the test's own thread, with what it said.
class BonjourRegistrar : public testing::Test
{
protected:
    std::vector<std::string> Errors() const
    {
        std::vector<std::string> texts;
        for (const QList<QVariant>& arguments : errors) {
            texts.push_back(arguments[0].toString().toStdString());
        }
        return texts;
    }

    bool HasNotifier() const { return registrar->findChild<QSocketNotifier*>() != nullptr; }

    /// Lets the registrar see one result on its socket.
    void Serve()
    {
        library.MakeReadable();
        QCoreApplication::processEvents();
    }

    VFakeDnsServices library;
    std::unique_ptr<VOpenRegistrar> registrar = std::make_unique<VOpenRegistrar>();
    QSignalSpy errors{registrar.get(), &VBonjourRegistrar::error};
    QSignalSpy registered{registrar.get(), &VBonjourRegistrar::serviceRegistered};
};

} // namespace

TEST_F(BonjourRegistrar, HasItsSignalsAndSlotsInThisOrder)
{
    const QMetaObject& metaObject = VBonjourRegistrar::staticMetaObject;
    std::vector<std::string> methods;
    for (int i = metaObject.methodOffset(); i < metaObject.methodCount(); ++i) {
        methods.push_back(metaObject.method(i).methodSignature().toStdString());
    }

    EXPECT_THAT(methods,
                ElementsAre("Register(QString)", "error(QString)", "serviceRegistered(VNSDService)",
                            "OnRegister(QString)", "BonjourSocketReadyRead()"));
    EXPECT_EQ(QMetaMethod::Signal, metaObject.method(metaObject.methodOffset() + 2).methodType());
    EXPECT_EQ(QMetaMethod::Slot, metaObject.method(metaObject.methodOffset() + 3).methodType());
}

TEST_F(BonjourRegistrar, AsksTheLibraryForTheControlStreamOnItsAdvertisedPort)
{
    emit registrar->Register(QString::fromUtf8("Name \xC3\xA9 \xF0\x9F\x98\x80"));

    ASSERT_EQ(1U, library.Registrations.size());
    const VFakeDnsServices::VRegistration& asked = library.Registrations[0];
    EXPECT_EQ(0U, asked.Flags);
    EXPECT_EQ(0U, asked.Interface);
    EXPECT_EQ("Name \xC3\xA9 \xF0\x9F\x98\x80", asked.Name);
    EXPECT_EQ("_korva._tcp.", asked.Type);
    EXPECT_EQ("local.", asked.Domain);
    EXPECT_EQ(std::nullopt, asked.Host);
    // 810, most significant byte first. The server itself listens on 803.
    EXPECT_THAT(asked.PortBytes, ElementsAre(0x03, 0x2A));
    EXPECT_EQ(0, asked.TextLength);
    EXPECT_EQ(nullptr, asked.Text);
    EXPECT_TRUE(HasNotifier());
    EXPECT_THAT(Errors(), ElementsAre());
}

TEST_F(BonjourRegistrar, AnEmptyDomainIsPassedAsNone)
{
    registrar->RegisterService({"Name", "_korva._tcp.", QString()}, 1);

    ASSERT_EQ(1U, library.Registrations.size());
    EXPECT_EQ(std::nullopt, library.Registrations[0].Domain);
    EXPECT_THAT(library.Registrations[0].PortBytes, ElementsAre(0x00, 0x01));
}

TEST_F(BonjourRegistrar, ARefusedRegistrationIsToldAndLeavesNoNotifier)
{
    library.RegisterAnswer = -65540;

    emit registrar->Register("Name");

    EXPECT_THAT(Errors(), ElementsAre("Bad Param"));
    EXPECT_FALSE(HasNotifier());
    EXPECT_EQ(0, registered.count());
    registrar.reset();
    EXPECT_EQ(0, library.Deallocated);
}

TEST_F(BonjourRegistrar, AfterARefusalAnotherRegistrationIsTried)
{
    library.RegisterAnswer = -65537;
    library.LeavesReferenceAfterFailure = true;
    emit registrar->Register("Name");
    library.RegisterAnswer = 0;

    emit registrar->Register("Name");

    EXPECT_THAT(Errors(), ElementsAre("Unknown Error"));
    EXPECT_EQ(2U, library.Registrations.size());
    EXPECT_TRUE(HasNotifier());
}

TEST_F(BonjourRegistrar, WithoutASocketTheRegistrationStandsUnserved)
{
    library.HasSocket = false;

    emit registrar->Register("Name");
    EXPECT_THAT(Errors(), ElementsAre("Invalid Socks"));
    EXPECT_FALSE(HasNotifier());

    emit registrar->Register("Name");
    EXPECT_THAT(Errors(), ElementsAre("Invalid Socks", "Already registered a service"));
}

TEST_F(BonjourRegistrar, ASecondRegisterIsRefusedAndTheFirstStands)
{
    emit registrar->Register("First");

    emit registrar->Register("Second");

    EXPECT_THAT(Errors(), ElementsAre("Already registered a service"));
    ASSERT_EQ(1U, library.Registrations.size());
    EXPECT_EQ("First", library.Registrations[0].Name);
    EXPECT_EQ(0, library.Deallocated);
    library.ResultsBeforeCallBack = 0;
    Serve();
    EXPECT_EQ(1, registered.count());
}

TEST_F(BonjourRegistrar, ServesItsSocketUntilTheAnswerComesAndKeepsIt)
{
    library.ResultsBeforeCallBack = 3;
    emit registrar->Register("Name");

    for (int result = 0; result < 3; ++result) {
        Serve();
        EXPECT_EQ(0, registered.count());
        EXPECT_TRUE(registrar->RegisteredService().Name.isEmpty());
    }
    Serve();

    EXPECT_EQ(4, library.Processed);
    ASSERT_EQ(1, registered.count());
    EXPECT_EQ("Name", registrar->RegisteredService().Name);
    EXPECT_THAT(Errors(), ElementsAre());
}

TEST_F(BonjourRegistrar, TellsWhatIsReallyRegistered)
{
    emit registrar->Register("Name");

    library.CallBack(0, "Na\xC3\xAFve #2", "_korva._tcp.", "local.");

    ASSERT_EQ(1, registered.count());
    const auto service = registered[0][0].value<VNSDService>();
    EXPECT_EQ(QString::fromUtf8("Na\xC3\xAFve #2"), service.Name);
    EXPECT_EQ("_korva._tcp.", service.RegisteredType);
    EXPECT_EQ("local.", service.ReplyDomain);
    EXPECT_EQ(service.Name, registrar->RegisteredService().Name);
    EXPECT_EQ(service.RegisteredType, registrar->RegisteredService().RegisteredType);
    EXPECT_EQ(service.ReplyDomain, registrar->RegisteredService().ReplyDomain);
}

TEST_F(BonjourRegistrar, AnErrorInTheAnswerIsToldAndItsTextsAreNotRead)
{
    emit registrar->Register("Name");

    library.CallBack(-65548, nullptr, nullptr, nullptr);

    EXPECT_THAT(Errors(), ElementsAre("Name Conflict"));
    EXPECT_EQ(0, registered.count());
    EXPECT_TRUE(registrar->RegisteredService().Name.isEmpty());
    EXPECT_EQ(1U, library.Registrations.size()); // no other name is tried
}

TEST_F(BonjourRegistrar, AFailureToReadTheAnswerIsTold)
{
    library.ProcessAnswer = -65563;
    emit registrar->Register("Name");

    Serve();

    EXPECT_THAT(Errors(), ElementsAre("Service Not Running - Background daemon not running"));
}

TEST_F(BonjourRegistrar, ASocketThatFailsIsReadNoMore)
{
    library.ProcessAnswer = -65563;
    emit registrar->Register("Name");
    Serve();

    Serve(); // as a socket whose other end is gone stays readable

    EXPECT_EQ(1, library.Processed);
    EXPECT_EQ(1U, Errors().size());
    emit registrar->Register("Name");
    EXPECT_EQ("Already registered a service", Errors().back());
}

TEST_F(BonjourRegistrar, AnUnknownErrorCodeIsToldAsUnrecognised)
{
    library.ProcessAnswer = -12345;
    emit registrar->Register("Name");

    Serve();

    EXPECT_THAT(Errors(), ElementsAre("Unrecognised Error"));
}

TEST_F(BonjourRegistrar, ItsEndWithdrawsTheAdvertisement)
{
    emit registrar->Register("Name");

    registrar.reset();

    EXPECT_EQ(1, library.Deallocated);
}

TEST_F(BonjourRegistrar, ItsEndLetsGoOfTheSocketBeforeTheLibraryClosesIt)
{
    emit registrar->Register("Name");
    const QPointer<QSocketNotifier> notifier = registrar->findChild<QSocketNotifier*>();
    ASSERT_FALSE(notifier.isNull());
    bool isWatched = true;
    library.OnDeallocate = [&] { isWatched = !notifier.isNull(); };

    registrar.reset();

    EXPECT_FALSE(isWatched);
}

TEST_F(BonjourRegistrar, ItsEndWithoutARegistrationWithdrawsNothing)
{
    registrar.reset();

    EXPECT_EQ(0, library.Deallocated);
}
