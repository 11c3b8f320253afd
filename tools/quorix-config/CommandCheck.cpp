#include "ConfigurationFile.h"
#include "ICommand.h"
#include "ItemText.h"

#include <CLI/CLI.hpp>

#include <ostream>

namespace QuorixConfig {

namespace {

/// Prints everything that loading a file finds, each message with the path of its element.
class VCheckCommand : public ICommand
{
public:
    CLI::App* Declare(CLI::App& application) override
    {
        CLI::App* command = application.add_subcommand(
            "check", "Prints every warning and error of a file; exit code 1 if there is an error");
        command->add_option("FILE", path, "The file")->required();
        return command;
    }

    int Run(std::ostream& output, std::ostream&) override
    {
        const VConfigurationFile file = LoadFile(path);
        for (const std::string& warning : file.Warnings) {
            output << "warning: " << Printable(warning) << '\n';
        }
        for (const std::string& error : file.Errors) {
            output << "error: " << Printable(error) << '\n';
        }
        output << file.Items.size() << " items, " << file.Errors.size() << " errors, "
               << file.Warnings.size() << " warnings\n";
        return file.Errors.empty() ? done : failed;
    }

private:
    std::string path;
};

} // namespace

std::unique_ptr<ICommand> MakeCheckCommand()
{
    return std::make_unique<VCheckCommand>();
}

} // namespace QuorixConfig
