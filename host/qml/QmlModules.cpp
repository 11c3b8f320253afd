#include "qml/QmlModules.h"

#include <QtGlobal>

// In no namespace, and be it an unnamed one: the macro declares a global function.
static void InitialiseHostQml()
{
    Q_INIT_RESOURCE(HostQml);
}

namespace QuorixHost {

void InitialiseQmlModules()
{
    InitialiseHostQml();
}

} // namespace QuorixHost
