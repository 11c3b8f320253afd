#pragma once

#include "io/DataValue.h"
#include "notification/IMultiCallback.h"

/// One typed setting of a device.
///
/// Threads: every operation may be called on any thread.
class IParameter
{
public:
    virtual ~IParameter() = default;

    /// Returns the present value; an empty one where the parameter has none.
    virtual VDataValue GetValue() = 0;

    /// Returns true when the value was taken, false when it was refused.
    virtual bool SetValue(const VDataValue& value) = 0;

    /// Fires once for each change, on the thread that brought it.
    virtual KVR::IMultiCallback<void()>& GetChangedCallback() = 0;
};
