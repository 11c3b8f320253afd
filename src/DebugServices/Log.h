#pragma once

#include "DebugServices/Export.h"

#include <string>

namespace KVR {

/// A named class of messages with a level of its own: a message of level N is wanted if the
/// category's level is at least N. In use are 2 errors, 3 warnings, 4 information, 6 tracing.
///
/// Threads: every operation [any]. An object of this class is never destroyed.
class KVR_DEBUG_SERVICES_EXPORT ILogCategory
{
public:
    virtual ~ILogCategory() = default;

    /// Returns the level now; it may change at any time.
    virtual int GetLevel() const = 0;

    /// Returns the free text by which the category was first fetched.
    virtual const std::string& GetName() const;
};

/// The log of the process: knows its categories and takes finished messages.
///
/// Threads: every operation [any]. An object of this class is never destroyed, since messages are
/// also written by threads that outlive `main` and by destructors of static objects.
class KVR_DEBUG_SERVICES_EXPORT ILogCategorised
{
public:
    virtual ~ILogCategorised() = default;

    /// Returns the category of that name, which is made at first use and lives as long as the
    /// process; the same name gives the same pointer, never null.
    virtual ILogCategory* GetCategory(const std::string& name) = 0;

    /// Takes a message without asking for the category's level: the caller has done so.
    ///
    /// @param category  from `GetCategory` of this log or of one that it replaced; null is none
    /// @param file      zero-terminated text, null is none
    virtual void Log(const std::string& text, const ILogCategory* category, int level,
                     const char* file, int line) = 0;
};

/// Returns the process's log: the last one given to `DebugServices::SetGlobalLog`, else one that
/// writes time, level, category and text to standard error. [any]
KVR_DEBUG_SERVICES_EXPORT ILogCategorised& GlobalLog();

} // namespace KVR

namespace DebugServices {

/// The level of every category that nobody has given another one: errors, warnings, information.
constexpr int DefaultLogLevel = 4;

/// Sets the level of a category of the log on standard error, at once and for good. A category that
/// nobody has fetched yet starts with it. [any]
KVR_DEBUG_SERVICES_EXPORT void SetLogLevel(const std::string& category, int level);

/// Puts a log in place of the present one, which is returned and goes on living.
///
/// Statements that have run keep the category pointers of the log before, so a replacement forwards
/// `GetCategory` to what this function returned, or copes with the categories of both.
///
/// @param log  never destroyed; null brings back the log on standard error
/// @return the log so far, never null [any]
KVR_DEBUG_SERVICES_EXPORT KVR::ILogCategorised* SetGlobalLog(KVR::ILogCategorised* log);

} // namespace DebugServices
