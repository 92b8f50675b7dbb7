#include "arguments/CommandLine.h"

#include <gtest/gtest.h>

#include <cstdlib>

#include "text/Failure.h"

namespace cimdhcp {
namespace {

class CommandLineText : public ::testing::Test {
  protected:
    void SetUp() override {
        for (const char* name :
             {"CIMDHCP_SCHEMA_DIR", "CIMDHCP_REGISTRATION_DIR", "CIMDHCP_PROVIDER_DIR"}) {
            ::unsetenv(name);
        }
    }

    static CommandLine line(const std::vector<std::string>& arguments) {
        return std::get<CommandLine>(readCommandLine(arguments));
    }

    static std::string information(const std::vector<std::string>& arguments) {
        return std::get<Information>(readCommandLine(arguments)).text;
    }

    static std::string refusal(const std::vector<std::string>& arguments) {
        try {
            static_cast<void>(readCommandLine(arguments));
            return "accepted";
        } catch (const Failure& failure) {
            EXPECT_EQ(failure.status(), ExitStatus::usage);
            return failure.what();
        }
    }
};

TEST_F(CommandLineText, HasDefaults) {
    EXPECT_EQ(line({"show"}), (CommandLine{Options{}, ShowCommand{}}));
    EXPECT_EQ(line({"show"}).options.nameSpace, "root/cimv2");
    EXPECT_EQ(line({"show"}).options.format, Format::table);
}

TEST_F(CommandLineText, TakesAllOptions) {
    Options options;
    options.tree = "t.json";
    options.dataDir = "/data";
    options.nameSpace = "root/other";
    options.format = Format::json;
    options.directories.schemaDir = "/s";
    options.directories.registrationDir = "/r";
    options.directories.providerDirs = {"/p", "/q"};
    options.directories.cimSchema = "/c";
    EXPECT_EQ(line({"--tree", "t.json", "--data-dir", "/data", "--namespace", "/root/other/",
                    "--format", "json", "--schema-dir", "/s", "--registration-dir", "/r",
                    "--provider-dir", "/p", "--provider-dir", "/q", "--cim-schema", "/c", "tree"}),
              (CommandLine{options, TreeCommand{}}));
}

TEST_F(CommandLineText, TakesOptionsBehindTheCommand) {
    EXPECT_EQ(line({"classes", "--format=json"}), line({"--format", "json", "classes"}));
}

TEST_F(CommandLineText, LooksForDirectoriesInTheEnvironment) {
    ::setenv("CIMDHCP_SCHEMA_DIR", "/s", 1);
    ::setenv("CIMDHCP_REGISTRATION_DIR", "/r", 1);
    ::setenv("CIMDHCP_PROVIDER_DIR", "/p", 1);
    const Options options = line({"show", "--provider-dir", "/mine"}).options;
    EXPECT_EQ(options.directories.schemaDir, "/s");
    EXPECT_EQ(options.directories.registrationDir, "/r");
    EXPECT_EQ(options.directories.providerDirs, std::vector<std::string>{"/mine"});
}

TEST_F(CommandLineText, TakesEachCommand) {
    EXPECT_EQ(line({"classes"}).command, Command(ClassesCommand{}));
    EXPECT_EQ(line({"names", "C"}).command, Command(NamesCommand{"C"}));
    EXPECT_EQ(line({"instances", "C"}).command, Command(InstancesCommand{"C"}));
    EXPECT_EQ(line({"get", "C.K=\"v\""}).command, Command(GetCommand{"C.K=\"v\""}));
    EXPECT_EQ(line({"modify", "P", "A=1", "B={1, 2}", "C="}).command,
              Command(ModifyCommand{"P", {"A=1", "B={1, 2}", "C="}}));
    EXPECT_EQ(line({"rename", "eth0", "office"}).command,
              Command(RenameCommand{"eth0", "office", false}));
    EXPECT_EQ(line({"rename", "eth0", "office", "--force"}).command,
              Command(RenameCommand{"eth0", "office", false, true}));
    EXPECT_EQ(line({"rename", "--create", "eth0", "office"}).command,
              Command(RenameCommand{"eth0", "office", true}));
    EXPECT_EQ(line({"associators", "P"}).command,
              Command(AssociatorsCommand{"P", false, {}, {}, {}, {}}));
    EXPECT_EQ(line({"associators", "P", "--names", "--assoc-class", "A", "--result-class", "R",
                    "--role", "X", "--result-role", "Y"})
                  .command,
              Command(AssociatorsCommand{"P", true, "A", "R", "X", "Y"}));
    EXPECT_EQ(line({"references", "P"}).command, Command(ReferencesCommand{"P", false, {}, {}}));
    EXPECT_EQ(line({"references", "--names", "--result-class", "R", "--role", "X", "P"}).command,
              Command(ReferencesCommand{"P", true, "R", "X"}));
}

TEST_F(CommandLineText, TakesArgumentsThatLookLikeCommandsOrOptions) {
    EXPECT_EQ(line({"rename", "show", "tree"}).command,
              Command(RenameCommand{"show", "tree", false}));
    EXPECT_EQ(line({"rename", "eth0", "--", "--create"}).command,
              Command(RenameCommand{"eth0", "--create", false}));
    EXPECT_EQ(line({"rename", "eth0", ""}).command, Command(RenameCommand{"eth0", "", false}));
    EXPECT_EQ(line({"rename", "eth0", "\"quoted\" 'name'"}).command,
              Command(RenameCommand{"eth0", "\"quoted\" 'name'", false}));
}

TEST_F(CommandLineText, AnEmptyValueBehindAnEqualsSignIsNotTheNextArgument) {
    EXPECT_EQ(refusal({"--tree=", "show"}), "--tree needs a name");
    EXPECT_EQ(line({"--provider-dir=", "show"}).options.directories.providerDirs,
              std::vector<std::string>{""});
    EXPECT_EQ(std::get<AssociatorsCommand>(line({"associators", "--role=", "P"}).command).role, "");
    EXPECT_EQ(std::get<GetCommand>(line({"get", "--", "--tree="}).command).path, "--tree=");
}

TEST_F(CommandLineText, ReadsTheCommandsOfTheServer) {
    EXPECT_EQ(line({"serve"}).command, Command(ServeCommand()));
    ServeCommand serve;
    serve.listen = "0.0.0.0:5989";
    serve.tlsCertificate = "c";
    serve.tlsKey = "k";
    serve.users = "u";
    serve.readOnly = true;
    serve.limits.body = 5;
    serve.limits.request = std::chrono::seconds(7);
    serve.limits.sessions.sessions = 9;
    EXPECT_EQ(line({"serve", "--listen", "0.0.0.0:5989", "--tls-cert", "c", "--tls-key", "k",
                    "--users", "u", "--read-only", "--max-body", "5", "--request-timeout", "7",
                    "--max-enumerations", "9"})
                  .command,
              Command(serve));
    EXPECT_EQ(line({"user", "add", "--users", "f", "ada"}).command,
              Command(UserAddCommand{"ada", "f", false}));
    EXPECT_EQ(line({"user", "add", "--modify", "--users", "f", "ada"}).command,
              Command(UserAddCommand{"ada", "f", true}));
    EXPECT_EQ(line({"check"}).command, Command(CheckCommand()));
}

TEST_F(CommandLineText, OneLineLeavesNothingToTheNext) {
    CommandLineReader reader;
    const auto read = [&reader](const std::vector<std::string>& arguments) {
        return std::get<CommandLine>(reader.read(arguments));
    };
    EXPECT_EQ(read({"--connect", "a", "--no-header", "rename", "e", "n"}).options.connect,
              std::vector<std::string>{"a"});
    EXPECT_EQ(read({"rename", "eth0", "office"}), line({"rename", "eth0", "office"}));
    EXPECT_EQ(read({"serve", "--max-body", "5"}), line({"serve", "--max-body", "5"}));
    EXPECT_EQ(read({"serve"}), line({"serve"}));
    EXPECT_THROW(static_cast<void>(reader.read({"--data-dir", "d", "--count", "modify", "P"})),
                 Failure);
    EXPECT_EQ(std::get<Information>(reader.read({"names", "--help"})).text,
              information({"names", "--help"}));
    EXPECT_EQ(read({"modify", "P", "a=1", "b=2"}), line({"modify", "P", "a=1", "b=2"}));
    EXPECT_EQ(read({"show"}), line({"show"}));
}

TEST_F(CommandLineText, ATreeMayBeExplained) {
    EXPECT_EQ(line({"tree"}).command, Command(TreeCommand{false}));
    EXPECT_EQ(line({"tree", "--explain"}).command, Command(TreeCommand{true}));
}

TEST_F(CommandLineText, TellsWhatIsWrong) {
    const std::string hint = " (\"cimdhcp --help\" tells more)";
    EXPECT_EQ(refusal({}), "a command is missing" + hint);
    EXPECT_EQ(refusal({"server"}), "there is no command \"server\"; did you mean serve?" + hint);
    EXPECT_NE(refusal({"user"}), "accepted");
    EXPECT_NE(refusal({"user", "add", "ada"}), "accepted");
    EXPECT_NE(refusal({"serve", "--max-body", "-1"}), "accepted");
    EXPECT_EQ(refusal({"serve", "--max-body", "0"}), "--max-body is 0; it may be 1 to 1073741824");
    EXPECT_NE(refusal({"serve", "--request-timeout", "x"}), "accepted");
    EXPECT_EQ(refusal({"classes", "b", "a"}), "arguments too many: \"b\", \"a\"" + hint);
    EXPECT_EQ(refusal({"get", "P", "x"}), "one argument too many: \"x\"" + hint);
    EXPECT_EQ(refusal({"get", "1", "2", "3", "4", "5", "6", "7"}),
              "arguments too many: \"2\", \"3\", \"4\", \"5\" and 2 more" + hint);
    EXPECT_EQ(refusal({"get", "P", std::string(100, 'x')}),
              "one argument too many: \"" + std::string(59, 'x') + "…\"" + hint);
    EXPECT_EQ(refusal({"--nothing", "x", "show"}), "there is no option \"--nothing\"" + hint);
    EXPECT_EQ(refusal({"show", "--colums", "a"}),
              "there is no option \"--colums\"; did you mean --columns?" + hint);
    EXPECT_EQ(refusal({"serve", "--reed-only"}),
              "there is no option \"--reed-only\"; did you mean --read-only?" + hint);
    EXPECT_EQ(refusal({"shwo"}), "there is no command \"shwo\"; did you mean show?" + hint);
    EXPECT_EQ(refusal({"--columns", "a,,b", "show"}),
              "--columns: a name is empty in \"a,,b\"" + hint);
    EXPECT_EQ(refusal({"--columns", "", "show"}), "--columns: it needs a name" + hint);
    EXPECT_EQ(refusal({"--columns", "a", "check"}),
              "the result of this command has no columns to choose from");
    EXPECT_EQ(refusal({"--columns", "a", "--format", "json", "show"}),
              "--columns is for --format table and tsv");
    EXPECT_EQ(refusal({"--format", "tsv", "rename", "a", "b"}),
              "the result of this command has no columns: it has no tsv output");
    EXPECT_EQ(refusal({"--failed", "f", "show"}),
              "--failed gets servers that failed; name them with --connect or --hosts");
    EXPECT_EQ(refusal({"rename", "eth0"}), "NAME is required" + hint);
    EXPECT_EQ(refusal({"modify", "P"}), "PROPERTY=VALUE is required" + hint);
    EXPECT_EQ(refusal({"--format", "xml", "show"}),
              "--format: there is no format \"xml\", only table, tsv, mof and json" + hint);
    EXPECT_EQ(refusal({"references", "P", "--assoc-class", "A"}),
              "there is no option \"--assoc-class\"" + hint);
    EXPECT_EQ(refusal({"--namespace", "/", "show"}),
              "--namespace needs a name, such as root/cimv2");
    EXPECT_EQ(refusal({"--tree", "", "show"}), "--tree needs a name");
    EXPECT_EQ(refusal({"--data-dir", "", "show"}), "--data-dir needs a name");
}

TEST_F(CommandLineText, ReadsWhatIsLookedAtAndHow) {
    EXPECT_EQ(line({"show", "eth0", "BMC%eth1"}).command,
              Command(ShowCommand{{"eth0", "BMC%eth1"}}));
    EXPECT_EQ(line({"describe", "C"}).command, Command(DescribeCommand{"C"}));
    EXPECT_EQ(line({"instances", "C", "--properties", "A, B,", "--properties=D"}).command,
              Command(InstancesCommand{"C", {"A", "B", "D"}}));
    EXPECT_EQ(line({"get", "P", "--properties", "A"}).command, Command(GetCommand{"P", {"A"}}));
    Options options;
    options.format = Format::tsv;
    options.table.columns = {"state", "address"};
    options.table.wide = options.debug = true;
    options.connect = {"h"};
    options.failed = "f";
    EXPECT_EQ(line({"--format", "tsv", "--columns", "state,address", "--wide", "--debug",
                    "--connect", "h", "--failed", "f", "show"}),
              (CommandLine{options, ShowCommand{}}));
}

TEST_F(CommandLineText, ExplainsAsACommandToo) {
    EXPECT_EQ(information({"help"}), information({"--help"}));
    EXPECT_EQ(information({"help", "show"}), information({"show", "--help"}));
    EXPECT_EQ(information({"help", "user", "add"}), information({"user", "add", "--help"}));
    EXPECT_EQ(information({"-V"}), information({"--version"}));
    const std::string hint = " (\"cimdhcp --help\" tells more)";
    EXPECT_EQ(refusal({"help", "shw"}), "there is no command \"shw\"; did you mean show?" + hint);
    EXPECT_EQ(refusal({"help", "show", "eth0"}), "one argument too many: \"eth0\"" + hint);
}

TEST_F(CommandLineText, LeavesWhatAShellCompletesUnread) {
    EXPECT_EQ(line({"complete", "--nothing", "shwo", "--help"}).command,
              Command(CompleteCommand{{"--nothing", "shwo", "--help"}}));
    EXPECT_EQ(information({"--help"}).find("complete "), std::string::npos);
    CommandLineReader reader;
    const UnfinishedLine unfinished = reader.readUnfinished(
        {"--connect", "h", "--no-header", "get", "--insecure", "P", "--properties=A,B"});
    EXPECT_EQ(unfinished.wanted, UnfinishedLine::Wanted::property);
    EXPECT_EQ(unfinished.fixed, "--properties=A,");
    EXPECT_EQ(unfinished.begun, "B");
    EXPECT_EQ(unfinished.command, "get");
    EXPECT_EQ(unfinished.operands, std::vector<std::string>{"P"});
    ASSERT_TRUE(unfinished.options);
    EXPECT_EQ(unfinished.options->connect, std::vector<std::string>{"h"});
    EXPECT_TRUE(unfinished.options->insecure);
    EXPECT_FALSE(reader.readUnfinished({"--timeout", "x", "show", ""}).options);
    EXPECT_EQ(reader.readUnfinished({}).wanted, UnfinishedLine::Wanted::words);
    EXPECT_EQ(reader.readUnfinished({"get", "--", "--"}).wanted, UnfinishedLine::Wanted::path);
    EXPECT_EQ(reader.readUnfinished({"classes", "x"}).wanted, UnfinishedLine::Wanted::nothing);
}

TEST_F(CommandLineText, HasMofForInstancesAlone) {
    const std::string refused = "this command has no MOF output; use --format table or json";
    for (const auto& command : std::vector<std::vector<std::string>>{
             {"show"}, {"classes"}, {"tree"}, {"rename", "eth0", "x"}, {"serve"}, {"check"}}) {
        auto arguments = command;
        arguments.insert(arguments.begin(), {"--format", "mof"});
        EXPECT_EQ(refusal(arguments), refused) << command.front();
    }
    EXPECT_EQ(line({"--format", "mof", "names", "C"}).options.format, Format::mof);
}

TEST_F(CommandLineText, HelpNamesEveryCommandAndOption) {
    const std::string help = information({"--help"});
    for (const char* text : {"show ",
                             "rename INTERFACE NAME",
                             "tree ",
                             "classes ",
                             "names CLASS",
                             "instances CLASS",
                             "get PATH",
                             "modify PATH PROPERTY=VALUE...",
                             "associators PATH",
                             "references PATH",
                             "serve ",
                             "check ",
                             "user ",
                             "--tree FILE",
                             "--data-dir DIR",
                             "--namespace NS",
                             "--format FORMAT",
                             "--connect URL",
                             "--hosts FILE",
                             "--parallel N",
                             "--timeout SECONDS",
                             "--credentials FILE",
                             "--cacert FILE",
                             "--insecure",
                             "--no-header",
                             "--sort COLUMN",
                             "--count",
                             "--time",
                             "--color WHEN",
                             "--schema-dir DIR",
                             "--registration-dir DIR",
                             "--provider-dir DIR",
                             "--cim-schema PATH",
                             "CIMDHCP_SCHEMA_DIR",
                             "Exit status:",
                             "Examples:"}) {
        EXPECT_NE(help.find(text), std::string::npos) << text;
    }
    EXPECT_EQ(information({"-h"}), help);
}

TEST_F(CommandLineText, HelpOfACommandNamesItsOptions) {
    const std::string help = information({"associators", "--help"});
    EXPECT_EQ(help.substr(0, help.find('\n')), "Usage: cimdhcp associators [OPTIONS] PATH");
    for (const char* text : {"--names", "--assoc-class CLASS", "--result-class CLASS",
                             "--role PROPERTY", "--result-role PROPERTY"}) {
        EXPECT_NE(help.find(text), std::string::npos) << text;
    }
    EXPECT_EQ(information({"references", "--help"}).find("--assoc-class"), std::string::npos);
}

}  // namespace
}  // namespace cimdhcp
