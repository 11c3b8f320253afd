#include "korva-control/Assignments.h"

#include "ControlStreamClient/Error.h"

ControlStream::VParameters ParseAssignments(const std::vector<std::string>& texts)
{
    ControlStream::VParameters parameters;
    for (const std::string& text : texts) {
        const std::size_t equals = text.find('=');
        if (equals == std::string::npos) {
            throw ControlStream::VError(ControlStream::EErrorKind::Usage,
                                        "a parameter is written as NAME=VALUE, not as \"" + text +
                                            "\"");
        }
        parameters.push_back({text.substr(0, equals), text.substr(equals + 1)});
    }
    return parameters;
}
