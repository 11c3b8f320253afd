#include "Plugin.h"

#include "QuorixPluginInterface/IPlugin.h"

#include <cstring>
#include <dlfcn.h>
#include <filesystem>

namespace QuorixHost {
namespace {

namespace fs = std::filesystem;

template <typename TFunction>
TFunction FindFunction(void* library, const char* name, const std::string& path)
{
    void* const address = dlsym(library, name);
    if (address == nullptr) {
        throw VPluginError(path + " is no plug-in: it has no function " + name);
    }
    TFunction function = nullptr;
    std::memcpy(&function, &address, sizeof function); // the cast that C++ has no word for
    return function;
}

} // namespace

VPlugin::VPlugin(const std::string& path)
{
    // A name without a folder would be looked for in the system's library folders.
    const std::string absolute = fs::absolute(path).string();
    void* const library = dlopen(absolute.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (library == nullptr) {
        throw VPluginError(std::string("the plug-in cannot be loaded: ") + dlerror());
    }

    using CreateFunction = QuorixPluginInterface::IPlugin* (*)();
    const auto create = FindFunction<CreateFunction>(library, "CreatePlugin", absolute);
    destroy = FindFunction<DestroyFunction>(library, "DestroyPlugin", absolute);
    object = create();
    if (object == nullptr) {
        throw VPluginError(absolute + " made no plug-in object");
    }

    const int version = object->GetInterfaceVersion();
    if (version != QuorixPluginInterface::IPlugin::interfaceVersion) {
        destroy(object);
        throw VPluginError(absolute + " has interface version " + std::to_string(version) +
                           ", this host needs " +
                           std::to_string(QuorixPluginInterface::IPlugin::interfaceVersion));
    }
}

VPlugin::~VPlugin()
{
    destroy(object);
}

std::string FindOwnPlugin()
{
    // Beside this program's folder: as it is built, and as it is installed.
    const char* const folders[] = {"../lib", QUORIX_INSTALLED_PLUGIN_FOLDER};

    const fs::path programFolder = fs::read_symlink("/proc/self/exe").parent_path();
    std::string tried;
    for (const char* const folder : folders) {
        const fs::path path = (programFolder / folder / QUORIX_PLUGIN_FILE).lexically_normal();
        std::error_code unreadable; // counts as not there
        if (fs::is_regular_file(path, unreadable)) {
            return path.string();
        }
        tried += tried.empty() ? "" : ", ";
        tried += path.string();
    }
    throw VPluginError("the plug-in is in none of " + tried + "; name it with --plugin");
}

} // namespace QuorixHost
