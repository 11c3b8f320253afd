#pragma once

namespace QuorixHost {

/// Makes the modules Korva.Theme and QuorixQML known under "qrc:/", from where every engine with
/// that import path loads them. To be called before the first view; a second call does nothing.
/// [gui]
void InitialiseQmlModules();

} // namespace QuorixHost
