#include "Options.h"

#include "QuorixVersion.h"

#include <CLI/CLI.hpp>

#include <charconv>
#include <ostream>

namespace QuorixHost {
namespace {

// A camera costs the host next to nothing, but every one is listed in replies and on the console.
constexpr unsigned maximumCameras = 1000;

// Levels in use end at 6; what lies above them up to here is taken as "everything".
constexpr int maximumLogLevel = 9;

const char* const description =
    "Loads the control stream plug-in and supplies it with a host's services, so that devices can\n"
    "connect to TCP port 803.";

const char* const footer =
    "Console commands, one a line, each answered by one line (ok, ok <JSON> or error: <reason>):\n"
    "  set CLASS ID PARAMETER VALUE        asks for a value, as the host's user would\n"
    "  get CLASS ID PARAMETER              the value that was asked for last, as JSON text\n"
    "  mode N NUMBER                       asks camera N for a greyscale mode by its number\n"
    "  select [N,N,...]                    replaces the camera selection\n"
    "  add N                               a camera appears\n"
    "  remove N                            a camera goes\n"
    "  notify CLASS ID PARAMETER COUNT     fires the parameter's change notification COUNT times\n"
    "  answer ANSWER [remember|forget]     allow, deny or cancel, in the dialog that is open\n"
    "  fire EVENT [NAME=VALUE]...          publishes an event; quotes keep a value's blanks\n"
    "  clock +MS                           moves the clock forward that beats are measured by\n"
    "  state                               the host's state as JSON\n"
    "  locks                               who holds and who waits for the data store, as JSON\n"
    "  quit                                stops the host in order\n"
    "\n"
    "SIGINT and SIGTERM stop the host in order, a second one ends it at once with code 130.\n"
    "Exit codes: 0 stopped in order, 1 could not start, 2 wrong usage, 130 ended by force.";

/// Splits CATEGORY=LEVEL at its last equals sign, since a category is free text.
std::pair<std::string, int> ParseLogLevel(const std::string& text)
{
    const std::size_t equals = text.rfind('=');
    if (equals == std::string::npos || equals == 0) {
        throw CLI::ValidationError("--log", "expected CATEGORY=LEVEL, not '" + text + "'");
    }
    const char* const first = text.data() + equals + 1;
    const char* const last = text.data() + text.size();
    int level = 0;
    const auto [end, error] = std::from_chars(first, last, level);
    if (error != std::errc() || end != last || level < 0 || level > maximumLogLevel) {
        throw CLI::ValidationError("--log", "the level in '" + text +
                                                "' is not a number from 0 to " +
                                                std::to_string(maximumLogLevel));
    }
    return {text.substr(0, equals), level};
}

} // namespace

VCommandLine ParseCommandLine(int argumentCount, const char* const* arguments, std::ostream& output,
                              std::ostream& errors)
{
    VOptions options;
    std::vector<std::string> logLevels;

    const CLI::Validator notEmpty(
        [](const std::string& text) {
            return text.empty() ? std::string("an empty path is given") : std::string();
        },
        "");

    CLI::App application(description, "quorix-host");
    application.footer(footer);
    application.set_version_flag("--version", "quorix-host " QUORIX_VERSION,
                                 "Print the version and exit");
    application
        .add_option("--plugin", options.plugin,
                    "The plug-in's shared library; default: the one built with this host")
        ->type_name("PATH")
        ->check(notEmpty);
    application.add_option("--cameras", options.cameras, "Number of simulated cameras, default 4")
        ->type_name("N")
        ->check(CLI::Range(0U, maximumCameras).description(""));
    application
        .add_flag("--headless", options.headless, "No window; without this a display is needed")
        ->disable_flag_override();
    application
        .add_option("--data", options.dataFolder,
                    "Folder of the host's files, made where it is missing; default: quorix in the "
                    "user's data folder")
        ->type_name("PATH")
        ->check(notEmpty);
    application
        .add_option("--log", logLevels,
                    "Level of a log category, repeatable: 2 errors, 3 warnings, 4 information "
                    "(the default), 6 tracing")
        ->type_name("CATEGORY=LEVEL")
        ->allow_extra_args(false);
    application.add_flag("--console", options.console, "Read commands from standard input")
        ->disable_flag_override();

    try {
        application.parse(argumentCount, arguments);
        for (const std::string& text : logLevels) {
            options.logLevels.push_back(ParseLogLevel(text));
        }
    } catch (const CLI::Success& success) { // help and version
        return {std::nullopt, application.exit(success, output, errors)};
    } catch (const CLI::ParseError& error) {
        application.exit(error, output, errors);
        return {std::nullopt, wrongUsageExitCode};
    }
    return {options, 0};
}

} // namespace QuorixHost
