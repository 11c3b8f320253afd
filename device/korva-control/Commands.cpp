#include "korva-control/Commands.h"

std::vector<std::unique_ptr<ICommand>> MakeCommands()
{
    std::vector<std::unique_ptr<ICommand>> commands;
    commands.push_back(MakeCommandDiscover());
    commands.push_back(MakeCommandInfo());
    commands.push_back(MakeCommandCameras());
    commands.push_back(MakeCommandCommands());
    commands.push_back(MakeCommandDescribe());
    commands.push_back(MakeCommandEvents());
    commands.push_back(MakeCommandDescribeEvent());
    commands.push_back(MakeCommandRun());
    commands.push_back(MakeCommandAuthorize());
    commands.push_back(MakeCommandWatch());
    commands.push_back(MakeCommandRaw());
    commands.push_back(MakeCommandShell());
    commands.push_back(MakeCommandRecord());
    commands.push_back(MakeCommandReplay());
    commands.push_back(MakeCommandBench());
    commands.push_back(MakeCommandServe());
    commands.push_back(MakeCommandDoctor());
    return commands;
}
