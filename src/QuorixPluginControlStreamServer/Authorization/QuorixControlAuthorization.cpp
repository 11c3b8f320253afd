#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorization.h"

#include "DebugServices/Clock.h"
#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataWriter.h"
#include "QuorixPluginControlStreamServer/Authorization/ControlBeat.h"
#include "QuorixPluginControlStreamServer/Authorization/ControlLists.h"
#include "QuorixPluginControlStreamServer/Authorization/ControlPreferences.h"
#include "QuorixPluginControlStreamServer/Authorization/PlainText.h"
#include "QuorixPluginControlStreamServer/Authorization/ServerName.h"
#include "io/Values.h"
#include "notification/AsioPostalService.h"
#include "notification/AwaitTurn.h"
#include "notification/WeakBinding.h"
#include "utils/LogStatement.h"

#include <boost/bind/bind.hpp>
#include <boost/system/system_error.hpp>

#include <chrono>
#include <exception>
#include <utility>

namespace {

constexpr std::uint32_t checkMilliseconds = 3000;

// A check takes no time but that of others who write to the store.
constexpr std::chrono::milliseconds checkPatience{2000};

/// Clears a flag at the end of its scope, also where an exception leaves it.
class VClearAtEnd
{
public:
    explicit VClearAtEnd(std::atomic<bool>& cleared) : flag(cleared) {}
    ~VClearAtEnd() { flag = false; }

    VClearAtEnd(const VClearAtEnd&) = delete;
    VClearAtEnd& operator=(const VClearAtEnd&) = delete;

private:
    std::atomic<bool>& flag;
};

VDataToken ControlToken(const std::string& deviceId, const char* item)
{
    // A list of components, not a joined text: a device id may hold dots.
    return VDataToken(VDataPath{"Control", deviceId, item});
}

/// Runs one of the last steps, each of which must not keep the next from running.
///
/// @return whether it was done
template <typename TStep>
bool RunLastStep(const char* name, TStep step)
{
    try {
        step();
        return true;
    } catch (const std::exception& exception) {
        KVR_LOG("Authorization", 2, "At the end of the authorization, %1% failed: %2%", name,
                exception.what());
    } catch (...) {
        KVR_LOG("Authorization", 2, "At the end of the authorization, %1% failed", name);
    }
    return false;
}

} // namespace

VQuorixControlAuthorization::VQuorixControlAuthorization(
    std::shared_ptr<KVR::IPostalService> postal, std::shared_ptr<IDataStore> dataStore,
    NotificationSystem::VDeadlineTimerFactory timers, Clock time)
    : postalService(std::move(postal)),
      store(std::move(dataStore)),
      makeTimer(std::move(timers)),
      clock(time.empty() ? Clock(&DebugServices::SystemMilliseconds) : std::move(time)),
      heartbeatMonitor(std::make_shared<NotificationSystem::VAsioPostalService>(
          "Control Heartbeat Monitor", 1, 0))
{
    devices = ReadDevices();
}

VQuorixControlAuthorization::~VQuorixControlAuthorization()
{
    // No step and no check runs any more, since each holds this object.
    (void)RunLastStep("telling the devices", [this] { disconnected(); });

    std::string allowed;
    std::string banned;
    const bool made = RunLastStep("making the lists", [this, &allowed, &banned] {
        const Lock lock(mutex);
        allowed = ControlLists::Write(devices, true);
        banned = ControlLists::Write(devices, false);
    });
    if (made) { // else those that are stored are the better ones
        (void)RunLastStep("writing the lists",
                          [this, &allowed, &banned] { WriteDevices(allowed, banned); });
    }
}

VControlDevices VQuorixControlAuthorization::ReadDevices() const
{
    VControlDevices read;
    if (!store) {
        return read;
    }
    const VDataReader reader(*store);
    const auto text = [&reader](const VDataPath& path) {
        return ReadString(reader.GetValue(VDataToken(path)));
    };
    ControlLists::Read(text(ControlPreferences::AllowedControls()), true, read);
    ControlLists::Read(text(ControlPreferences::BannedControls()), false, read);
    return read;
}

void VQuorixControlAuthorization::WriteDevices(const std::string& allowed,
                                               const std::string& banned)
{
    if (!store) {
        return;
    }
    const VDataValue allowedValue = MakeStringValue(allowed);
    const VDataValue bannedValue = MakeStringValue(banned);

    VDataWriter writer(*store);
    // Both always, so that an emptied list replaces what was there.
    (void)writer.SetValue(VDataToken(ControlPreferences::AllowedControls()), allowedValue);
    (void)writer.SetValue(VDataToken(ControlPreferences::BannedControls()), bannedValue);
}

std::weak_ptr<VQuorixControlAuthorization> VQuorixControlAuthorization::Self()
{
    return std::static_pointer_cast<VQuorixControlAuthorization>(shared_from_this());
}

EAuthorizeAnswer VQuorixControlAuthorization::Authorize(const std::string& deviceId,
                                                        const std::string& deviceName)
{
    if (!postalService) {
        return EAuthorizeAnswer::Refused; // nothing could follow
    }
    // Weakly: a step that waits in the host's queue must not keep this object past the plug-in.
    const auto self = boost::bind(&KVR::LockOrDeregister<VQuorixControlAuthorization>, Self());

    const Lock lock(mutex);
    const auto found = devices.find(deviceId);
    if (found == devices.end()) {
        postalService->Post(
            boost::bind(&VQuorixControlAuthorization::RequestStep, self, deviceId, deviceName), 0);
        // The step cannot have cleared it yet: it takes the lock first.
        requestPending = true;
        return EAuthorizeAnswer::Pending;
    }
    // Deliberate: a banned device leaves no trace, neither an event nor a line in the log.
    if (!found->second.Allowed) {
        return EAuthorizeAnswer::Refused;
    }
    currentDeviceId = deviceId;
    postalService->Post(
        boost::bind(&VQuorixControlAuthorization::ConnectStep, self, deviceId, deviceName), 0);
    return EAuthorizeAnswer::Allowed;
}

void VQuorixControlAuthorization::CancelAuthorize(const std::string& deviceId)
{
    if (const std::shared_ptr<IQuorixControlAuthorizationGUI> present = GUI()) {
        present->Cancel(deviceId);
    }
}

void VQuorixControlAuthorization::Heartbeat()
{
    const Lock lock(mutex);
    lastBeat = clock();
}

KVR::IMultiCallback<void(bool)>& VQuorixControlAuthorization::GetAuthorizedCallback()
{
    return authorized;
}

KVR::IMultiCallback<void()>& VQuorixControlAuthorization::GetDisconnectedCallback()
{
    return disconnected;
}

std::string VQuorixControlAuthorization::GetServerName()
{
    try {
        return MakeServerName();
    } catch (const boost::system::system_error&) {
        return MakeServerName(""); // a device's command asks, and is to get its answer
    }
}

std::string VQuorixControlAuthorization::GetCurrentDeviceId()
{
    const Lock lock(mutex);
    return currentDeviceId;
}

bool VQuorixControlAuthorization::IsRequestPending()
{
    return requestPending;
}

void VQuorixControlAuthorization::SetGUI(std::weak_ptr<IQuorixControlAuthorizationGUI> operatorSide)
{
    const Lock lock(mutex);
    gui.swap(operatorSide);
}

VControlDevices VQuorixControlAuthorization::GetDevices()
{
    const Lock lock(mutex);
    return devices;
}

void VQuorixControlAuthorization::SetDevices(const VControlDevices& replacement)
{
    const Lock lock(mutex);
    devices = replacement;
}

void VQuorixControlAuthorization::RequestStep(const std::string& deviceId,
                                              const std::string& deviceName)
{
    const std::shared_ptr<IQuorixControlAuthorizationGUI> present = GUI();
    const VClearAtEnd clearRequestPending(requestPending);
    if (!present) {
        authorized(true);
        SetCurrentDeviceId(deviceId);
        ConnectStep(deviceId, deviceName);
        return;
    }
    // Markup of a device reaches neither the operator's dialog nor the lists.
    const std::string plainName = RichTextToPlainText(deviceName);
    // With no lock held: a person may take minutes, and beats must not wait for them.
    const EAskOutcome outcome = present->Ask(deviceId, plainName);
    ApplyOutcome(outcome, deviceId, deviceName, plainName);
}

void VQuorixControlAuthorization::ApplyOutcome(EAskOutcome outcome, const std::string& deviceId,
                                               const std::string& deviceName,
                                               const std::string& plainName)
{
    switch (outcome) {
    case EAskOutcome::AllowedOnce:
        SetCurrentDeviceId(deviceId);
        authorized(true);
        ConnectStep(deviceId, deviceName);
        break;
    case EAskOutcome::DeniedOnce:
        authorized(false);
        break;
    case EAskOutcome::AllowedAndRemembered:
        Remember(deviceId, true, plainName);
        // Deliberate: the record has the name as the device sent it, unlike dialog and lists.
        ConnectStep(deviceId, deviceName);
        break;
    case EAskOutcome::DeniedAndRemembered:
        Remember(deviceId, false, plainName);
        break;
    case EAskOutcome::Cancelled:
    default:
        // Deliberate: nobody is told, as it is the device itself that cancels.
        break;
    }
}

void VQuorixControlAuthorization::Remember(const std::string& deviceId, bool allowed,
                                           const std::string& plainName)
{
    // Listeners run under the lock here: nobody sees the outcome without the record, or the other
    // way round. They must not call back.
    const Lock lock(mutex);
    devices[deviceId] = {allowed, plainName};
    if (allowed) {
        currentDeviceId = deviceId;
    }
    authorized(allowed);
}

void VQuorixControlAuthorization::ConnectStep(const std::string& deviceId,
                                              const std::string& deviceName)
{
    if (store) {
        const VDataValue connected = MakeBoolValue(true);
        const VDataValue name = MakeStringValue(deviceName);
        VDataWriter writer(*store);
        (void)writer.SetValue(ControlToken(deviceId, "Connected"), connected);
        (void)writer.SetValue(ControlToken(deviceId, "Name"), name);
    }
    const Lock lock(mutex);
    lastBeat = clock();
    ScheduleCheck(deviceId);
}

void VQuorixControlAuthorization::EndHeartbeatCheck()
{
    {
        const Lock lock(mutex);
        checkEnded = true;
        ++checkNumber;
        heartbeatTimer.reset();
    }
    (void)KVR::AwaitTurn(*heartbeatMonitor, checkPatience); // beyond it the end comes late
}

void VQuorixControlAuthorization::ScheduleCheck(const std::string& deviceId)
{
    if (checkEnded) {
        return;
    }
    ++checkNumber;
    heartbeatTimer = makeTimer(
        heartbeatMonitor,
        boost::bind(&VQuorixControlAuthorization::CheckHeartbeat,
                    boost::bind(&KVR::LockOrDeregister<VQuorixControlAuthorization>, Self()),
                    deviceId, checkNumber),
        checkMilliseconds);
}

void VQuorixControlAuthorization::CheckHeartbeat(const std::string& deviceId, std::uint64_t number)
{
    const Lock lock(mutex);
    // A check that waited for the lock while another device's took its place must not go on.
    if (number != checkNumber) {
        return;
    }
    const bool connected = ControlBeat::IsFresh(clock(), lastBeat);
    if (store) {
        // Under the lock, so that no store listener and nobody with a view may call this object.
        VDataWriter writer(*store);
        (void)writer.SetValue(ControlToken(deviceId, "Connected"), MakeBoolValue(connected));
    }
    ScheduleCheck(deviceId);
}

std::shared_ptr<IQuorixControlAuthorizationGUI> VQuorixControlAuthorization::GUI()
{
    const Lock lock(mutex);
    return gui.lock();
}

void VQuorixControlAuthorization::SetCurrentDeviceId(const std::string& deviceId)
{
    const Lock lock(mutex);
    currentDeviceId = deviceId;
}
