#pragma once

#include <chrono>
#include <cstddef>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "indications/SubscriptionSettings.h"
#include "text/Presentation.h"
#include "wbem/Limits.h"

namespace cimdhcp {

/// Where the schema, the registrations and the providers are, if not in the installation.
struct DirectoryOptions {
    std::optional<std::string> schemaDir;
    std::optional<std::string> registrationDir;
    std::vector<std::string> providerDirs;  ///< searched in this order
    std::optional<std::string> cimSchema;   ///< a whole CIM schema: its file or directory

    bool operator==(const DirectoryOptions&) const = default;
};

/// What tables look like.
struct TableOptions {
    bool noHeader = false;
    bool wide = false;                 ///< as wide as they are, on a terminal, too
    std::vector<std::string> columns;  ///< these, in this order; none: all

    bool operator==(const TableOptions&) const = default;
};

/// What holds for every command.
struct Options {
    std::optional<std::string> tree;     ///< a JSON tree in place of the live machine
    std::optional<std::string> dataDir;  ///< where the ifcfg- files are
    std::string nameSpace = "root/cimv2";
    Format format = Format::table;
    DirectoryOptions directories;
    bool exact = false;  ///< the exact provider, without the gateway in front of it
    bool debug = false;  ///< JSON with what helps to debug a provider

    // The servers that are asked in place of the object manager of this process.
    std::vector<std::string> connect;  ///< URLs or hosts
    std::optional<std::string> hosts;  ///< a file of them; "-": standard input
    std::size_t parallel = 64;         ///< how many servers are asked at the same time
    std::chrono::seconds timeout{30};  ///< for all that is asked of one server
    std::optional<std::string> caCertificate;
    bool insecure = false;
    std::optional<std::string> credentials;
    std::optional<std::string> failed;  ///< a file that gets the servers that failed

    // How the result is shown.
    TableOptions table;
    std::optional<std::string> sort;
    bool count = false;
    bool time = false;
    ColorMode color = ColorMode::automatic;

    [[nodiscard]] bool remote() const noexcept { return !connect.empty() || hosts; }

    bool operator==(const Options&) const = default;
};

struct ShowCommand {
    std::vector<std::string> interfaces{};  ///< these in detail; none: all at a glance

    bool operator==(const ShowCommand&) const = default;
};
struct WatchCommand {
    std::vector<std::string> interfaces;       ///< names; none: all
    std::optional<std::chrono::seconds> poll;  ///< look so often, without being told of changes
    std::optional<std::string> listen;         ///< the address where servers tell of changes

    bool operator==(const WatchCommand&) const = default;
};
struct ProfilesCommand {
    bool operator==(const ProfilesCommand&) const = default;
};
struct RenameCommand {
    std::string interfaceName;
    std::string name;
    bool create = false;
    bool force = false;  ///< whatever it does to the file

    bool operator==(const RenameCommand&) const = default;
};
struct GraphCommand {
    bool svg = false;  ///< draw it

    bool operator==(const GraphCommand&) const = default;
};
struct TreeCommand {
    bool explain = false;

    bool operator==(const TreeCommand&) const = default;
};
struct ClassesCommand {
    bool operator==(const ClassesCommand&) const = default;
};
struct DescribeCommand {
    std::string className;

    bool operator==(const DescribeCommand&) const = default;
};
struct NamesCommand {
    std::string className;

    bool operator==(const NamesCommand&) const = default;
};
struct InstancesCommand {
    std::string className;
    std::vector<std::string> properties{};  ///< these alone; none: all

    bool operator==(const InstancesCommand&) const = default;
};
struct GetCommand {
    std::string path;
    std::vector<std::string> properties{};  ///< these alone; none: all

    bool operator==(const GetCommand&) const = default;
};
struct ModifyCommand {
    std::string path;
    std::vector<std::string> assignments;  ///< PROPERTY=VALUE

    bool operator==(const ModifyCommand&) const = default;
};
struct AssociatorsCommand {
    std::string path;
    bool names = false;
    std::optional<std::string> assocClass;
    std::optional<std::string> resultClass;
    std::optional<std::string> role;
    std::optional<std::string> resultRole;

    bool operator==(const AssociatorsCommand&) const = default;
};
struct ReferencesCommand {
    std::string path;
    bool names = false;
    std::optional<std::string> resultClass;
    std::optional<std::string> role;

    bool operator==(const ReferencesCommand&) const = default;
};

struct ServeCommand {
    std::string listen = "127.0.0.1";  ///< ADDRESS, ADDRESS:PORT or [ADDRESS]:PORT
    std::optional<std::string> tlsCertificate;
    std::optional<std::string> tlsKey;
    std::optional<std::string> users;
    bool readOnly = false;
    std::optional<std::string> metrics;  ///< where to serve metrics; empty: at the same address
    cimom::wbem::Limits limits;
    std::optional<std::string> subscriptions;  ///< the directory where they are kept
    cimom::wbem::DeliverySettings delivery;
    cimom::wbem::SubscriptionLimits subscriptionLimits;

    bool operator==(const ServeCommand&) const = default;
};
struct UserAddCommand {
    std::string name;
    std::string users;  ///< the users file
    bool mayModify = false;

    bool operator==(const UserAddCommand&) const = default;
};
/// What Prometheus is told of the machine.
struct MetricsCommand {
    std::optional<std::string> output;  ///< the file that is replaced; none: standard output

    bool operator==(const MetricsCommand&) const = default;
};
/// Tells Prometheus of other machines.
struct ExporterCommand {
    std::string config;   ///< the file with the targets
    ServeCommand server;  ///< where to listen, with which certificate and users
    bool check = false;   ///< only read the configuration

    bool operator==(const ExporterCommand&) const = default;
};
struct CheckCommand {
    bool operator==(const CheckCommand&) const = default;
};
/// What a shell asks for on behalf of a person who has not finished a command line.
struct CompleteCommand {
    std::vector<std::string> words;  ///< behind the program's name; the last is completed

    bool operator==(const CompleteCommand&) const = default;
};

using Command = std::variant<ShowCommand, WatchCommand, RenameCommand, GraphCommand, TreeCommand,
                             ClassesCommand, NamesCommand, InstancesCommand, GetCommand,
                             ModifyCommand, AssociatorsCommand, ReferencesCommand, ServeCommand,
                             UserAddCommand, CheckCommand, ProfilesCommand, MetricsCommand,
                             ExporterCommand, DescribeCommand, CompleteCommand>;

struct CommandLine {
    Options options;
    Command command;

    bool operator==(const CommandLine&) const = default;
};

}  // namespace cimdhcp
