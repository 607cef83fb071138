#include "apps/vexo/CommandLine.h"

#include <CLI/CLI.hpp>
#include <charconv>
#include <cmath>
#include <filesystem>
#include <iostream>

#include "apps/vexo/Commands.h"
#include "apps/vexo/Departure.h"
#include "apps/vexo/Paths.h"
#include "apps/vexo/Progress.h"
#include "apps/vexo/Terminal.h"

namespace vexo {
namespace {

constexpr int statusDone = 0;
constexpr int statusFailed = 1;
constexpr int statusWrongLine = 2;

struct Arguments {
    std::vector<std::string> plugins;
    std::optional<std::string> home;
    bool quiet = false;
    bool verbose = false;
    bool json = false;
    TreeOptions tree;
    std::optional<double> watchSeconds;
    std::vector<std::string> files;
    std::string expression;
    std::vector<std::string> folders;
    bool watchesQuery = false;
    MenuOptions menu;
    std::optional<std::string> menuEntry;
    CopyOptions copy;
    OverlayOptions overlay;
    std::string overlaySize;
    std::string overlayScale = "1";
    std::string demoFolder;
};

// What a command needs to be there before it runs.
enum class Needs { plugins, hostAlone };

// A command that needs a host. Those that don't are kept apart.
struct HostCommand {
    Needs needs;
    std::function<Problems(Host&)> run;
    HostOptions options = {};  // of a command that stays
};

struct Parser {
    explicit Parser(Arguments& arguments);

    CLI::App app;
    std::optional<HostCommand> hostCommand;  // the command that was named, if it needs a host
    std::function<Problems()> plainCommand;  // else

  private:
    void addTree(Arguments& arguments);
    void addWatch(Arguments& arguments);
    void addInfo(Arguments& arguments);
    void addLocations(Arguments& arguments);
    void addMetadata(Arguments& arguments);
    void addQuery(Arguments& arguments);
    void addMenu(Arguments& arguments);
    void addCopy(Arguments& arguments);
    void addOverlay(Arguments& arguments);
    void addDemo(Arguments& arguments);
    CLI::App* addCommand(const std::string& name, const std::string& summary);
};

OutputFormat format(const Arguments& arguments) {
    return arguments.json ? OutputFormat::json : OutputFormat::text;
}

WatchOptions watchOptions(const Arguments& arguments) {
    WatchOptions options{format(arguments), std::nullopt};
    if (arguments.watchSeconds)
        options.time = std::chrono::duration<double>(*arguments.watchSeconds);
    return options;
}

// Empty for a number of levels, else what is wrong with the text.
std::string wholeNumber(const std::string& text) {
    int number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    const bool isWhole = error == std::errc() && end == text.data() + text.size() && number >= 0;
    return isWhole ? "" : "'" + text + "' is no whole number from 0 up";
}

// A number with or without decimals; nil for any other text and for what is not finite.
std::optional<double> finiteNumber(std::string_view text) {
    double number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    const bool isNumber = error == std::errc() && end == text.data() + text.size() && std::isfinite(number);
    return isNumber ? std::optional(number) : std::nullopt;
}

// The same for a length of time, with or without decimals.
std::string numberOfSeconds(const std::string& text) {
    return finiteNumber(text).value_or(-1) >= 0 ? "" : "'" + text + "' is no number of seconds";
}

// The same for the number of an entry. Any number will do: whether there is such an entry is seen later.
std::string entryNumber(const std::string& text) {
    const std::string digits = text.starts_with('-') ? text.substr(1) : text;
    const bool isNumber = !digits.empty() && digits.find_first_not_of("0123456789") == std::string::npos;
    return isNumber ? "" : "'" + text + "' is no number of an entry";
}

// 0, which no entry has, for a number beyond the type. Requires: the text is such a number.
int entryWithNumber(const std::string& text) {
    int number = 0;
    std::from_chars(text.data(), text.data() + text.size(), number);
    return number;
}

// "80x60.5" is a size, and so are those without an area.
std::optional<platform::Size> sizeInPoints(std::string_view text) {
    const std::size_t cross = text.find('x');
    if (cross == std::string_view::npos)
        return std::nullopt;
    const auto width = finiteNumber(text.substr(0, cross));
    const auto height = finiteNumber(text.substr(cross + 1));
    return width && height ? std::optional(platform::Size{*width, *height}) : std::nullopt;
}

// The same for a size.
std::string size(const std::string& text) {
    return sizeInPoints(text) ? "" : "'" + text + "' is no size; give width and height, 128x72 say";
}

// The same for a scale.
std::string scale(const std::string& text) {
    return finiteNumber(text).value_or(0) > 0 ? "" : "'" + text + "' is no scale; give a number above 0";
}

// The same for a query.
std::string queryExpression(const std::string& text) {
    const auto result = QueryExpression::parse(text);
    const auto* error = std::get_if<QuerySyntaxError>(&result);
    return error ? error->description() : "";
}

// For an option of several values. By itself it takes a value in square brackets, as a folder may be named,
// for a list of its own.
void takeLiterally(CLI::Option* option) {
    constexpr int mostValues = 1 << 20;
    option->expected(1, mostValues)->allow_extra_args(false);
}

// Options of which exactly one is to be given.
void requireOneOf(const CLI::Option& one, const CLI::Option& other) {
    if (one.empty() == other.empty())
        throw CLI::RequiredError("exactly one of " + one.get_name() + " and " + other.get_name());
}

Parser::Parser(Arguments& arguments)
    : app("Browses the libraries of the video editor Reelix without the editor.", "vexo") {
    app.require_subcommand(0, 1);
    app.fallthrough();
    app.set_version_flag("--version", "vexo " VEXO_VERSION);
    app.footer("Run 'vexo COMMAND --help' for the options of a command, 'man vexo' for the whole story.");
    app.add_option("--plugin", arguments.plugins,
                   "Load this plug-in bundle instead of those found; may be repeated")
        ->option_text("BUNDLE")
        ->allow_extra_args(false);
    app.add_option("--home", arguments.home, "Browse this home folder")->option_text("DIR");
    auto* quiet = app.add_flag("--quiet", arguments.quiet, "Print nothing but errors on standard error");
    app.add_flag("--verbose", arguments.verbose, "Print the host's log on standard error")->excludes(quiet);

    addTree(arguments);
    addWatch(arguments);
    addInfo(arguments);
    addLocations(arguments);
    addMetadata(arguments);
    addQuery(arguments);
    addMenu(arguments);
    addCopy(arguments);
    addOverlay(arguments);
    addDemo(arguments);
}

void Parser::addTree(Arguments& arguments) {
    CLI::App* tree = addCommand("tree", "Print the tree of projects and events");
    tree->add_flag("--json", arguments.json, "Print JSON");
    tree->add_flag("--metadata", arguments.tree.withMetadata,
                   "Read every movie's duration, size and properties");
    tree->add_option("--depth", arguments.tree.depth, "Levels below the root; 0 is the root alone")
        ->option_text("N")
        ->check(wholeNumber);
    tree->callback([this, &arguments] {
        arguments.tree.format = format(arguments);
        hostCommand = {Needs::plugins,
                       [&arguments](Host& host) { return runTree(host, arguments.tree, std::cout); }};
    });
}

void Parser::addWatch(Arguments& arguments) {
    CLI::App* watch = addCommand("watch", "Print the tree, and stay and print each new one");
    watch->add_flag("--json", arguments.json, "Print one JSON document a line");
    watch->add_option("--for", arguments.watchSeconds, "Stay no longer than this; 0 for the first tree alone")
        ->option_text("SECONDS")
        ->check(numberOfSeconds);
    watch->callback([this, &arguments] {
        hostCommand = {
            Needs::plugins,
            [&arguments](Host& host) { return runWatch(host, watchOptions(arguments), std::cout); },
            {.prefetchesMetadata = true, .followsChanges = true}};
    });
}

void Parser::addInfo(Arguments& arguments) {
    CLI::App* info = addCommand("info", "Print the plug-ins found and what they say of themselves");
    info->add_flag("--json", arguments.json, "Print JSON");
    info->callback([this, &arguments] {
        hostCommand = {Needs::plugins, [&arguments](Host& host) {
                           return runInfo(host, {format(arguments), arguments.verbose}, std::cout);
                       }};
    });
}

void Parser::addLocations(Arguments& arguments) {
    CLI::App* locations = addCommand("locations", "Print every folder that is looked at for libraries");
    locations->add_flag("--json", arguments.json, "Print JSON");
    locations->callback([this, &arguments] {
        hostCommand = {Needs::plugins,
                       [&arguments](Host& host) { return runLocations(host, format(arguments), std::cout); },
                       {.followsChanges = true}};
    });
}

void Parser::addMetadata(Arguments& arguments) {
    CLI::App* metadata =
        addCommand("metadata", "Print what is known of files: size, duration, type and more");
    metadata->add_flag("--json", arguments.json, "Print JSON");
    metadata->add_option("FILE", arguments.files, "The files; movies as a rule")->required();
    metadata->callback([this, &arguments] {
        hostCommand = {Needs::hostAlone, [&arguments](Host& host) {
                           return runMetadata(host, arguments.files, format(arguments), std::cout);
                       }};
    });
}

void Parser::addQuery(Arguments& arguments) {
    CLI::App* query = addCommand("query", "Print the files whose metadata an expression means");
    query->add_flag("--json", arguments.json, "Print JSON, one document a line");
    query->add_flag("--watch", arguments.watchesQuery, "Stay, and print the results after each change");
    query->add_option("EXPRESSION", arguments.expression, "What is asked, \"kMDItemPixelWidth >= 1920\" say")
        ->required()
        ->check(queryExpression);
    takeLiterally(query->add_option("--in", arguments.folders, "The folders to look through")
                      ->option_text("DIR... REQUIRED")
                      ->required());
    query->callback([this, &arguments] {
        const auto expression = QueryExpression::parse(arguments.expression);
        hostCommand = {Needs::hostAlone,
                       [&arguments, expression](Host& host) {
                           return runQuery(host,
                                           {format(arguments), std::get<QueryExpression>(expression),
                                            arguments.folders, arguments.watchesQuery},
                                           std::cout);
                       },
                       {.followsChanges = arguments.watchesQuery}};
    });
}

void Parser::addMenu(Arguments& arguments) {
    CLI::App* menu =
        addCommand("menu", "Print the menu of an item or a group, or perform one of its entries");
    menu->add_flag("--json", arguments.json, "Print JSON");
    CLI::Option* object =
        menu->add_option("--object", arguments.menu.object, "The item, by its ID or URL")->option_text("ID");
    CLI::Option* group =
        menu->add_option("--group", arguments.menu.group, "The group, by its ID or URL")->option_text("ID");
    menu->add_option("--choose", arguments.menuEntry, "Perform this entry, from 1, and print nothing")
        ->option_text("N")
        ->check(entryNumber);
    menu->callback([this, &arguments, object, group] {
        requireOneOf(*object, *group);
        arguments.menu.format = format(arguments);
        if (arguments.menuEntry)
            arguments.menu.chosenEntry = entryWithNumber(*arguments.menuEntry);
        hostCommand = {Needs::plugins,
                       [&arguments](Host& host) { return runMenu(host, arguments.menu, std::cout); }};
    });
}

void Parser::addCopy(Arguments& arguments) {
    CLI::App* copy = addCommand("copy", "Print what a copy of items or groups puts on the pasteboard");
    CLI::Option* json = copy->add_flag("--json", arguments.json, "Print JSON");
    CLI::Option* objects =
        copy->add_option("--object", arguments.copy.objects, "The items, by their IDs or URLs")
            ->option_text("ID...");
    CLI::Option* groups =
        copy->add_option("--group", arguments.copy.groups, "The groups, by their IDs or URLs")
            ->option_text("ID...");
    takeLiterally(objects);
    takeLiterally(groups);
    copy->add_option("--type", arguments.copy.type, "Write the bytes of this type alone")
        ->option_text("TYPE")
        ->excludes(json);
    copy->add_option("-o", arguments.copy.outputFile, "Write into this file")->option_text("FILE");
    copy->callback([this, &arguments, objects, groups] {
        requireOneOf(*objects, *groups);
        arguments.copy.format = format(arguments);
        hostCommand = {Needs::plugins,
                       [&arguments](Host& host) { return runCopy(host, arguments.copy, std::cout); }};
    });
}

void Parser::addOverlay(Arguments& arguments) {
    CLI::App* overlay = addCommand("overlay", "Draw what lies over the thumbnail of an item, as PNG");
    overlay->add_option("--object", arguments.overlay.object, "The item, by its ID or URL")
        ->option_text("ID REQUIRED")
        ->required();
    overlay->add_option("--size", arguments.overlaySize, "The thumbnail's width and height in points")
        ->option_text("WxH REQUIRED")
        ->required()
        ->check(size);
    overlay->add_option("--scale", arguments.overlayScale, "Pixels a point, 1 unless given")
        ->option_text("S")
        ->check(scale);
    overlay->add_option("-o", arguments.overlay.outputFile, "The file to write")
        ->option_text("FILE.png REQUIRED")
        ->required();
    overlay->callback([this, &arguments] {
        arguments.overlay.size = sizeInPoints(arguments.overlaySize).value();
        arguments.overlay.scale = finiteNumber(arguments.overlayScale).value();
        hostCommand = {Needs::plugins,
                       [&arguments](Host& host) { return runOverlay(host, arguments.overlay); }};
    });
}

void Parser::addDemo(Arguments& arguments) {
    CLI::App* demo = addCommand("demo", "Make a small, complete sample home with real movies");
    demo->add_option("DIR", arguments.demoFolder, "The folder to make; must not exist or be empty")
        ->required();
    demo->callback([this, &arguments] {
        plainCommand = [&arguments] { return runDemo(arguments.demoFolder, std::cout); };
    });
}

CLI::App* Parser::addCommand(const std::string& name, const std::string& summary) {
    return app.add_subcommand(name, summary)->fallthrough();
}

void report(const std::string& problem) {
    std::cerr << "vexo: " << printable(problem) << std::endl;
}

int refuse(const std::string& problem) {
    report(problem);
    return statusWrongLine;
}

Problem checkHome(Arguments& arguments) {
    if (!arguments.home)
        return std::nullopt;
    const std::string home = absolutePath(*arguments.home);
    std::error_code error;
    if (!std::filesystem::is_directory(home, error))
        return "there is no home folder '" + *arguments.home + "'; give an existing folder to --home";
    arguments.home = home;
    return std::nullopt;
}

Problem loadPlugins(Host& host) {
    if (Problem problem = host.loadPlugins())
        return problem;
    if (host.plugins().empty())
        return "no plug-in was found; name one with --plugin BUNDLE, or its folder in VEXO_PLUGIN_PATH";
    return std::nullopt;
}

// Tells what went wrong, and answers the status for it.
int conclude(Problems problems) {
    if (!std::cout.flush())
        problems.push_back("the answer cannot be written to standard output");
    for (const std::string& problem : problems)
        report(problem);
    return problems.empty() ? statusDone : statusFailed;
}

// What the command raises is told like its other problems: before the end of the host, which may be the last
// that is heard of the program.
Problems run(const HostCommand& command, Host& host) {
    try {
        const Problem problem = command.needs == Needs::plugins ? loadPlugins(host) : std::nullopt;
        return problem ? Problems{*problem} : command.run(host);
    } catch (const std::exception& error) {
        return {error.what()};
    }
}

// Keeps the plug-ins' trees until the process ends, which gives their memory back at once: freed item by
// item, a large library's takes a tenth of the time of the whole command.
void keepTrees(const Host& host) {
    static auto& trees = *new std::vector<VXMediaGroupRef>;
    for (const LoadedPlugin& plugin : host.plugins())
        trees.push_back(plugin.manager->rootMediaGroup());
}

int runWithHost(const HostCommand& command, Arguments& arguments) {
    if (const Problem problem = checkHome(arguments))
        return conclude({*problem});
    HostOptions options = command.options;
    options.homeDirectory = arguments.home;
    options.pluginBundles = arguments.plugins;
    options.verbosity = arguments.verbose ? Verbosity::verbose : Verbosity::normal;
    Departure departure;  // of the host as well
    Host host(options);
    const DepartureAtEnd departureOfHost(departure);
    const auto warningOwner = std::make_shared<int>();
    // A verbose host's log shows warnings already.
    if (!arguments.quiet && !arguments.verbose)
        host.diagnostics().addWarningObserver(warningOwner, showWarning);
    const int status = conclude(run(command, host));
    keepTrees(host);
    return status;
}

}  // namespace

int runCommandLine(int argc, char** argv) {
    Arguments arguments;
    Parser parser(arguments);
    try {
        parser.app.parse(argc, argv);
    } catch (const CLI::Success& answer) {  // --help and --version
        return parser.app.exit(answer);
    } catch (const CLI::ExtrasError&) {
        const std::vector<std::string> unknown = parser.app.remaining(/*recurse=*/true);
        return refuse("'" + unknown.front() +
                      "' is no option or command that belongs here; try 'vexo --help'");
    } catch (const CLI::ParseError& error) {
        return refuse(std::string(error.what()) + "; try 'vexo --help'");
    }

    if (!parser.hostCommand && !parser.plainCommand)
        return refuse("no command was given; try 'vexo --help'");
    if (parser.hostCommand)
        return runWithHost(*parser.hostCommand, arguments);
    return conclude(parser.plainCommand());
}

}  // namespace vexo
