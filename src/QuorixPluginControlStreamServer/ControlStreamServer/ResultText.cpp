#include "QuorixPluginControlStreamServer/ControlStreamServer/ResultText.h"

#include <iterator>

namespace ControlStreamServer {

namespace {

constexpr std::wstring_view Unknown = L"Error: Unknown return code";

// clang-format off
// One line a code, from 0 on. Codes 0 and 6 bear the same words, and 44 and 45 have none of their
// own: devices know the table so.
constexpr std::wstring_view Texts[] = {
    /*  0 */ L"Error: System Error",
    /*  1 */ L"OK",
    /*  2 */ L"Error: Invalid command name or command not valid for the host application.",
    /*  3 */ L"Error: Invalid event name or event not valid for the host application.",
    /*  4 */ L"Error: Invalid Parameter Name",
    /*  5 */ L"Error: Invalid Parameter Value",
    /*  6 */ L"Error: System Error",
    /*  7 */ L"Error: Subject name is invalid or the subject is not currently loaded in to the workspace.",
    /*  8 */ L"Error: Marker name is not valid for the specified subject.",
    /*  9 */ L"Error: Frame number specified is not in the range of valid frames for the loaded trial.",
    /* 10 */ L"Error: Unable to access requested data.",
    /* 11 */ L"Error: Data update failed, the number of frames/samples provided does not match the existing data.",
    /* 12 */ L"Error: Data update failed, the number of components provided does not match the existing data.",
    /* 13 */ L"Error: Unable to create new subject parameter.",
    /* 14 */ L"Error: Unable to create new subject parameter, parameter already exists.",
    /* 15 */ L"Error: Unable to modify read only data.",
    /* 16 */ L"Error: Unable to create new model output.",
    /* 17 */ L"Error: Unable to create new model output - a model output with that name already exists.",
    /* 18 */ L"Error: At least one component must be specified.",
    /* 19 */ L"Error: Invalid component definition.",
    /* 20 */ L"Error: Application can not be in Live mode.",
    /* 21 */ L"Error: Unable to complete request, a pipeline is running.",
    /* 22 */ L"Error: Unable to locate pipeline, or the pipeline is invalid.",
    /* 23 */ L"Error: Unable to locate the requested device.",
    /* 24 */ L"Error: Device improperly configured or lacks supporting components.",
    /* 25 */ L"Error: Unable to locate the requested device output.",
    /* 26 */ L"Error: Unable to locate the requested device channel.",
    /* 27 */ L"Error: Skeleton type must be either Labeling or Solving.",
    /* 28 */ L"Error: Bone name is not valid for the specified skeleton.",
    /* 29 */ L"Error: Constraint name is not valid for the specified skeleton.",
    /* 30 */ L"Error: Invalid import type.",
    /* 31 */ L"Error: Object not found.",
    /* 32 */ L"Error: Attribute not found.",
    /* 33 */ L"Error: Channel not found.",
    /* 34 */ L"Error: Parameter not found.",
    /* 35 */ L"Error: Failed to execute KSL command text.",
    /* 36 */ L"Error: Invalid Object Type",
    /* 37 */ L"Error: Maximum number of NLE objects has been reached. Unable to create any more.",
    /* 38 */ L"Error: Object already exists. Can't create more than one object of this type.",
    /* 39 */ L"Error: Unable to remove QXDevices while running in Real Time.",
    /* 40 */ L"Error: Unable to create node. No active project in the database.",
    /* 41 */ L"Error: Unable to create node. No active capture day.",
    /* 42 */ L"Error: Unable to change parameter value while capture is in progress.",
    /* 43 */ L"Error: Not enough points for spline fit.",
    /* 44 */ Unknown,
    /* 45 */ Unknown,
    /* 46 */ L"Error: An unknown error occurred.",
};
// clang-format on

} // namespace

std::wstring_view ResultText(std::int32_t code)
{
    if (code < 0 || code >= static_cast<std::int32_t>(std::size(Texts))) {
        return Unknown;
    }
    return Texts[code];
}

} // namespace ControlStreamServer
