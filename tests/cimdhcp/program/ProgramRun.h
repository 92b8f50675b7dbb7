#pragma once

#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <utility>
#include <vector>

#include "kit/Files.h"

namespace test {

/// How a run of the program ended, and all that it wrote.
struct Ended {
    int status = -1;  ///< exit status; below 0: ended by that signal
    std::string out;
    std::string err;

    bool operator==(const Ended&) const = default;
};
void PrintTo(const Ended& ended, std::ostream* stream);

using Environment = std::vector<std::pair<std::string, std::string>>;

/// A machine of JSON nodes with a data directory, and the real program to look at
/// it: the one of the build tree, with the provider libraries of the build tree.
class ProgramTest : public ::testing::Test {
  protected:
    ProgramTest();

    /// Runs the program with --tree and --data-dir.
    Ended run(std::vector<std::string> arguments, const Environment& extra = {}) const;

    /// Runs a program with just these arguments.
    Ended runAs(const std::string& program, const std::vector<std::string>& arguments,
                const Environment& extra = {}) const;

    /// As run(), with a terminal of that many columns for its output.
    Ended runOnTerminal(unsigned short columns, std::vector<std::string> arguments,
                        const Environment& extra = {}) const;

    /// Makes cert.pem and key.pem in the directory, for these names; where the first is.
    std::string certificate(const std::string& names = "IP:127.0.0.1") const;

    /// Makes a users file with ada, who may modify, and bob; "pass-" and the name is the password.
    std::string usersFile() const;

    void setTree(const std::string& nodes) const;
    void writeConfiguration(const std::string& interface, const std::string& content) const {
        ZR::Testing::writeFile(configuration(interface), content);
    }
    [[nodiscard]] std::string configuration(const std::string& interface) const {
        return dataDir() + "/ifcfg-" + interface;
    }
    [[nodiscard]] std::string dataDir() const { return directory_ / "data"; }
    [[nodiscard]] std::string tree() const { return directory_ / "tree.json"; }
    [[nodiscard]] const ZR::Testing::TemporaryDirectory& directory() const { return directory_; }

    static const std::string& program();
    static const std::string& hostName();

    /// The path of an endpoint of the host.
    static std::string endpointPath(const std::string& interface);

  private:
    [[nodiscard]] std::vector<std::string> onTree(std::vector<std::string> arguments) const;

    ZR::Testing::TemporaryDirectory directory_;
};

/// A host with eth0 (DHCP, a lease without an end, two servers) and eth1 (a fixed address), and a
/// service processor without interfaces.
extern const char* const twoInterfaces;

/// "interface", one line of JSON: takes its address by DHCP.
std::string dhcpInterface(const std::string& name, const std::string& server);
/// A computer's node around those of its interfaces.
std::string computer(const std::string& description, const std::string& interfaces);

}  // namespace test
