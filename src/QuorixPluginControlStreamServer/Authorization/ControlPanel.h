#pragma once

#include <memory>

class IQuorixGUI;
class VQuorixControlAuthorization;

/// Registers the review of the known devices with the host as a panel, and adds the menu item that
/// shows it. Without a panel service or a menu service that part is left out.
///
/// The host keeps for ever what it is given here, so the authorization and the panel service are
/// known to it weakly: once either has gone the item does nothing and the panel is none. [gui]
void AddControlPanel(IQuorixGUI& gui,
                     const std::shared_ptr<VQuorixControlAuthorization>& authorization);
