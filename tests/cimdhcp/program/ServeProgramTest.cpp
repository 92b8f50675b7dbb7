// The server as clients of other makers see it: wbemcli and curl.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <chrono>
#include <csignal>
#include <filesystem>
#include <memory>
#include <thread>

#include "ProgramRun.h"
#include "ServedProgram.h"

namespace {

using test::Ended;
using testing::HasSubstr;

class Serve : public test::ProgramTest {
  protected:
    void serve(std::vector<std::string> further = {}) {
        std::vector<std::string> arguments{"--tree", tree(),     "--data-dir", dataDir(),
                                           "serve",  "--listen", "127.0.0.1:0"};
        arguments.insert(arguments.end(), further.begin(), further.end());
        server_ = std::make_unique<test::ServedProgram>(
            program(), arguments,
            std::vector<std::string>{"ZR_CONFIG=" + (directory() / "platform.conf"),
                                     "ZR_LOG_SINK=file:" + (directory() / "log")});
    }

    /// wbemcli VERB on an object of root/cimv2; `options` stand before it.
    Ended wbemcli(const std::string& verb, const std::string& object,
                  const std::vector<std::string>& options = {},
                  const std::vector<std::string>& behind = {}) const {
        std::vector<std::string> arguments{verb};
        arguments.insert(arguments.end(), options.begin(), options.end());
        arguments.push_back(server_->url() + "/root/cimv2" + (object.empty() ? "" : ":" + object));
        arguments.insert(arguments.end(), behind.begin(), behind.end());
        return runAs("/usr/bin/wbemcli", arguments);
    }

    /// The whole output is these lines, each with the server's address or the
    /// machine's name before it.
    static std::string lines(const std::string& host, const std::vector<std::string>& objects) {
        std::string text;
        for (const std::string& object : objects) {
            text += host + "/root/cimv2:" + object + '\n';
        }
        return text;
    }
    [[nodiscard]] Ended asked(const std::vector<std::string>& objects) const {
        return {0, lines(server_->host(), objects), ""};
    }
    [[nodiscard]] static Ended found(const std::vector<std::string>& objects) {
        return {0, lines(hostName(), objects), ""};
    }

    static std::string endpoint(const std::string& interface) {
        const std::string path = endpointPath(interface);
        return path.substr(path.find(':') + 1);
    }

    [[nodiscard]] std::string log() const { return ZR::Testing::readFile(directory() / "log"); }

    /// Waits until the log has a text behind that many bytes; all of what is there then.
    [[nodiscard]] std::string awaitLog(const std::string& text, std::size_t from) const {
        constexpr int rounds = 3000;
        constexpr std::chrono::milliseconds between(10);
        std::string lines;
        for (int round = 0; round < rounds; ++round) {
            lines = log().substr(from);
            if (lines.find(text) != std::string::npos) {
                return lines;
            }
            std::this_thread::sleep_for(between);
        }
        ADD_FAILURE() << "no \"" << text << "\" in " << lines;
        return lines;
    }

    /// Has the server read its files anew; the lines that it logs about it.
    [[nodiscard]] std::string reload() const {
        const std::size_t before = log().size();
        EXPECT_EQ(::kill(server_->process(), SIGHUP), 0);
        return awaitLog("stay until a restart", before);
    }

    std::unique_ptr<test::ServedProgram> server_;
    const std::string setting = "QVXZR_DHCPSettingData.InstanceID=\"Computer%eth0\"";
};

TEST_F(Serve, InstancesAreFoundByTheirStandardParents) {
    serve();
    EXPECT_EQ(wbemcli("ein", "CIM_DHCPProtocolEndpoint"), asked({endpoint("eth0")}));
    EXPECT_EQ(wbemcli("ein", "QVXZR_DHCPSettingData"),
              asked({setting, "QVXZR_DHCPSettingData.InstanceID=\"Computer%eth1\""}));
    EXPECT_EQ(wbemcli("ei", "CIM_DHCPCapabilities"),
              asked({"QVXZR_DHCPCapabilities.InstanceID=\"eth0\" "
                     "InstanceID=\"eth0\",ElementName=\"eth0\",ElementNameEditSupported=FALSE,"
                     "MaxElementNameLen=15,OptionsSupported=8,14,17"}));
    EXPECT_EQ(wbemcli("ei", "QVXZR_DHCPSettingData", {}, {"InstanceID,AddressOrigin"}),
              asked({setting + " InstanceID=\"Computer%eth0\",AddressOrigin=4",
                     "QVXZR_DHCPSettingData.InstanceID=\"Computer%eth1\" "
                     "InstanceID=\"Computer%eth1\",AddressOrigin=4"}));
}

TEST_F(Serve, OneInstanceIsShownWithAllThatItsClassHas) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    serve();
    EXPECT_EQ(
        wbemcli("gi", setting),
        asked({setting + " InstanceID=\"Computer%eth0\",ElementName=\"eth0\",AddressOrigin=4,"
                         "RequestedIPv4Address=\"192.0.2.17\",ConfigurationName=\"home\",Caption=,"
                         "Description=,ChangeableType=,ProtocolIFType=,RequestedLeaseTime=,"
                         "ClientIdentifier=,VendorClassIdentifier=,RequestedOptions=,"
                         "RequiredOptions="}));
    const Ended missing = wbemcli("gi", "QVXZR_DHCPSettingData.InstanceID=\"Computer%eth9\"");
    EXPECT_NE(missing.status, 0);
    EXPECT_THAT(missing.out + missing.err, HasSubstr("CIM_ERR_NOT_FOUND"));
}

TEST_F(Serve, AnInstanceIsModifiedAndTheLogTellsIt) {
    writeConfiguration("eth0", "DEVICE=eth0\n");
    serve();
    // The setting has no name yet; clients change only what they are shown.
    EXPECT_EQ(wbemcli("mi", setting, {}, {"ConfigurationName=office"}).status, 0);
    EXPECT_EQ(ZR::Testing::readFile(configuration("eth0")), "DEVICE=eth0\nCONFIG_NAME=office\n");
    EXPECT_EQ(wbemcli("gi", setting, {}, {"ConfigurationName"}),
              asked({setting + " ConfigurationName=\"office\""}));
    EXPECT_THAT(log(), HasSubstr("modify user=none address=127.0.0.1 object=root/cimv2:" + setting +
                                 " ConfigurationName: null -> \"office\" status=OK"));
}

TEST_F(Serve, ReadOnlyNoClientModifies) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    serve({"--read-only"});
    const Ended ended = wbemcli("mi", setting, {}, {"ConfigurationName=office"});
    EXPECT_NE(ended.status, 0);
    EXPECT_THAT(ended.out + ended.err, HasSubstr("this needs the right to modify"));
    EXPECT_EQ(ZR::Testing::readFile(configuration("eth0")), "CONFIG_NAME=home\n");
}

TEST_F(Serve, AssociationsAreWalkedWithEveryFilter) {
    serve();
    const std::string assignment =
        "QVXZR_IPAssignmentSettingData.InstanceID=\"Computer%eth0%dhcp\"";
    EXPECT_EQ(wbemcli("ain", setting), found({assignment, endpoint("eth0")}));
    EXPECT_EQ(wbemcli("ain", setting, {"-arc", "CIM_ProtocolEndpoint"}), found({endpoint("eth0")}));
    EXPECT_EQ(wbemcli("ain", setting, {"-ar", "ManagedElement"}), found({}));
    EXPECT_EQ(wbemcli("ain", setting, {"-ac", "CIM_ElementSettingData", "-arr", "ManagedElement"}),
              found({endpoint("eth0")}));
    EXPECT_EQ(wbemcli("ai", setting, {"-ac", "CIM_OrderedComponent"}),
              found({assignment +
                     " InstanceID=\"Computer%eth0%dhcp\",ElementName=\"eth0\",AddressOrigin=4"}));
    const std::string ordered = "QVXZR_DHCPOrderedComponent.PartComponent=root/cimv2:" + setting +
                                ",GroupComponent=root/cimv2:" + assignment;
    EXPECT_EQ(wbemcli("rin", setting, {"-arc", "CIM_OrderedComponent"}), found({ordered}));
    EXPECT_EQ(wbemcli("ri", setting, {"-arc", "QVXZR_DHCPOrderedComponent"}),
              found({ordered + " GroupComponent=root/cimv2:" + assignment +
                     ",PartComponent=root/cimv2:" + setting + ",AssignedSequence=1"}));
}

TEST_F(Serve, ClassesAreShown) {
    serve();
    EXPECT_EQ(
        wbemcli("ecn", "CIM_IPAssignmentSettingData"),
        asked({"CIM_DHCPSettingData", "QVXZR_DHCPSettingData", "QVXZR_IPAssignmentSettingData"}));
    EXPECT_EQ(wbemcli("gc", "CIM_ElementCapabilities"),
              asked({"CIM_ElementCapabilities ManagedElement=,Capabilities=,Characteristics="}));
    EXPECT_EQ(wbemcli("ec", "CIM_ElementCapabilities"),
              asked({"QVXZR_DHCPElementCapabilities ManagedElement=,Capabilities=,"
                     "Characteristics="}));
    EXPECT_THAT(wbemcli("ecn", "").out,
                HasSubstr(server_->host() + "/root/cimv2:CIM_ManagedElement\n"));
}

TEST_F(Serve, FailuresAreToldInWords) {
    serve();
    const Ended ended = wbemcli("ein", "CIM_Nothing");
    EXPECT_NE(ended.status, 0);
    EXPECT_THAT(ended.out + ended.err,
                HasSubstr("Cim: (5) CIM_ERR_INVALID_CLASS: no class \"CIM_Nothing\""));
    EXPECT_NE(wbemcli("di", setting).status, 0);
}

TEST_F(Serve, UsersHaveToSayWhoTheyAre) {
    writeConfiguration("eth0", "CONFIG_NAME=home\n");
    serve({"--users", usersFile()});
    const auto as = [this](const std::string& user) {
        std::string url = server_->url() + "/root/cimv2:" + setting;
        url.insert(url.find("//") + 2, user);
        return url;
    };
    const auto modify = [&](const std::string& user, const std::string& name) {
        return runAs("/usr/bin/wbemcli", {"mi", as(user), "ConfigurationName=" + name}).status;
    };
    EXPECT_NE(modify("", "office"), 0);
    EXPECT_NE(modify("ada:wrong@", "office"), 0);
    EXPECT_NE(modify("bob:pass-bob@", "office"), 0);
    EXPECT_EQ(ZR::Testing::readFile(configuration("eth0")), "CONFIG_NAME=home\n");
    EXPECT_EQ(runAs("/usr/bin/wbemcli", {"gi", as("bob:pass-bob@")}).status, 0);
    EXPECT_EQ(modify("ada:pass-ada@", "office"), 0);
    EXPECT_EQ(ZR::Testing::readFile(configuration("eth0")), "CONFIG_NAME=office\n");
    const std::string logged = log();
    // Who asks without credentials has not guessed, and is not counted.
    EXPECT_THAT(logged, testing::Not(HasSubstr("without credentials")));
    EXPECT_THAT(logged, HasSubstr("refused user ada from 127.0.0.1, refusal number 1"));
    EXPECT_THAT(logged, HasSubstr("modify user=\"bob\""));
    EXPECT_THAT(logged, HasSubstr("status=CIM_ERR_ACCESS_DENIED"));
    EXPECT_THAT(logged, HasSubstr("modify user=\"ada\""));
    EXPECT_THAT(logged, testing::Not(HasSubstr("wrong")));
    EXPECT_THAT(logged, testing::Not(HasSubstr("pass-")));
}

TEST_F(Serve, TlsIsWhatItShouldBe) {
    const std::string certificateFile = certificate();
    serve({"--tls-cert", certificateFile, "--tls-key", directory() / "key.pem"});
    EXPECT_TRUE(server_->url().starts_with("https://"));
    const auto curl = [&](const std::vector<std::string>& options) {
        std::vector<std::string> arguments{"-s", "-o", "/dev/null", "-w", "%{http_code}"};
        arguments.insert(arguments.end(), options.begin(), options.end());
        arguments.push_back(server_->url() + "/cimom");
        return runAs("/usr/bin/curl", arguments);
    };
    EXPECT_EQ(curl({"--cacert", certificateFile}).out, "405");
    EXPECT_EQ(curl({"--cacert", certificateFile, "--tlsv1.3"}).out, "405");
    EXPECT_NE(curl({"--cacert", certificateFile, "--tls-max", "1.1"}).status, 0);
    EXPECT_NE(curl({}).status, 0);  // no authority vouches for the certificate
    const Ended plain = runAs("/usr/bin/curl", {"-s", "http://" + server_->host() + "/cimom"});
    EXPECT_NE(plain.status, 0);
}

// Takes some 2 s: a wrong password is refused after one.
TEST_F(Serve, ReadsCertificateKeyAndUsersAnew) {
    const std::string users = usersFile();
    const std::string key = directory() / "key.pem";
    std::string served = certificate();
    serve({"--tls-cert", served, "--tls-key", key, "--users", users});
    // The certificate is its own authority: only the served one is believed.
    const std::string known = directory() / "known.pem";
    const auto status = [&](const std::string& user) {
        return runAs("/usr/bin/curl", {"-s",
                                       "-o",
                                       "/dev/null",
                                       "-w",
                                       "%{http_code}",
                                       "--cacert",
                                       known,
                                       "-u",
                                       user,
                                       "-H",
                                       "CIMOperation: MethodCall",
                                       "-H",
                                       "CIMMethod: GetClass",
                                       "-H",
                                       "CIMObject: root/cimv2",
                                       "-H",
                                       "Content-Type: application/xml",
                                       "-d",
                                       "<CIM",
                                       server_->url() + "/cimom"})
            .out;
    };
    std::filesystem::copy_file(served, known);
    // Past the users, a body that is no XML is refused.
    EXPECT_EQ(status("ada:pass-ada"), "400");

    served = certificate();
    ZR::Testing::writeFile(users, "broken\n");
    EXPECT_EQ(status("ada:pass-ada"), "400");
    const std::string first = reload();
    EXPECT_THAT(first, HasSubstr("read anew: certificate and key"));
    EXPECT_THAT(first, HasSubstr("users: not read anew: " + users +
                                 ": line 1: not of the form NAME:ROLE:HASH"));
    EXPECT_EQ(status("ada:pass-ada"), "000");  // not the certificate that it knows
    std::filesystem::copy_file(served, known, std::filesystem::copy_options::overwrite_existing);
    EXPECT_EQ(status("ada:pass-ada"), "400");

    std::filesystem::remove(users);
    EXPECT_EQ(
        runAs("/bin/sh", {"-c", "echo new | " + program() + " user add --users " + users + " ada"})
            .status,
        0);
    ZR::Testing::writeFile(served, "broken\n");
    const std::string second = reload();
    EXPECT_THAT(second, HasSubstr("read anew: users"));
    EXPECT_THAT(second, HasSubstr("certificate and key: not read anew: TLS certificate: "));
    EXPECT_EQ(status("ada:new"), "400");
    EXPECT_EQ(status("ada:pass-ada"), "401");

    // And what is logged: by default no line about a refused request is.
    EXPECT_THAT(log(), testing::Not(HasSubstr("127.0.0.1: ")));
    ZR::Testing::writeFile(directory() / "platform.conf", "LOG_LEVEL=4000\n");
    EXPECT_THAT(reload(), HasSubstr("read anew: what is logged, and where"));
    EXPECT_EQ(status("ada:new"), "400");
    EXPECT_THAT(log(), HasSubstr("127.0.0.1: "));
    EXPECT_EQ(server_->end(), 0);
}

TEST_F(Serve, RefusesAKeyThatOthersCanRead) {
    const std::string certificateFile = certificate();
    const std::string key = directory() / "key.pem";
    for (const unsigned mode : {0604U, 0660U, 0601U}) {
        ASSERT_EQ(::chmod(key.c_str(), mode), 0);
        EXPECT_EQ(run({"serve", "--tls-cert", certificateFile, "--tls-key", key}),
                  (Ended{3, "",
                         "cimdhcp: " + key +
                             ": may be read or written by others; \"chmod 640\" mends that\n"}));
    }
    ASSERT_EQ(::chmod(key.c_str(), 0640), 0);
    serve({"--tls-cert", certificateFile, "--tls-key", key});
    EXPECT_EQ(server_->end(), 0);
}

TEST_F(Serve, EndsBySignalInGoodOrder) {
    serve();
    EXPECT_EQ(server_->end(), 0);
    EXPECT_THAT(log(), HasSubstr("ending by signal 15"));
}

TEST_F(Serve, RefusesToStartWhereItWouldBeOpenToAll) {
    const auto refusal = [this](std::vector<std::string> arguments) {
        arguments.insert(arguments.begin(), "serve");
        return run(std::move(arguments));
    };
    EXPECT_EQ(refusal({"--listen", "0.0.0.0"}),
              (Ended{3, "",
                     "cimdhcp: 0.0.0.0 can be reached from other machines: this needs TLS "
                     "(--tls-cert and --tls-key), or passwords could be read on the way\n"}));
    const std::string certificateFile = certificate();
    const std::vector<std::string> tls{"--listen",      "[::]:0",    "--tls-cert",
                                       certificateFile, "--tls-key", directory() / "key.pem"};
    EXPECT_EQ(refusal(tls),
              (Ended{3, "",
                     "cimdhcp: :: can be reached from other machines: this needs users (--users, "
                     "made by \"cimdhcp user add\"), or anybody could use it\n"}));
    EXPECT_EQ(
        refusal({"--users", directory() / "none"}),
        (Ended{3, "", "cimdhcp: " + (directory() / "none") + ": No such file or directory\n"}));
    EXPECT_EQ(refusal({"--tls-cert", certificateFile}).status, 2);
    EXPECT_EQ(refusal({"--max-body", "0"}),
              (Ended{2, "", "cimdhcp: --max-body is 0; it may be 1 to 1073741824\n"}));
    EXPECT_EQ(refusal({"--request-timeout", "0"}),
              (Ended{2, "", "cimdhcp: --request-timeout is 0; it may be 1 to 86400\n"}));
    EXPECT_EQ(refusal({"--listen", "127.0.0.1:http"}).status, 2);
    EXPECT_EQ(refusal({"--listen", "localhost"}),
              (Ended{3, "", "cimdhcp: \"localhost\" is not an IPv4 or IPv6 address\n"}));
}

TEST_F(Serve, LimitsAreSetByOptions) {
    serve({"--max-body", "100"});
    EXPECT_NE(wbemcli("ein", "QVXZR_DHCPProtocolEndpoint").status, 0);
    serve({"--max-body", "10000"});
    EXPECT_EQ(wbemcli("ein", "QVXZR_DHCPProtocolEndpoint").status, 0);
}

/// The users file as people make it.
class UserAdd : public test::ProgramTest {
  protected:
    Ended add(const std::string& input, const std::string& arguments) const {
        return runAs("/bin/sh",
                     {"-c", "printf '" + input + "' | " + program() + " user add --users " +
                                (directory() / "users") + " " + arguments});
    }
};

TEST_F(UserAdd, MakesAFileWithoutThePassword) {
    EXPECT_EQ(add("geheim\\n", "--modify ada"),
              (Ended{0, "User ada (modify) is in " + (directory() / "users") + ".\n", ""}));
    EXPECT_EQ(add("geheim\\n", "bob").status, 0);
    const std::string text = ZR::Testing::readFile(directory() / "users");
    EXPECT_THAT(text, HasSubstr("\nada:modify:$y$"));
    EXPECT_THAT(text, HasSubstr("\nbob:read:$y$"));
    EXPECT_THAT(text, testing::Not(HasSubstr("geheim")));
    EXPECT_EQ(std::filesystem::status(directory() / "users").permissions(),
              std::filesystem::perms::owner_read | std::filesystem::perms::owner_write);
}

TEST_F(UserAdd, TakesSeveralAtOnce) {
    const std::string users = directory() / "users";
    EXPECT_EQ(runAs("/bin/sh", {"-c", "for user in a b c d e f g h; do echo x | " + program() +
                                          " user add --users " + users + " $user & done; wait"})
                  .status,
              0);
    const std::string text = ZR::Testing::readFile(users);
    for (const char* user : {"a", "b", "c", "d", "e", "f", "g", "h"}) {
        EXPECT_THAT(text, HasSubstr(std::string("\n") + user + ":read:$y$"));
    }
}

TEST_F(UserAdd, RefusesWhatCannotBe) {
    EXPECT_EQ(add("", "ada"), (Ended{2, "", "cimdhcp: a password has 1 to 511 bytes\n"}));
    EXPECT_EQ(add("x\\n", "a:b").status, 2);
    EXPECT_EQ(add("x\\n", "").status, 2);
    EXPECT_EQ(runAs(program(), {"user"}).status, 2);
    EXPECT_FALSE(std::filesystem::exists(directory() / "users"));
}

}  // namespace
