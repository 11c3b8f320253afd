#include "Program.h"

#include <iostream>

int main(int argumentCount, char** arguments)
{
    return QuorixConfig::RunProgram(argumentCount, arguments, std::cout, std::cerr);
}
