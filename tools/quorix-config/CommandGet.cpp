#include "ConfigurationFile.h"
#include "ICommand.h"
#include "ItemText.h"
#include "io/ValueText.h"

#include <CLI/CLI.hpp>

#include <ostream>

namespace QuorixConfig {

namespace {

/// Prints the value of one item.
class VGetCommand : public ICommand
{
public:
    CLI::App* Declare(CLI::App& application) override
    {
        CLI::App* command = application.add_subcommand(
            "get", "Prints the value of an item as it stands in the file");
        command->add_option("FILE", path, "The file")->required();
        command->add_option("PATH", item, "The item's data path, with dots")->required();
        command->add_flag("--verified", verified,
                          "The verified value, also where there is a proposed one");
        command->add_flag("--raw", raw, "A text without its quotes and escapes");
        return command;
    }

    int Run(std::ostream& output, std::ostream& errors) override
    {
        VConfigurationFile file;
        if (!LoadForUse(path, file, errors)) {
            return failed;
        }
        const VItem* found = file.Find(item);
        if (found == nullptr) {
            errors << path << ": error: There is no item " << Printable(item) << '\n';
            return failed;
        }
        const VDataValue& value = verified ? found->Verified : found->Current();
        if (value.Empty()) {
            errors << path << ": error: The item has no verified value\n";
            return failed;
        }
        output << (raw ? ::ValueToText(value) : ValueText(value)) << '\n';
        return done;
    }

private:
    std::string path;
    std::string item;
    bool verified = false;
    bool raw = false;
};

} // namespace

std::unique_ptr<ICommand> MakeGetCommand()
{
    return std::make_unique<VGetCommand>();
}

} // namespace QuorixConfig
