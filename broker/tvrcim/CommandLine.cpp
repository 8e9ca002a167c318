#include "broker/tvrcim/CommandLine.h"

#include <CLI/CLI.hpp>

#include <map>

namespace tvrcim
{

namespace
{

/// Options of a subcommand, read into one command.
class CommandOptions
{
public:
    CommandOptions(CLI::App& app, Command& command) : _app(app), _command(command) {}

    /// Starts a subcommand; the functions below add to it.
    CommandOptions& add(const char* name, const char* help)
    {
        _current = _app.add_subcommand(name, help);
        _current->callback([this, name] { _command.name = name; });
        return *this;
    }
    CommandOptions& className()
    {
        _current->add_option("CLASS", _command.target, "name of a class")->required();
        return *this;
    }
    CommandOptions& path()
    {
        _current
            ->add_option("PATH", _command.target,
                         "Class.key=\"value\",...; keys that the others settle may be left out")
            ->required();
        return *this;
    }
    CommandOptions& names()
    {
        _current->add_flag("--names", _command.names, "print paths only");
        return *this;
    }
    CommandOptions& properties()
    {
        _current->add_option("--properties", _properties, "names of the properties to show, between commas")
            ->delimiter(',');
        return *this;
    }
    CommandOptions& assignments(bool required)
    {
        _current
            ->add_option("ASSIGNMENTS", _command.assignments,
                         "name=value; arrays as [a,b], null for none, @FILE for the bytes of a file")
            ->required(required);
        return *this;
    }
    CommandOptions& method(bool required)
    {
        _current->add_option("METHOD", _command.method, "name of a method")->required(required);
        return *this;
    }
    /// Of a port's dumps; without one of these a dump is made.
    CommandOptions& dumps()
    {
        _current->add_option("PORT", _command.target, "WWPN of a port, with or without colons")->required();
        CLI::Option* list = _current->add_flag("--list", _command.list, "only list the dump files");
        CLI::Option* deletes = _current->add_flag("--delete", _command.deletes, "delete the dump files");
        CLI::Option* keep = _current->add_option("--keep", _command.keep, "keep so many dump files");
        list->excludes(deletes)->excludes(keep);
        deletes->excludes(keep);
        return *this;
    }
    CommandOptions& all(const char* help)
    {
        _current->add_flag("--all", _command.all, help);
        return *this;
    }
    CommandOptions& output(const char* help)
    {
        _current->add_option("--output", _command.output, help);
        return *this;
    }
    CommandOptions& log()
    {
        CLI::Option* driver =
            _current->add_flag("--driver", _command.driver,
                               "what the kernel driver wrote to the system log; enables this log, and "
                               "with it the logging of the provider");
        _current->add_flag("--follow", _command.follow, "go on with what comes later");
        _current->add_option("--level", _command.level, "1 for critical messages, 2 for warnings too, 3 for all")
            ->check(CLI::Range(1, 3))
            ->excludes(driver);
        return *this;
    }
    /// A test of a port; without them all are listed.
    CommandOptions& test()
    {
        CLI::Option* port = _current->add_option("PORT", _command.target, "WWPN of a port, with or without colons");
        CLI::Option* test = _current->add_option(
            "TEST", _command.test, "name of a test, such as echo or dport, or how it begins; none lists the tests");
        port->needs(test);
        _current->add_option("SETTINGS", _command.assignments,
                             "name=value of TVRHBA_FCHBADiagnosticSettingData, such as TargetDevice=WWPN");
        return *this;
    }
    CommandOptions& port()
    {
        _current->add_option("--listen", _command.listen, "address and port")->default_str("127.0.0.1:5988");
        _current->add_option("--tls", _command.tls, "files of a certificate and of its key, both PEM")
            ->expected(2)
            ->check(CLI::ExistingFile);
        _current->add_option("--patience", _command.patience, "seconds that a client may stand still in a request")
            ->default_val(_command.patience)
            ->check(CLI::Range(1, 3600));
        _current->add_option("--users", _command.users, "file of lines name:hash; 'openssl passwd -6' prints the hash")
            ->check(CLI::ExistingFile);
        return *this;
    }
    CommandOptions& associationClass(const char* option)
    {
        _current->add_option(option, _command.filter.assocClass, "association class");
        _current->add_option("--role", _command.filter.role, "reference that holds PATH");
        return *this;
    }
    CommandOptions& farEnd()
    {
        _current->add_option("--result-class", _command.filter.resultClass, "class of what is at the other end");
        _current->add_option("--result-role", _command.filter.resultRole, "reference that holds the other end");
        return *this;
    }

    /// After parsing.
    void finish()
    {
        if (!_properties.empty())
            _command.properties = _properties;
    }

private:
    CLI::App& _app;
    Command& _command;
    CLI::App* _current = nullptr;
    std::vector<std::string> _properties;
};

void addCommands(CommandOptions& options)
{
    options.add("classes", "list the classes that the module serves").all("list all classes of its repository");
    options.add("class", "show the definition of a class").className();
    options.add("methods", "show parameters and values of a class's methods").className().method(false);
    options.add("enum", "show the instances of a class and its subclasses").className().names().properties();
    options.add("get", "show one instance").path().properties();
    options.add("assoc", "show what associations join to an instance")
        .path()
        .names()
        .properties()
        .associationClass("--class")
        .farEnd();
    options.add("refs", "show the associations that refer to an instance")
        .path()
        .names()
        .properties()
        .associationClass("--class,--result-class");
    options.add("set", "change properties of an instance").path().assignments(true);
    options.add("create", "create an instance").className().assignments(false);
    options.add("delete", "delete an instance").path();
    options.add("call", "call a method; 'methods CLASS' shows what it takes").path().method(true).assignments(false);
    options.add("host", "show the host, its adapters and what they reach as a tree")
        .all("list each target and unit, however many");
    options.add("dump", "have a port make a dump, and list its dump files").dumps();
    options.add("topology", "draw cards, ports, targets and units as a graph for graphviz")
        .all("draw each target and unit, however many")
        .output("write FILE.dot, or a picture FILE.svg, .png or .pdf by graphviz");
    options
        .add("log", "show errors and warnings of the provider, the newest last; where its log in memory is off, this "
                    "switches it on beside its file, starts the provider anew, and leaves the log on")
        .log();
    options
        .add("diag", "run a diagnostic test of a port and tell how it ended; exits with 5 when it did not pass. SIGINT "
                     "cancels a D-Port test and waits for its end")
        .test();
    options.add("check", "tell what of libraries, module, settings, logs and CIM servers is there, what is missing and "
                         "what to do about it; exits with 7 where something is missing or wrong");
    options
        .add("serve",
             "answer CIM clients, browsers and monitoring over HTTP until SIGINT or SIGTERM; other hosts need --tls "
             "and --users")
        .port();
}

std::vector<std::string> serverNames()
{
    std::vector<std::string> names;
    for (const broker::Personality& personality : broker::personalities)
        names.emplace_back(personality.name);
    return names;
}

} // namespace

CommandLine parseCommandLine(int argc, const char* const* argv)
{
    CommandLine line;
    Settings& settings = line.settings;
    CLI::App app("A CIM broker for one machine, with the Fibre Channel provider inside it.", "tvrcim");
    app.add_option("--module", settings.module, "provider module to load");
    CLI::Option* scenario = app.add_option("--scenario", settings.scenario, "scenario file of the simulated host")
                                ->check(CLI::ExistingFile);
    app.add_flag("--hardware", settings.hardware, "use the adapters of this machine, not the simulator")
        ->excludes(scenario);
    app.add_option("--platform", settings.platform, "file with instances of the platform's classes")
        ->check(CLI::ExistingFile);
    app.add_option("--namespace", settings.nameSpace, "namespace of classes and paths")->capture_default_str();
    const std::map<std::string, Format> formats{{"table", Format::table}, {"json", Format::json}, {"mof", Format::mof}};
    app.add_option("--format", settings.format, "table, json or mof")->transform(CLI::Transformer(formats));
    const auto play = [&settings](const std::string& name) { settings.personality = *broker::findPersonality(name); };
    app.add_option_function<std::string>("--server", play, "CIM server to play: strict, small-footprint or open-group")
        ->check(CLI::IsMember(serverNames()));
    app.fallthrough();
    app.require_subcommand(1);
    CommandOptions options(app, settings.command);
    addCommands(options);
    try
    {
        app.parse(argc, argv);
        options.finish();
    }
    catch (const CLI::ParseError& error)
    {
        line.proceed = false;
        line.exitCode = app.exit(error) == 0 ? 0 : exitUsage;
    }
    return line;
}

} // namespace tvrcim
