#include "ConfigurationFile.h"
#include "ICommand.h"
#include "ItemText.h"

#include <CLI/CLI.hpp>

#include <ostream>

namespace QuorixConfig {

namespace {

/// Returns how many items the first file has alone or with other values, each printed.
std::size_t PrintMissing(const VConfigurationFile& here, const VConfigurationFile& there,
                         const VDataPath& path, char sign, std::ostream& output)
{
    const auto item = here.Items.find(path);
    if (item == here.Items.end()) {
        return 0;
    }
    const auto other = there.Items.find(path);
    if (other != there.Items.end() && other->second == item->second) {
        return 0;
    }
    output << sign << ' ' << Printable(path.Text()) << ": " << Describe(item->second) << '\n';
    // Two formats may give one text: what their documentation says is no difference, a name is.
    if (other != there.Items.end() && Describe(item->second) == Describe(other->second)) {
        output << sign << "   format " << Printable(FormatText(item->second)) << '\n';
    }
    return 1;
}

/// Prints the items that two files do not share.
class VDiffCommand : public ICommand
{
public:
    CLI::App* Declare(CLI::App& application) override
    {
        CLI::App* command = application.add_subcommand(
            "diff", "Prints the items in which two files differ; exit code 1 if there are any");
        command->add_option("A", first, "The first file, - in the output")->required();
        command->add_option("B", second, "The second file, + in the output")->required();
        return command;
    }

    int Run(std::ostream& output, std::ostream& errors) override
    {
        VConfigurationFile a;
        VConfigurationFile b;
        const bool readable = LoadForUse(first, a, errors);
        if (!LoadForUse(second, b, errors) || !readable) {
            return wrongUsage;
        }
        std::set<VDataPath> paths;
        for (const auto* file : {&a, &b}) {
            for (const auto& [path, item] : file->Items) {
                paths.insert(path);
            }
        }
        std::size_t differences = 0;
        for (const VDataPath& path : paths) {
            differences += PrintMissing(a, b, path, '-', output);
            differences += PrintMissing(b, a, path, '+', output);
        }
        return differences == 0 ? done : failed;
    }

private:
    std::string first;
    std::string second;
};

} // namespace

std::unique_ptr<ICommand> MakeDiffCommand()
{
    return std::make_unique<VDiffCommand>();
}

} // namespace QuorixConfig
