#pragma once

#include "korva-control/ICommand.h"

#include <memory>
#include <vector>

/// Makes all commands, in the order in which the help shows them.
std::vector<std::unique_ptr<ICommand>> MakeCommands();

std::unique_ptr<ICommand> MakeCommandDiscover();
std::unique_ptr<ICommand> MakeCommandInfo();
std::unique_ptr<ICommand> MakeCommandCameras();
std::unique_ptr<ICommand> MakeCommandCommands();
std::unique_ptr<ICommand> MakeCommandDescribe();
std::unique_ptr<ICommand> MakeCommandEvents();
std::unique_ptr<ICommand> MakeCommandDescribeEvent();
std::unique_ptr<ICommand> MakeCommandRun();
std::unique_ptr<ICommand> MakeCommandAuthorize();
std::unique_ptr<ICommand> MakeCommandWatch();
std::unique_ptr<ICommand> MakeCommandRaw();
std::unique_ptr<ICommand> MakeCommandShell();
std::unique_ptr<ICommand> MakeCommandRecord();
std::unique_ptr<ICommand> MakeCommandReplay();
std::unique_ptr<ICommand> MakeCommandBench();
std::unique_ptr<ICommand> MakeCommandServe();
std::unique_ptr<ICommand> MakeCommandDoctor();
