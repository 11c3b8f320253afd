#pragma once

#include <cstdint>
#include <string>

/// How the stores know threads: by numbers of their own, since the system gives the identifiers of
/// ended threads to new ones, while a writer's mark stays until his changes are committed.
namespace StoreThread {

/// Gives the calling thread its number and notes its name. @return the number
std::uint64_t Register();

/// The number of this thread, 0 until it has one. By itself, as it is read at every operation.
inline thread_local std::uint64_t threadKey = 0;

/// Returns the number of the calling thread, never 0 and never used again. The first call notes the
/// thread's name. [any]
inline std::uint64_t Key()
{
    return threadKey != 0 ? threadKey : Register();
}

/// Notes the name of the calling thread again; it may have been given after the first call. [any]
void RefreshName();

/// Returns the name that was noted for a thread, or a text that says that it has ended. [any]
std::string NameOf(std::uint64_t key);

} // namespace StoreThread
