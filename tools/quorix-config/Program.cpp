#include "Program.h"

#include "ICommand.h"
#include "QuorixDataStore/DataStoreFileFormat.h"
#include "QuorixVersion.h"

#include <CLI/CLI.hpp>

#include <exception>
#include <ostream>
#include <sstream>
#include <utility>
#include <vector>

namespace QuorixConfig {

namespace {

const char* const description = "Looks into Quorix configuration and preference files, and changes "
                                "them.";

/// Tells what a file is made of, for those who have one open beside this help.
std::string DescribeFormat()
{
    using namespace DataStoreFileFormat;
    std::ostringstream text;
    text << "A file's elements and attributes:\n";
    for (const VElementDescription& element : {Configuration, Node, Item}) {
        text << "  " << element.Name << ": " << element.Documentation << '\n';
    }
    for (const VAttributeDescription& attribute : {Version, ItemName, Format, Proposed, Verified}) {
        text << "  " << attribute.Name << ": " << attribute.Documentation << '\n';
    }
    text << "\nExit codes: 0 done, 1 failed (diff: the files differ), 2 wrong usage (diff: a file "
            "cannot be read).";
    return text.str();
}

std::vector<std::unique_ptr<ICommand>> MakeCommands()
{
    std::vector<std::unique_ptr<ICommand>> commands;
    commands.push_back(MakeCheckCommand());
    commands.push_back(MakeGetCommand());
    commands.push_back(MakeSetCommand());
    commands.push_back(MakeListCommand());
    commands.push_back(MakeDiffCommand());
    commands.push_back(MakeMigrateCommand());
    return commands;
}

/// Runs a command. What was not written, to a full disk for example, must not pass for done.
int RunCommand(ICommand& command, std::ostream& output, std::ostream& errors)
{
    const int code = command.Run(output, errors);
    if (!output.flush()) {
        errors << "quorix-config: The output cannot be written\n";
        return code == done ? failed : code;
    }
    return code;
}

} // namespace

int RunProgram(int argumentCount, const char* const* arguments, std::ostream& output,
               std::ostream& errors)
{
    CLI::App application(description, "quorix-config");
    application.footer(DescribeFormat());
    application.set_version_flag("--version", "quorix-config " QUORIX_VERSION,
                                 "Print the version and exit");
    application.require_subcommand(1);
    std::vector<std::pair<CLI::App*, std::unique_ptr<ICommand>>> declared;
    for (std::unique_ptr<ICommand>& command : MakeCommands()) {
        CLI::App* const subcommand = command->Declare(application);
        declared.emplace_back(subcommand, std::move(command));
    }
    try {
        application.parse(argumentCount, arguments);
        for (const auto& [subcommand, command] : declared) {
            if (subcommand->parsed()) {
                return RunCommand(*command, output, errors);
            }
        }
    } catch (const CLI::Success& success) { // help and version
        return application.exit(success, output, errors);
    } catch (const CLI::ParseError& error) {
        application.exit(error, output, errors);
    } catch (const std::exception& exception) {
        errors << "quorix-config: " << exception.what() << '\n';
        return failed;
    }
    return wrongUsage;
}

} // namespace QuorixConfig
