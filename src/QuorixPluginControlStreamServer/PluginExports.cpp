#include "QuorixPluginControlStreamServer/QuorixPluginControlStreamServer.h"

// The only two functions that the library shows, by these very names.

/// Makes a plug-in object, which starts nothing. The caller gives it to DestroyPlugin.
extern "C" __attribute__((visibility("default"))) QuorixPluginInterface::IPlugin* CreatePlugin()
{
    return new VQuorixPluginControlStreamServer;
}

/// Destroys what CreatePlugin made; null is ignored.
extern "C" __attribute__((visibility("default"))) void
DestroyPlugin(QuorixPluginInterface::IPlugin* plugin)
{
    delete plugin;
}
