#pragma once

#include "Program.h"

#include <initializer_list>
#include <sstream>
#include <string>
#include <vector>

namespace ConfigTest {

/// What one run of quorix-config gave.
struct VRun
{
    int Code = -1;
    std::string Output;
    std::string Errors;
};

inline VRun RunTool(std::initializer_list<std::string> words)
{
    std::vector<const char*> arguments{"quorix-config"};
    for (const std::string& word : words) {
        arguments.push_back(word.c_str());
    }
    std::ostringstream output;
    std::ostringstream errors;
    VRun run;
    run.Code = QuorixConfig::RunProgram(static_cast<int>(arguments.size()), arguments.data(),
                                        output, errors);
    run.Output = output.str();
    run.Errors = errors.str();
    return run;
}

} // namespace ConfigTest
