#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorizationGUI.h"

#include "QtQuickView/QuickWidgetManager.h"
#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataWriter.h"
#include "QuorixPluginControlStreamServer/Authorization/ControlPreferences.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorization.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorizationDialog.h"
#include "io/Values.h"
#include "utils/LogStatement.h"

#include <utility>

VQuorixControlAuthorizationGUI::VQuorixControlAuthorizationGUI(
    std::shared_ptr<VQuickWidgetManager> manager,
    std::shared_ptr<VQuorixControlAuthorization> authorization, std::shared_ptr<IDataStore> store,
    QWidget* parent)
    : manager(std::move(manager)),
      store(std::move(store)),
      authorization(std::move(authorization)),
      parent(parent)
{
    if (!this->store) {
        return;
    }
    const VDataToken token(ControlPreferences::RememberControlChoices());
    VDataWriter writer(*this->store);
    if (!writer.HasValue(token)) {
        static_cast<void>(writer.SetValue(token, MakeBoolValue(true)));
    }
}

VQuorixControlAuthorizationGUI::~VQuorixControlAuthorizationGUI() = default;

void VQuorixControlAuthorizationGUI::OnCreated()
{
    if (authorization) {
        authorization->SetGUI(
            std::static_pointer_cast<VQuorixControlAuthorizationGUI>(shared_from_this()));
    }
}

EAskOutcome VQuorixControlAuthorizationGUI::Ask(const std::string& /*deviceId*/,
                                                const std::string& deviceName)
{
    if (!manager) {
        KVR_LOG("Control", 2, "The host gives no quick context, so the operator cannot be asked");
        return EAskOutcome::Cancelled;
    }

    bool remember = ReadRemember();
    auto* const asking = new VQuorixControlAuthorizationDialog(
        manager, QString::fromStdString(deviceName), remember, parent);
    // exec() deletes the dialog before it returns, so what is wanted of it is taken at its end.
    QObject::connect(asking, &QDialog::finished, asking, [this, asking, &remember] {
        SetDialog(nullptr);
        remember = asking->Remember();
    });
    SetDialog(asking);
    const int outcome = asking->exec();

    WriteRemember(remember);
    return static_cast<EAskOutcome>(outcome);
}

void VQuorixControlAuthorizationGUI::Cancel(const std::string& /*deviceId*/)
{
    const KVR::VRecursiveMutexLock lock(mutex);
    if (dialog != nullptr) {
        emit dialog->Cancel();
    }
}

bool VQuorixControlAuthorizationGUI::ReadRemember() const
{
    if (!store) {
        return true;
    }
    const VDataReader reader(*store);
    return ReadBool(reader.GetValue(VDataToken(ControlPreferences::RememberControlChoices())));
}

void VQuorixControlAuthorizationGUI::WriteRemember(bool remember) const
{
    if (store) {
        VDataWriter writer(*store);
        // The check box of the next dialog is all that a refusal would change.
        static_cast<void>(writer.SetValue(VDataToken(ControlPreferences::RememberControlChoices()),
                                          MakeBoolValue(remember)));
    }
}

void VQuorixControlAuthorizationGUI::SetDialog(VQuorixControlAuthorizationDialog* open)
{
    const KVR::VRecursiveMutexLock lock(mutex);
    dialog = open;
}
