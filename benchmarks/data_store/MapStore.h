#pragma once

#include "io/DataValue.h"

#include <boost/function.hpp>

#include <map>
#include <mutex>
#include <shared_mutex>
#include <string>
#include <utility>
#include <vector>

/// The limit that the store is measured beside: what a program does that has no store, a map from
/// path texts to values behind one shared mutex, and another one of listeners.
class VMapStore
{
public:
    /// Runs `reads` under one shared lock; it is handed the map.
    template <typename Reads>
    void Read(Reads reads) const
    {
        const std::shared_lock<std::shared_mutex> lock(mutex);
        reads(values);
    }

    /// Runs `writes` under one lock, and then calls the listeners of what it has changed.
    template <typename Writes>
    void Write(Writes writes)
    {
        std::vector<boost::function<void()>> called;
        {
            const std::unique_lock<std::shared_mutex> lock(mutex);
            writes([&](const std::string& path, const VDataValue& value) {
                VDataValue& held = values[path];
                if (held == value) {
                    return;
                }
                held = value;
                if (!listeners.empty()) {
                    const auto listener = listeners.find(path);
                    if (listener != listeners.end()) {
                        called.push_back(listener->second);
                    }
                }
            });
        }
        for (const boost::function<void()>& listener : called) {
            listener();
        }
    }

    void Listen(const std::string& path, boost::function<void()> listener)
    {
        listeners[path] = std::move(listener);
    }

    void StopListening() { listeners.clear(); }

private:
    mutable std::shared_mutex mutex;
    std::map<std::string, VDataValue> values;
    std::map<std::string, boost::function<void()>> listeners;
};
