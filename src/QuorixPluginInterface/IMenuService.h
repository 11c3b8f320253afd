#pragma once

#include <boost/function.hpp>

#include <string>
#include <vector>

/// The host's menus. Threads: the GUI thread.
class IMenuService
{
public:
    virtual ~IMenuService() = default;

    /// Adds an item that calls `function` when chosen.
    ///
    /// @param path       the menu's name, further menus below it, and last the item's own text
    /// @param shortcuts  key sequences, may be empty
    virtual void AddAction(const std::vector<std::string>& path, boost::function<void()> function,
                           const std::vector<std::string>& shortcuts) = 0;
};
