// Libraries that are no good plug-in, for the tests of loading one: QUORIX_TEST_VERSION makes one
// with another version of the interface, without it one that makes no object.

#include "QuorixPluginInterface/IPlugin.h"

#include <cstdlib>

namespace {

#ifdef QUORIX_TEST_VERSION
class VOtherVersion : public QuorixPluginInterface::IPlugin
{
public:
    ~VOtherVersion() override { setenv("QUORIX_TEST_PLUGIN", "destroyed", 1); }
    int GetInterfaceVersion() override { return QUORIX_TEST_VERSION; }
};
#endif

} // namespace

extern "C" QuorixPluginInterface::IPlugin* CreatePlugin()
{
#ifdef QUORIX_TEST_VERSION
    return new VOtherVersion;
#else
    return nullptr;
#endif
}

extern "C" void DestroyPlugin(QuorixPluginInterface::IPlugin* plugin)
{
    delete plugin;
}
