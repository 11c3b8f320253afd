#pragma once

#include "QuorixPluginControlStreamServer/Authorization/IQuorixControlAuthorizationGUI.h"
#include "notification/Shared.h"
#include "utils/Mutex.h"

#include <QPointer>

#include <memory>
#include <string>

class IDataStore;
class QWidget;
class VQuickWidgetManager;
class VQuorixControlAuthorization;
class VQuorixControlAuthorizationDialog;

/// Answers the authorization's question by a dialog. Made by KVR::MakeShared, which makes it known
/// to the authorization.
///
/// Owns: no dialog, but the pointer to the one that is open; the authorization knows this object
/// weakly. Threads: made and Ask [gui]; Cancel [any].
/// Failure: where the host has given no quick context nobody can be asked, and every request counts
/// as cancelled. Without a store the check box forgets how it stood.
class VQuorixControlAuthorizationGUI : public KVR::VShared, public IQuorixControlAuthorizationGUI
{
public:
    /// Creates the preference of the check box, as true, if the store has none.
    ///
    /// @param parent  of the dialogs; may be null
    VQuorixControlAuthorizationGUI(std::shared_ptr<VQuickWidgetManager> manager,
                                   std::shared_ptr<VQuorixControlAuthorization> authorization,
                                   std::shared_ptr<IDataStore> store, QWidget* parent);
    ~VQuorixControlAuthorizationGUI() override;

    void OnCreated() override;

    /// Shows the dialog and spins an event loop of its own until it is answered.
    EAskOutcome Ask(const std::string& deviceId, const std::string& deviceName) override;

    /// Cancels the dialog that is open, whichever device it asks about; none is no failure.
    void Cancel(const std::string& deviceId) override;

private:
    bool ReadRemember() const;
    void WriteRemember(bool remember) const;
    void SetDialog(VQuorixControlAuthorizationDialog* open);

    const std::shared_ptr<VQuickWidgetManager> manager;
    const std::shared_ptr<IDataStore> store;
    const std::shared_ptr<VQuorixControlAuthorization> authorization;
    const QPointer<QWidget> parent;

    // Held over the emission of the dialog's Cancel, so that the dialog cannot go meanwhile. On the
    // GUI thread the emission closes the dialog at once and comes back here, hence recursive.
    KVR::VRecursiveMutex mutex;
    VQuorixControlAuthorizationDialog* dialog KVR_GUARDED_BY(mutex) = nullptr; // null: none is open
};
