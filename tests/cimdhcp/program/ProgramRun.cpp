#include "ProgramRun.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <system_error>

#include "zrcommon/SystemName.h"
#include "zrcommon/UniqueFd.h"

namespace test {

namespace {

ZR::UniqueFd openOrThrow(const std::string& path, int flags) {
    ZR::UniqueFd fd(::open(path.c_str(), flags | O_CLOEXEC | O_NOCTTY, 0600));
    if (!fd) {
        throw std::system_error(errno, std::generic_category(), path);
    }
    return fd;
}

/// The test's environment without what would change what the program prints, and with
/// the variables of one run, which replace those of the same name.
std::vector<std::string> environmentOf(const Environment& extra) {
    std::vector<std::string> result;
    for (char** entry = ::environ; *entry != nullptr; ++entry) {
        const std::string_view text = *entry;
        const bool replaced = std::any_of(extra.begin(), extra.end(), [text](const auto& each) {
            return text.starts_with(each.first + '=');
        });
        if (!replaced && !text.starts_with("ZR_") && !text.starts_with("CIMDHCP_") &&
            !text.starts_with("COLUMNS=") && !text.starts_with("NO_COLOR=")) {
            result.emplace_back(text);
        }
    }
    for (const auto& [name, value] : extra) {
        result.push_back(name + '=' + value);
    }
    return result;
}

std::vector<char*> pointersTo(std::vector<std::string>& texts) {
    std::vector<char*> pointers;
    for (std::string& text : texts) {
        pointers.push_back(text.data());
    }
    pointers.push_back(nullptr);
    return pointers;
}

pid_t start(const std::string& program, const std::vector<std::string>& arguments,
            const Environment& extra, int out, int err) {
    std::vector<std::string> words{program};
    words.insert(words.end(), arguments.begin(), arguments.end());
    std::vector<std::string> variables = environmentOf(extra);
    const std::vector<char*> argv = pointersTo(words);
    const std::vector<char*> envp = pointersTo(variables);
    const ZR::UniqueFd nothing = openOrThrow("/dev/null", O_RDONLY);
    const pid_t child = ::fork();
    if (child == 0) {
        ::dup2(nothing.get(), STDIN_FILENO);
        ::dup2(out, STDOUT_FILENO);
        ::dup2(err, STDERR_FILENO);
        ::execve(program.c_str(), argv.data(), envp.data());
        ::_exit(127);
    }
    if (child < 0) {
        throw std::system_error(errno, std::generic_category(), "fork");
    }
    return child;
}

int statusOf(pid_t child) {
    int status = 0;
    while (::waitpid(child, &status, 0) < 0) {
        if (errno != EINTR) {
            throw std::system_error(errno, std::generic_category(), "waitpid");
        }
    }
    return WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
}

/// Everything that arrives until the other side is closed.
std::string readAll(int fd) {
    std::string text;
    std::array<char, 4096> piece{};
    ssize_t got = 0;
    // A terminal whose other side is closed gives EIO.
    while ((got = ::read(fd, piece.data(), piece.size())) > 0) {
        text.append(piece.data(), static_cast<std::size_t>(got));
    }
    return text;
}

}  // namespace

void PrintTo(const Ended& ended, std::ostream* stream) {
    *stream << "exit status " << ended.status << "\n--- standard output\n"
            << ended.out << "--- standard error\n"
            << ended.err << "---";
}

ProgramTest::ProgramTest() {
    std::filesystem::create_directory(dataDir());
    ZR::Testing::writeFile(directory_ / "platform.conf", "");
    setTree(twoInterfaces);
}

std::string ProgramTest::usersFile() const {
    const std::string file = directory() / "users";
    for (const auto& [name, flag] : {std::pair{"ada", " --modify"}, std::pair{"bob", ""}}) {
        EXPECT_EQ(
            runAs("/bin/sh", {"-c", std::string("printf 'pass-") + name + "\\n' | " + program() +
                                        " user add --users " + file + flag + " " + name})
                .status,
            0);
    }
    return file;
}

void ProgramTest::setTree(const std::string& nodes) const {
    ZR::Testing::writeFile(tree(), "{\"nodes\": [" + nodes + "]}");
}

std::vector<std::string> ProgramTest::onTree(std::vector<std::string> arguments) const {
    arguments.insert(arguments.begin(), {"--tree", tree(), "--data-dir", dataDir()});
    return arguments;
}

Ended ProgramTest::run(std::vector<std::string> arguments, const Environment& extra) const {
    return runAs(program(), onTree(std::move(arguments)), extra);
}

std::string ProgramTest::certificate(const std::string& names) const {
    const Ended made =
        runAs("/usr/bin/openssl",
              {"req", "-x509", "-newkey", "ec", "-pkeyopt", "ec_paramgen_curve:prime256v1",
               "-nodes", "-days", "2", "-subj", "/CN=test", "-addext", "subjectAltName=" + names,
               "-keyout", directory() / "key.pem", "-out", directory() / "cert.pem"});
    EXPECT_EQ(made.status, 0) << made.err;
    return directory() / "cert.pem";
}

Ended ProgramTest::runAs(const std::string& program, const std::vector<std::string>& arguments,
                         const Environment& extra) const {
    Environment environment{{"ZR_CONFIG", directory_ / "platform.conf"}, {"ZR_LOG_SINK", "none"}};
    environment.insert(environment.end(), extra.begin(), extra.end());
    Ended ended;
    {
        const ZR::UniqueFd out = openOrThrow(directory_ / "out", O_WRONLY | O_CREAT | O_TRUNC);
        const ZR::UniqueFd err = openOrThrow(directory_ / "err", O_WRONLY | O_CREAT | O_TRUNC);
        ended.status = statusOf(start(program, arguments, environment, out.get(), err.get()));
    }
    ended.out = ZR::Testing::readFile(directory_ / "out");
    ended.err = ZR::Testing::readFile(directory_ / "err");
    return ended;
}

Ended ProgramTest::runOnTerminal(unsigned short columns, std::vector<std::string> arguments,
                                 const Environment& extra) const {
    const ZR::UniqueFd controller(::posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC));
    if (!controller || ::grantpt(controller.get()) != 0 || ::unlockpt(controller.get()) != 0) {
        throw std::system_error(errno, std::generic_category(), "pseudo terminal");
    }
    Ended ended;
    pid_t child = -1;
    {
        const ZR::UniqueFd terminal = openOrThrow(::ptsname(controller.get()), O_RDWR);
        winsize size{};
        size.ws_col = columns;
        size.ws_row = 24;
        ::ioctl(terminal.get(), TIOCSWINSZ, &size);
        const ZR::UniqueFd err = openOrThrow(directory_ / "err", O_WRONLY | O_CREAT | O_TRUNC);
        Environment environment{{"ZR_CONFIG", directory_ / "platform.conf"},
                                {"ZR_LOG_SINK", "none"},
                                {"TERM", "xterm"}};
        environment.insert(environment.end(), extra.begin(), extra.end());
        child =
            start(program(), onTree(std::move(arguments)), environment, terminal.get(), err.get());
    }
    ended.out = readAll(controller.get());
    ended.status = statusOf(child);
    ended.err = ZR::Testing::readFile(directory_ / "err");
    // The terminal puts a carriage return before each line feed.
    std::erase(ended.out, '\r');
    return ended;
}

const std::string& ProgramTest::program() {
    static const std::string file = CIMDHCP_PROGRAM;
    return file;
}

const std::string& ProgramTest::hostName() {
    static const std::string name = ZR::getSystemName();
    return name;
}

std::string ProgramTest::endpointPath(const std::string& interface) {
    return "root/cimv2:QVXZR_DHCPProtocolEndpoint.SystemCreationClassName=\"QVXZR_ComputerSystem\","
           "SystemName=\"" +
           hostName() + "\",CreationClassName=\"QVXZR_DHCPProtocolEndpoint\",Name=\"" + interface +
           "\"";
}

const char* const twoInterfaces = R"(
  { "type": "ComputerSystem", "description": "Computer", "properties": { "Name": "${HOSTNAME}" },
    "children": [
      { "type": "Network", "description": "Network", "children": [
        { "type": "NetworkInterface", "description": "Ethernet interface",
          "properties": { "Name": "eth0", "NameMaxLength": 15, "DHCPEnabled": true,
                          "AddressSource": 1, "InterfaceState": 1,
                          "DHCPServerAddresses": ["192.0.2.1", "2001:db8::1"],
                          "IPv4Address": "192.0.2.17" },
          "readOnly": ["Name"],
          "children": [
            { "type": "DHCPLease", "description": "DHCP lease",
              "properties": { "Family": "IPv4", "ClientState": 8, "Address": "192.0.2.17",
                              "ServerAddress": "192.0.2.1", "LeaseExpires": 253402300799,
                              "Client": "dhclient" } } ] },
        { "type": "NetworkInterface", "description": "Ethernet interface",
          "properties": { "Name": "eth1", "DHCPEnabled": false, "AddressSource": 3,
                          "InterfaceState": 1, "IPv4Address": "198.51.100.4" } } ] } ] },
  { "type": "ComputerSystem", "description": "BMC", "properties": { "Name": "BMC:-1" },
    "children": [] })";

std::string dhcpInterface(const std::string& name, const std::string& server) {
    return R"({"type": "NetworkInterface", "description": "Ethernet interface", "properties": {"Name": ")" +
           name +
           R"(", "DHCPEnabled": true, "AddressSource": 1, "InterfaceState": 1, "DHCPServerAddresses": [")" +
           server + R"("]}})";
}

std::string computer(const std::string& description, const std::string& interfaces) {
    return R"({"type": "ComputerSystem", "description": ")" + description +
           R"(", "properties": {"Name": ")" +
           (description == "Computer" ? "${HOSTNAME}" : description) +
           R"("}, "children": [{"type": "Network", "description": "Network", "children": [)" +
           interfaces + "]}]}";
}

}  // namespace test
