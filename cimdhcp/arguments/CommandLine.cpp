#include "arguments/CommandLine.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <map>
#include <memory>
#include <utility>

#include "arguments/HelpFormatter.h"
#include "arguments/OptionGroups.h"
#include "arguments/UnfinishedLine.h"
#include "client/InterfaceState.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/Likeness.h"

namespace cimdhcp {

namespace {

constexpr const char* description =
    "Shows and changes how the network interfaces of this machine use DHCP.\n"
    "The CIM provider of the machine's DHCP clients tells all of it, in this process:\n"
    "no object manager has to be installed or running. With --connect or --hosts,\n"
    "requests go to the WBEM servers of other machines.";

constexpr const char* pathHelp =
    "PATH names an instance as CLASS.KEY=\"VALUE\"[,KEY=\"VALUE\"...]; a namespace and a\n"
    "colon may stand before it. Put it in single quotes for the shell, as in\n"
    "  'QVXZR_DHCPSettingData.InstanceID=\"Computer%eth0\"'";

constexpr const char* footer = R"(
Examples:
  cimdhcp show
  cimdhcp show eth0
  cimdhcp rename eth0 office
  cimdhcp instances QVXZR_DHCPProtocolEndpoint
  cimdhcp get 'QVXZR_DHCPSettingData.InstanceID="Computer%eth0"'
  cimdhcp --format json associators --names 'QVXZR_DHCPCapabilities.InstanceID="eth0"'
  cimdhcp --tree machine.json show
  cimdhcp serve
  cimdhcp user add --users users --modify admin
  cimdhcp --connect https://host.example show
  cimdhcp --hosts hosts --credentials credentials show

Exit status:
  0  done
  1  the request was not fulfilled: a CIM status other than OK (its name is on
     standard error), something named does not exist, a rename was not possible,
     nothing was modified, or the check has found something wrong
  2  the command line cannot be understood
  3  the provider, a directory or a file cannot be loaded or understood, a server
     cannot be reached or understood, or the output cannot be written
  4  some of several servers have failed
  130  interrupted while servers were asked

Schema, registrations and providers are those that are installed with the program,
unless an advanced option or one of the environment variables CIMDHCP_SCHEMA_DIR,
CIMDHCP_REGISTRATION_DIR and CIMDHCP_PROVIDER_DIR names others.

"cimdhcp help COMMAND" explains a command. The options above may stand
before or behind the command.)";

constexpr const char* checkHelp =
    R"(Each line begins with "ok", with "note" (worth a look) or with "BAD" (wrong); an arrow below
it shows the remedy. With --connect or --hosts, what servers respond is checked: that each
class is served, that an instance is the one that was asked for, and that associations
lead somewhere.

Exit status:
  0  nothing is wrong, though there may be notes
  1  something is wrong
  2  the command line cannot be understood
  3  the output cannot be written, or the server cannot be reached or understood)";

std::string showHelp() {
    constexpr std::size_t wordWidth = 11;
    std::string text = "STATE is that of the interface's DHCP client:\n";
    for (const StateWord& each : stateWords) {
        std::string word(each.word);
        word.resize(wordWidth, ' ');
        text += "  " + word + std::string(each.meaning) + '\n';
    }
    return text + R"(
With names of interfaces, each of these is told in detail: its leases, its DHCP endpoint,
its servers, its setting, and what the diagnostics tell of it.

CLIENT is the program that has the lease or asks for one, ADDRESS the IPv4 address or
else that of a DHCPv6 lease, EXPIRES when the lease ends. Of several leases, the table
has one: IPv4 comes first. "-" is what there is not, "?" what is not known; notes on
standard error tell why, and what else is not as it looks. A WBEM server tells neither
clients nor the ends of leases.

With --format json, what there is not and what is not known are null; "unknown" lists
the names of the latter. Moments have "seconds" since 1970 and "time" (UTC), and a lease
without an end has the last second of the year 9999. "leases" has all leases with all
that is known of them; of one that is asked for, the address is null.

Exit status: that of every command; notes do not change it.)";
}

constexpr const char* watchHelp =
    R"(A line has the time (UTC), with several servers the server, the interface, what was and
what is:

  2026-11-20T08:15:30Z  eth0  asking -> bound 192.0.2.17 from 192.0.2.1
  2026-11-20T08:15:30Z  eth0  bound 192.0.2.17 -> 192.0.2.40 from 192.0.2.1
  2026-11-20T08:15:30Z  eth0  bound 192.0.2.17, renewed until 2026-11-20T12:15:30Z

The states are those of "cimdhcp show --help", "absent" for an interface that is not there,
and "none" for no lease of an address family when there is one of the other. Leases of IPv4
and of IPv6 have lines of their own.

With --format json, each line is an object with "time", with several servers "host", and
"interface", "system", "family", "before" and "after"; the latter have "state", "address",
"server", "client" and "expires", and are null for an interface that is not there.

Servers tell of changes by indications: the watch leaves subscriptions in their interop
namespace, for which its user needs the right to write, and listens on a free port of the
address that a server is reached from. What it leaves is removed at its end; what a run left
that was killed, by the next run of the same user.

It ends with Ctrl-C or SIGTERM, and then with exit status 0. A server that does not respond
is told on standard error, and asked again.)";

constexpr const char* describeHelp =
    R"(Of each property: its type, whether it is a key (key) or can be changed (writable), what
it means, and what its values stand for.

With --format json, "class", "superclass", "association", "description" and "properties",
each with "name", "type", "array", "key", "writable", "description" and "values".)";

constexpr const char* profilesHelp =
    R"(The profiles come from the server's interop namespace. INSTANCES is how many instances
conform to a profile; "-" where the server does not tell.

With --format json, "namespace" is the interop namespace, and "profiles" has of each profile
"organization", "name", "version", "id" and "instances"; what is not told is null.)";

constexpr const char* machineGroup = "The machine";
constexpr const char* classGroup = "Classes and instances";
constexpr const char* associationGroup = "Associations";
constexpr const char* serverGroup = "The WBEM server";
constexpr const char* helpGroup = "Help";
constexpr const char* advancedGroup = "Advanced options";

/// Whether an option of the program or of any command takes a value.
bool takesValue(const CLI::App& app, const std::string& option) {
    const CLI::Option* const found = app.get_option_no_throw(option);
    if (found != nullptr && found->get_items_expected_max() > 0) {
        return true;
    }
    const auto commands = app.get_subcommands([](const CLI::App*) { return true; });
    return std::any_of(commands.begin(), commands.end(),
                       [&](const CLI::App* command) { return takesValue(*command, option); });
}

/// Splits "--option=" into the option and an empty value: the parser would take the next
/// argument for the value.
std::vector<std::string> withEmptyValues(const CLI::App& app,
                                         const std::vector<std::string>& arguments) {
    std::vector<std::string> result;
    bool operandsOnly = false;
    for (const std::string& argument : arguments) {
        operandsOnly = operandsOnly || argument == "--";
        const bool noValue =
            argument.starts_with("--") && argument.find('=') + 1 == argument.size();
        const std::string option = argument.substr(0, argument.find('='));
        if (!operandsOnly && noValue && takesValue(app, option)) {
            result.push_back(option);
            result.emplace_back();
        } else {
            result.push_back(argument);
        }
    }
    return result;
}

/// What a person typed, short enough for a message.
std::string excerptOf(const std::string& text) {
    constexpr std::size_t longest = 60;
    return '"' + cutToWidth(printable(text), longest) + '"';
}

std::vector<const CLI::App*> commandsOf(const CLI::App& app) {
    return app.get_subcommands([](const CLI::App* each) { return !each->get_group().empty(); });
}

std::vector<std::string> commandNames(const CLI::App& app) {
    std::vector<std::string> names;
    for (const CLI::App* const each : commandsOf(app)) {
        names.push_back(each->get_name());
    }
    return names;
}

/// The options of the program, and those of the commands that were named.
std::vector<std::string> optionNames(const CLI::App& app) {
    std::vector<std::string> names;
    for (const CLI::Option* const option : app.get_options()) {
        for (const std::string& name : option->get_lnames()) {
            names.push_back("--" + name);
        }
    }
    for (const CLI::App* const command : app.get_subcommands()) {
        for (std::string& name : optionNames(*command)) {
            names.push_back(std::move(name));
        }
    }
    return names;
}

/// The words in their order, the first few of them.
std::string listOf(const std::vector<std::string>& words) {
    constexpr std::size_t mostListed = 4;
    std::string text;
    for (std::size_t index = 0; index < std::min(words.size(), mostListed); ++index) {
        text += (index == 0 ? "" : ", ") + excerptOf(words[index]);
    }
    return text + (words.size() > mostListed
                       ? " and " + std::to_string(words.size() - mostListed) + " more"
                       : "");
}

/// What is read of each command.
struct Records {
    ShowCommand show;
    WatchCommand watch;
    RenameCommand rename;
    GraphCommand graph;
    TreeCommand tree;
    ClassesCommand classes;
    NamesCommand names;
    InstancesCommand instances;
    GetCommand get;
    ModifyCommand modify;
    AssociatorsCommand associators;
    ReferencesCommand references;
    ServeCommand serve;
    UserAddCommand userAdd;
    CheckCommand check;
    ProfilesCommand profiles;
    MetricsCommand metrics;
    ExporterCommand exporter;
    DescribeCommand describe;
    std::vector<std::string> help;
};

}  // namespace

/// The parser, and where it puts what it reads.
class CommandLineReader::Parser {
  public:
    Parser() : app_(description, "cimdhcp") {
        app_.formatter(std::make_shared<HelpFormatter>());
        app_.set_version_flag("-V,--version", "cimdhcp " CIMDHCP_VERSION, "Print the version");
        app_.set_help_flag("-h,--help", "Print this help");
        // Options may stand behind the command, too.
        app_.fallthrough();
        // One at most. read() checks that there is one, for a better message.
        app_.require_subcommand(0, 1);
        addOptions();
        addMachineCommands();
        addInstanceCommands();
        addAssociationCommands();
        addServerCommands();
        addHelp();
        // Commands inherit the footer when they are made: they are made before it.
        app_.footer(std::string(pathHelp) + '\n' + footer);
    }

    [[nodiscard]] const CLI::App& app() const noexcept { return app_; }

    std::variant<CommandLine, Information> read(const std::vector<std::string>& arguments) {
        line_ = {};
        records_ = {};
        if (!arguments.empty() && arguments.front() == completeCommand) {
            // What a person has typed so far may be anything.
            return CommandLine{{}, CompleteCommand{{arguments.begin() + 1, arguments.end()}}};
        }
        try {
            // The parser takes them from the end.
            const std::vector<std::string> whole = withEmptyValues(app_, arguments);
            app_.parse(std::vector<std::string>(whole.rbegin(), whole.rend()));
        } catch (const CLI::CallForHelp&) {
            return Information{app_.help()};
        } catch (const CLI::CallForVersion& version) {
            return Information{std::string(version.what()) + '\n'};
        } catch (const CLI::ParseError& error) {
            refuse(reasonOf(error, arguments));
        }
        if (app_.got_subcommand(help_)) {
            app_.clear();  // the parser would tell the help of the command that was given
            return Information{helpOf(records_.help)};
        }
        if (app_.get_subcommands().empty()) {
            refuse("a command is missing");
        }
        completeCommandLine(line_);
        return line_;
    }

  private:
    [[noreturn]] static void refuse(const std::string& reason) {
        throw Failure(ExitStatus::usage, reason + " (\"cimdhcp --help\" tells more)");
    }

    [[nodiscard]] std::string reasonOf(const CLI::ParseError& error,
                                       const std::vector<std::string>& arguments) const {
        constexpr std::size_t longest = 300;
        const bool extra = dynamic_cast<const CLI::ExtrasError*>(&error) != nullptr;
        const std::vector<std::string> rest =
            extra ? inOrder(app_.remaining(true), arguments) : std::vector<std::string>();
        if (rest.empty()) {
            return cutToWidth(printable(error.what()), longest);
        }
        const auto option = std::find_if(rest.begin(), rest.end(), [](const std::string& each) {
            return each.starts_with('-') && each.size() > 1;
        });
        if (option != rest.end()) {
            const std::string name = option->substr(0, option->find('='));
            return "there is no option " + excerptOf(name) + didYouMean(name, optionNames(app_));
        }
        if (app_.get_subcommands().empty()) {
            return noCommand(app_, rest.front());
        }
        return std::string(rest.size() == 1 ? "one argument" : "arguments") +
               " too many: " + listOf(rest);
    }

    static std::string noCommand(const CLI::App& app, const std::string& name) {
        return "there is no command " + excerptOf(name) + didYouMean(name, commandNames(app));
    }

    /// The words in the order in which they were typed.
    static std::vector<std::string> inOrder(std::vector<std::string> words,
                                            const std::vector<std::string>& arguments) {
        std::stable_sort(words.begin(), words.end(),
                         [&arguments](const std::string& a, const std::string& b) {
                             return std::find(arguments.begin(), arguments.end(), a) <
                                    std::find(arguments.begin(), arguments.end(), b);
                         });
        return words;
    }

    /// The help of the command that the words name, of the program for none.
    [[nodiscard]] std::string helpOf(const std::vector<std::string>& words) const {
        const CLI::App* app = &app_;
        std::string before;
        for (const std::string& word : words) {
            const auto commands = commandsOf(*app);
            const auto found =
                std::find_if(commands.begin(), commands.end(),
                             [&word](const CLI::App* each) { return each->get_name() == word; });
            if (found == commands.end()) {
                refuse(commands.empty() ? "one argument too many: " + excerptOf(word)
                                        : noCommand(*app, word));
            }
            before += (before.empty() ? "" : " ") + app->get_name();
            app = *found;
        }
        return app->help(before);
    }

    void addOptions() {
        app_.add_option("--tree", line_.options.tree,
                        "A JSON tree (-: stdin) in place of the live machine")
            ->type_name("FILE");
        app_.add_option("--data-dir", line_.options.dataDir,
                        "Directory of the ifcfg-INTERFACE files")
            ->type_name("DIR");
        app_.add_option("--namespace", line_.options.nameSpace,
                        "The CIM namespace; root/cimv2 by default")
            ->type_name("NS");
        const std::map<std::string, Format> formats{{"table", Format::table},
                                                    {"tsv", Format::tsv},
                                                    {"mof", Format::mof},
                                                    {"json", Format::json}};
        app_.add_option_function<std::string>(
                "--format",
                [this, formats](const std::string& name) {
                    line_.options.format = formats.at(name);
                },
                "table (the default), tsv, mof or json")
            ->type_name("FORMAT")
            ->check([formats](const std::string& name) {
                return formats.contains(name)
                           ? std::string()
                           : "there is no format \"" + name + "\", only table, tsv, mof and json";
            });
        addRemoteOptions(app_, line_.options);
        addOutputOptions(app_, line_.options);
        app_.add_option("--schema-dir", line_.options.directories.schemaDir,
                        "Directory of the *.mof files")
            ->type_name("DIR")
            ->envname("CIMDHCP_SCHEMA_DIR")
            ->group(advancedGroup);
        app_.add_option("--registration-dir", line_.options.directories.registrationDir,
                        "Directory of the *.registration files")
            ->type_name("DIR")
            ->envname("CIMDHCP_REGISTRATION_DIR")
            ->group(advancedGroup);
        app_.add_option("--provider-dir", line_.options.directories.providerDirs,
                        "Directory of provider libraries; may be repeated")
            ->type_name("DIR")
            ->expected(1)
            ->allow_extra_args(false)
            ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll)
            ->envname("CIMDHCP_PROVIDER_DIR")
            ->group(advancedGroup);
        app_.add_option("--cim-schema", line_.options.directories.cimSchema,
                        "A whole CIM schema in place of the reduced one")
            ->type_name("PATH")
            ->envname("CIMDHCP_CIM_SCHEMA")
            ->group(advancedGroup);
        app_.add_flag("--exact", line_.options.exact,
                      "The exact provider, not the gateway before it")
            ->group(advancedGroup);
    }

    /// A command whose arguments are read into a record of its own.
    template <typename Record>
    CLI::App* command(const char* name, const char* group, const std::string& text,
                      Record& record) {
        CLI::App* const app = app_.add_subcommand(name, text);
        app->group(group);
        app->callback([this, &record] { line_.command = record; });
        return app;
    }

    void addMachineCommands() {
        CLI::App* const show = command(
            "show", machineGroup, "The network interfaces and their DHCP clients", records_.show);
        show->add_option("INTERFACE", records_.show.interfaces,
                         "Interfaces to show in detail, such as eth0");
        show->footer(showHelp());
        addWatch();
        CLI::App* const rename = command(
            "rename", machineGroup, "Change an interface's configuration name", records_.rename);
        rename
            ->add_option("INTERFACE", records_.rename.interfaceName, "The interface, such as eth0")
            ->required();
        rename->add_option("NAME", records_.rename.name, "The new configuration name")->required();
        rename->add_flag("--create", records_.rename.create,
                         "Make the interface's configuration file if there is none");
        rename->add_flag("--force", records_.rename.force,
                         "Change the file even if that does harm to it, or to its readers");
        CLI::App* const graph = command("graph", machineGroup,
                                        "Instances and associations, for Graphviz", records_.graph);
        graph->add_flag("--svg", records_.graph.svg, "Draw it as SVG (needs the package graphviz)");
        CLI::App* const tree = command(
            "tree", machineGroup, "What is known of the machine, as a JSON tree", records_.tree);
        tree->add_flag("--explain", records_.tree.explain,
                       "Add where each property came from, and why that counts");
    }

    void addWatch() {
        CLI::App* const watch =
            command("watch", machineGroup, "Each change of interfaces and leases, as it happens",
                    records_.watch);
        watch->add_option("INTERFACE", records_.watch.interfaces,
                          "Interfaces to watch, such as eth0; all of them by default");
        addWatchOptions(*watch, records_.watch);
        watch->footer(watchHelp);
    }

    void addInstanceCommands() {
        command("classes", classGroup, "The served classes", records_.classes);
        CLI::App* const names =
            command("names", classGroup, "The paths of the instances of a class", records_.names);
        names->add_option("CLASS", records_.names.className, "The class, or a parent of it")
            ->required();
        CLI::App* const instances =
            command("instances", classGroup, "The instances of a class", records_.instances);
        instances->add_option("CLASS", records_.instances.className, "The class, or a parent of it")
            ->required();
        addProperties(*instances, records_.instances.properties);
        CLI::App* const describe = command(
            "describe", classGroup, "What a class and its properties mean", records_.describe);
        describe->add_option("CLASS", records_.describe.className, "The class")->required();
        describe->footer(describeHelp);
        CLI::App* const get = command("get", classGroup, "One instance", records_.get);
        addPath(get, records_.get.path);
        addProperties(*get, records_.get.properties);
        CLI::App* const modify =
            command("modify", classGroup, "Change properties of an instance", records_.modify);
        addPath(modify, records_.modify.path);
        modify
            ->add_option("PROPERTY=VALUE", records_.modify.assignments,
                         "What to change; an array is {VALUE, VALUE...}")
            ->required();
    }

    void addAssociationCommands() {
        CLI::App* const associators =
            command("associators", associationGroup, "What is associated with an instance",
                    records_.associators);
        addPath(associators, records_.associators.path);
        associators->add_flag("--names", records_.associators.names, "Their paths alone");
        addFilter(associators, "--assoc-class", records_.associators.assocClass, "CLASS",
                  "Through associations of this class only");
        addFilter(associators, "--result-class", records_.associators.resultClass, "CLASS",
                  "Instances of this class only");
        addFilter(associators, "--role", records_.associators.role, "PROPERTY",
                  "Only where PATH stands in this reference");
        addFilter(associators, "--result-role", records_.associators.resultRole, "PROPERTY",
                  "Only what stands in this reference");
        CLI::App* const references = command(
            "references", associationGroup, "The associations of an instance", records_.references);
        addPath(references, records_.references.path);
        references->add_flag("--names", records_.references.names, "Their paths alone");
        addFilter(references, "--result-class", records_.references.resultClass, "CLASS",
                  "Associations of this class only");
        addFilter(references, "--role", records_.references.role, "PROPERTY",
                  "Only where PATH stands in this reference");
    }

    void addServerCommands() {
        CLI::App* const serve =
            command("serve", serverGroup, "Serve WBEM clients: CIM-XML over HTTP", records_.serve);
        command("check", serverGroup, "Tell why something is empty or does not work",
                records_.check)
            ->footer(checkHelp);
        command("profiles", serverGroup, "The profiles that a server advertises", records_.profiles)
            ->footer(profilesHelp);
        addServeOptions(*serve, records_.serve);
        CLI::App* const metrics =
            command("metrics", serverGroup, "What Prometheus is told of the machine, once",
                    records_.metrics);
        metrics
            ->add_option("--output", records_.metrics.output,
                         "Replace this file in one step, for node_exporter's textfile collector")
            ->type_name("FILE");
        CLI::App* const exporter =
            command("exporter", serverGroup, "Tell Prometheus of other machines: GET /probe",
                    records_.exporter);
        addExporterOptions(*exporter, records_.exporter);
        CLI::App* const user = app_.add_subcommand("user", "The users of the server");
        user->group(serverGroup)->require_subcommand(1);
        CLI::App* const add = user->add_subcommand(
            "add",
            "Add a user, or change role and password.\nThe password is asked for, or read from "
            "standard input.");
        add->callback([this] { line_.command = records_.userAdd; });
        add->add_option("NAME", records_.userAdd.name, "The user")->required();
        add->add_option("--users", records_.userAdd.users, "The users file; made if there is none")
            ->type_name("FILE")
            ->required();
        add->add_flag("--modify", records_.userAdd.mayModify, "The user may modify, not only read");
    }

    void addHelp() {
        help_ = app_.add_subcommand("help", "Explain the program, or a command");
        help_->group(helpGroup);
        help_->add_option("COMMAND", records_.help, "The command");
    }

    static void addProperties(CLI::App& app, std::vector<std::string>& properties) {
        addList(app, "--properties", properties, "These properties alone, in this order",
                "PROPERTY,...");
    }

    static void addPath(CLI::App* app, std::string& path) {
        app->add_option("PATH", path, "The instance")->required();
        app->footer(pathHelp);
    }

    static void addFilter(CLI::App* app, const char* option, std::optional<std::string>& value,
                          const char* type, const char* text) {
        app->add_option(option, value, text)->type_name(type);
    }

    CommandLine line_;
    Records records_;
    CLI::App app_;
    CLI::App* help_ = nullptr;  // of app_
};

CommandLineReader::CommandLineReader() : parser_(std::make_unique<Parser>()) {}

CommandLineReader::~CommandLineReader() = default;

std::variant<CommandLine, Information> CommandLineReader::read(
    const std::vector<std::string>& arguments) {
    return parser_->read(arguments);
}

UnfinishedLine CommandLineReader::readUnfinished(const std::vector<std::string>& words) {
    UnfinishedLine unfinished = whatIsUnfinished(parser_->app(), words);
    try {
        std::vector<std::string> arguments = unfinished.optionWords;
        arguments.emplace_back("classes");
        unfinished.options = std::get<CommandLine>(parser_->read(arguments)).options;
    } catch (const Failure&) {
        unfinished.options.reset();  // they do not fit together, or are unfinished themselves
    }
    return unfinished;
}

std::variant<CommandLine, Information> readCommandLine(const std::vector<std::string>& arguments) {
    return CommandLineReader().read(arguments);
}

}  // namespace cimdhcp
