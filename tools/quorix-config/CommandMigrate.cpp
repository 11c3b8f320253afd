#include "ConfigurationFile.h"
#include "ICommand.h"
#include "ItemText.h"
#include "ItemsDocument.h"
#include "Migration.h"
#include "UtilsFileSystem/ReplaceFile.h"

#include <CLI/CLI.hpp>

#include <cerrno>
#include <optional>
#include <ostream>
#include <sys/stat.h>

namespace QuorixConfig {

namespace {

/// Carries the values of an old file into the schemas of a current one, in a third file.
///
/// Nothing that exists is ever written over, whatever it is and by whatever name: so the input
/// stays, also behind a link.
class VMigrateCommand : public ICommand
{
public:
    CLI::App* Declare(CLI::App& application) override
    {
        CLI::App* command = application.add_subcommand(
            "migrate", "Carries the values of an old file into the schemas of a current one, tells "
                       "what changed, and writes a new file; exit code 1 if an item is left out");
        command
            ->add_option("OLD", oldPath, "The file with the values; it must load without an error")
            ->required();
        command
            ->add_option("CURRENT", currentPath,
                         "A file with every item in its current format; its values do not matter")
            ->required();
        command->add_option("NEW", newPath, "The file to write, which must not exist");
        command->add_flag("--dry-run", dryRun, "Only tells what would be done");
        return command;
    }

    int Run(std::ostream& output, std::ostream& errors) override
    {
        if (newPath.empty() && !dryRun) {
            errors << "quorix-config: NEW is missing (--dry-run needs none)\n";
            return wrongUsage;
        }
        VConfigurationFile old;
        VConfigurationFile current;
        const bool readable = LoadForUse(oldPath, old, errors);
        if (!LoadForUse(currentPath, current, errors) || !readable) {
            return failed;
        }
        const VMigration migration = Migrate(old.Items, current.Items);
        PrintLines(migration, output);
        if (!dryRun) {
            const std::string reason = Write(migration.Items);
            if (!reason.empty()) {
                errors << newPath << ": error: " << reason << '\n';
                return failed;
            }
        }
        return migration.LeftOut == 0 ? done : failed;
    }

private:
    static void PrintLines(const VMigration& migration, std::ostream& output)
    {
        for (const VMigrationLine& line : migration.Lines) {
            output << (line.IsError ? "error: " : "warning: ") << Printable(line.Text) << '\n';
        }
        output << migration.Items.size() << " carried over, " << migration.LeftOut << " left out\n";
    }

    /// @return what is wrong, empty if nothing is
    std::string Write(const ItemMap& items) const
    {
        struct stat status
        {
        };
        if (lstat(newPath.c_str(), &status) == 0 || errno != ENOENT) {
            return "Nothing is written, since there may be a file already";
        }
        if (items.empty()) {
            return "Nothing is written, since nothing was carried over";
        }
        const std::optional<std::string> text = PrintItems(items);
        if (!text) {
            return "Nothing is written, since the items cannot be written without a loss";
        }
        if (stat(oldPath.c_str(), &status) != 0) {
            return "Nothing is written, since the old file has gone";
        }
        // Nobody may read the new file who may not read the old one.
        const mode_t mask = umask(077);
        const bool written = UtilsFileSystem::ReplaceFile(newPath, *text) &&
                             chmod(newPath.c_str(), status.st_mode & 0777) == 0;
        umask(mask);
        return written ? std::string() : "The file cannot be written";
    }

    std::string oldPath;
    std::string currentPath;
    std::string newPath;
    bool dryRun = false;
};

} // namespace

std::unique_ptr<ICommand> MakeMigrateCommand()
{
    return std::make_unique<VMigrateCommand>();
}

} // namespace QuorixConfig
