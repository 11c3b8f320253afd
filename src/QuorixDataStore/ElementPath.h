#pragma once

#include "QuorixDataStore/DataPath.h"

#include <ostream>

/// A data path as the path of its element in a configuration file, for messages. The last component
/// of an item's path is a `Node` here too. It refers to the path, which must outlive it.
class VElementPath
{
public:
    explicit VElementPath(const VDataPath& dataPath) : path(dataPath) {}

    friend std::ostream& operator<<(std::ostream& stream, const VElementPath& element)
    {
        stream << "/Configuration";
        for (std::size_t index = 0; index < element.path.Count(); ++index) {
            stream << "/Node[@name='" << element.path.Component(index) << "']";
        }
        return stream;
    }

private:
    const VDataPath& path;
};
