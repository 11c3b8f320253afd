#include "Program.h"
#include "utils/StandardStreams.h"

#include <iostream>

int main(int argumentCount, char** arguments)
{
    KVR::FillStandardStreams();
    return QuorixConfig::RunProgram(argumentCount, arguments, std::cout, std::cerr);
}
