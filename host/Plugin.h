#pragma once

#include <stdexcept>
#include <string>

namespace QuorixPluginInterface {
class IPlugin;
}

namespace QuorixHost {

/// Why a plug-in cannot be used, for people.
class VPluginError : public std::runtime_error
{
public:
    using std::runtime_error::runtime_error;
};

/// A plug-in object made by a shared library, and destroyed by it.
///
/// The library itself is never unloaded: threads that the plug-in made, and functions that it gave
/// to the host, may outlive the object. Threads: [gui].
class VPlugin
{
public:
    /// Loads the library and has it make its object.
    ///
    /// @param path  of the library; without a folder it is meant in the working folder
    /// Throws VPluginError where the library cannot be loaded, lacks one of its two functions,
    /// makes no object, or has another version of the interface.
    explicit VPlugin(const std::string& path);
    ~VPlugin();

    VPlugin(const VPlugin&) = delete;
    VPlugin& operator=(const VPlugin&) = delete;

    QuorixPluginInterface::IPlugin* operator->() const { return object; }

private:
    using DestroyFunction = void (*)(QuorixPluginInterface::IPlugin*);

    QuorixPluginInterface::IPlugin* object = nullptr;
    DestroyFunction destroy = nullptr;
};

/// Finds the plug-in that was built or installed together with this program.
///
/// Throws VPluginError, which names the places, where it is in none of them.
std::string FindOwnPlugin();

} // namespace QuorixHost
