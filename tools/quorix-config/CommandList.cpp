#include "ConfigurationFile.h"
#include "ICommand.h"
#include "ItemText.h"

#include <CLI/CLI.hpp>
#include <nlohmann/json.hpp>

#include <ostream>

namespace QuorixConfig {

namespace {

using VItems = std::vector<std::pair<VDataPath, const VItem*>>;

bool IsBelow(const VDataPath& path, const std::string& parentText)
{
    const std::string text = path.Text();
    return parentText.empty() || text == parentText ||
           text.compare(0, parentText.size() + 1, parentText + ".") == 0;
}

/// Prints each component once, indented below its parent, and the items beside their names.
void PrintTree(const VItems& items, std::ostream& output)
{
    VDataPath last;
    for (const auto& [path, item] : items) {
        for (std::size_t level = path.CommonPrefix(last).Count(); level < path.Count(); ++level) {
            output << std::string(2 * level, ' ') << Printable(std::string(path.Component(level)));
            output << (level + 1 == path.Count() ? ": " + Describe(*item) : std::string()) << '\n';
        }
        last = path;
    }
}

nlohmann::json ToJson(const VItems& items)
{
    nlohmann::json list = nlohmann::json::array();
    for (const auto& [path, item] : items) {
        nlohmann::json entry;
        for (std::size_t index = 0; index < path.Count(); ++index) {
            entry["path"].push_back(std::string(path.Component(index)));
        }
        entry["type"] = TypeName(*item);
        entry["format"] = FormatText(*item);
        if (!item->Proposed.Empty()) {
            entry["proposed"] = ValueText(item->Proposed);
        }
        if (!item->Verified.Empty()) {
            entry["verified"] = ValueText(item->Verified);
        }
        list.push_back(entry);
    }
    return list;
}

/// Prints the items of a file.
class VListCommand : public ICommand
{
public:
    CLI::App* Declare(CLI::App& application) override
    {
        CLI::App* command =
            application.add_subcommand("list", "Prints the items of a file as a tree");
        command->add_option("FILE", path, "The file")->required();
        command->add_option("PATH", parent, "Only this item and what lies below it");
        command->add_flag("--json", json,
                          "One array of objects: path, type, format, proposed, verified");
        return command;
    }

    int Run(std::ostream& output, std::ostream& errors) override
    {
        VConfigurationFile file;
        if (!LoadForUse(path, file, errors)) {
            return failed;
        }
        VItems items;
        for (const auto& [itemPath, item] : file.Items) {
            if (IsBelow(itemPath, parent)) {
                items.emplace_back(itemPath, &item);
            }
        }
        if (items.empty() && !parent.empty()) {
            errors << path << ": error: There is nothing at or below " << Printable(parent) << '\n';
            return failed;
        }
        if (json) {
            // A name may hold any bytes; JSON has room for UTF-8 only.
            output << ToJson(items).dump(2, ' ', false, nlohmann::json::error_handler_t::replace)
                   << '\n';
        } else {
            PrintTree(items, output);
        }
        return done;
    }

private:
    std::string path;
    std::string parent;
    bool json = false;
};

} // namespace

std::unique_ptr<ICommand> MakeListCommand()
{
    return std::make_unique<VListCommand>();
}

} // namespace QuorixConfig
