// What the serving process needs, and that it ends whatever its providers do.
#include <arpa/inet.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <fstream>
#include <memory>

#include "ProgramRun.h"
#include "ServedProgram.h"
#include "kit/Sanitizers.h"
#include "zrcommon/UniqueFd.h"

namespace {

using test::Ended;

using ZR::Testing::sanitized;

/// What the process had in memory at most, in KiB.
long peakOf(pid_t process) {
    std::ifstream status("/proc/" + std::to_string(process) + "/status");
    for (std::string word; status >> word;) {
        if (word == "VmHWM:") {
            long size = 0;
            status >> size;
            return size;
        }
    }
    return -1;
}

class ServeMemory : public test::ProgramTest {
  protected:
    /// What a sanitizer adds is not the server's.
    void expectLittleMemory() const {
        const long peak = peakOf(server_->process());
        EXPECT_GT(peak, 0);
        if (!sanitized) {
            EXPECT_LT(peak, 64 * 1024);
        }
    }

    /// The provider of very many instances, of about 1,000 bytes each.
    void serveMany(const std::vector<std::string>& environment,
                   const std::vector<std::string>& options = {}) {
        const std::string registrations = directory() / "registrations";
        std::filesystem::create_directories(registrations);
        std::filesystem::copy_file(MANY_DIRECTORY "/many.reg",
                                   registrations + "/many.registration");
        std::vector<std::string> arguments{
            "--namespace",        "root/test",   "--schema-dir",   MANY_DIRECTORY "/schema",
            "--registration-dir", registrations, "--provider-dir", MANY_PROVIDER_DIRECTORY};
        serve(std::move(arguments), environment, options);
    }

    void serve(std::vector<std::string> arguments, std::vector<std::string> environment = {},
               const std::vector<std::string>& options = {}) {
        for (const std::string& word :
             {std::string("--tree"), tree(), std::string("--data-dir"), dataDir(),
              std::string("serve"), std::string("--listen"), std::string("127.0.0.1:0")}) {
            arguments.push_back(word);
        }
        arguments.insert(arguments.end(), options.begin(), options.end());
        environment.push_back("ZR_CONFIG=" + (directory() / "platform.conf"));
        environment.push_back("ZR_LOG_SINK=file:" + (directory() / "log"));
        server_ = std::make_unique<test::ServedProgram>(program(), arguments, environment);
    }

    /// What a shell command prints; $url stands for the server's.
    Ended shell(const std::string& command) const {
        return runAs("/bin/sh", {"-c", "url=" + server_->url() + "; " + command});
    }

    /// curl with an enumeration, without the URL.
    static std::string enumeration(const std::string& operation, const std::string& className) {
        return "curl -s -H 'CIMOperation: MethodCall' -H 'Content-Type: application/xml' -H "
               "'CIMMethod: " +
               operation +
               "' -H 'CIMObject: root/test' --data-binary '<CIM CIMVERSION=\"2.0\" "
               "DTDVERSION=\"2.0\"><MESSAGE ID=\"1\" PROTOCOLVERSION=\"1.0\"><SIMPLEREQ>"
               "<IMETHODCALL NAME=\"" +
               operation +
               "\"><LOCALNAMESPACEPATH><NAMESPACE NAME=\"root\"/><NAMESPACE NAME=\"test\"/>"
               "</LOCALNAMESPACEPATH><IPARAMVALUE NAME=\"ClassName\"><CLASSNAME NAME=\"" +
               className + "\"/></IPARAMVALUE></IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>' ";
    }

    /// A client that has connected and says nothing more than this.
    [[nodiscard]] ZR::UniqueFd connected(const std::string& bytes) const {
        ZR::UniqueFd client(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        const std::string host = server_->host();
        address.sin_port =
            htons(static_cast<std::uint16_t>(std::stoi(host.substr(host.rfind(':') + 1))));
        EXPECT_EQ(
            ::connect(client.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address),
            0);
        EXPECT_EQ(::send(client.get(), bytes.data(), bytes.size(), MSG_NOSIGNAL),
                  static_cast<ssize_t>(bytes.size()));
        return client;
    }

    [[nodiscard]] std::string log() const { return ZR::Testing::readFile(directory() / "log"); }

    std::unique_ptr<test::ServedProgram> server_;
};

TEST_F(ServeMemory, DoesNotGrowWithTheResult) {
    const std::string count = sanitized ? "10000" : "100000";
    serveMany({"MANY_THINGS=" + count}, {"--request-timeout", "600"});
    const long before = peakOf(server_->process());
    const std::string all = enumeration("EnumerateInstances", "Many_Thing") + "$url/cimom";
    // All at once: one that is taken slowly, one that is open and keeps its objects,
    // and one that is counted.
    const Ended ended = shell(enumeration("EnumerateInstances", "Many_Thing") +
                              "--limit-rate 1M --max-time 30 -o /dev/null $url/cimom & " +
                              enumeration("OpenEnumerateInstances", "Many_Thing") +
                              "$url/cimom > " + (directory() / "open") + " & " + all +
                              " | grep -o '<VALUE.NAMEDINSTANCE>' | wc -l; wait");
    EXPECT_EQ(ended.out, count + "\n");
    EXPECT_THAT(ZR::Testing::readFile(directory() / "open"),
                testing::HasSubstr("<PARAMVALUE NAME=\"EndOfSequence\" PARAMTYPE=\"boolean\">"
                                   "<VALUE>FALSE</VALUE>"));
    expectLittleMemory();
    if (!sanitized) {
        EXPECT_LT(peakOf(server_->process()) - before, 40 * 1024);
    }
}

TEST_F(ServeMemory, IsLittleWithAThousandInterfacesAndManyClients) {
    std::string interfaces;
    for (int number = 0; number < 1000; ++number) {
        interfaces += (number == 0 ? "" : ",") +
                      test::dhcpInterface("if" + std::to_string(number), "192.0.2.1");
    }
    setTree(test::computer("Computer", interfaces));
    // All of them have one address, which no request has made known.
    serve({}, {},
          {"--request-timeout", "600", "--head-timeout", "600", "--max-connections-each", "512",
           "--max-connection-rate", "1000"});
    std::vector<ZR::UniqueFd> slow;
    for (int count = 0; count < 200; ++count) {
        slow.push_back(connected("POST /cimom HTTP/1.1\r\nHost: slow\r\nContent-Length: 500\r\n"));
    }
    // 64 clients at once, each with all endpoints; what they print is the same.
    const Ended together = shell("for client in $(seq " + std::string(sanitized ? "8" : "64") +
                                 "); do wbemcli ei $url/root/cimv2:QVXZR_DHCPProtocolEndpoint "
                                 "| md5sum & done; wait");
    EXPECT_EQ(together.status, 0);
    const std::string first = together.out.substr(0, together.out.find('\n') + 1);
    EXPECT_EQ(together.out.size(), (sanitized ? 8 : 64) * first.size());
    for (std::size_t at = 0; at < together.out.size(); at += first.size()) {
        EXPECT_EQ(together.out.substr(at, first.size()), first);
    }
    EXPECT_EQ(shell("wbemcli ei $url/root/cimv2:QVXZR_DHCPProtocolEndpoint | wc -l").out, "1000\n");
    expectLittleMemory();
}

TEST_F(ServeMemory, NothingOfAProviderKeepsTheServerFromEnding) {
    serveMany({"MANY_HELD=1"}, {"--request-timeout", "1"});
    const Ended late = shell(enumeration("EnumerateInstances", "Many_Waiting") +
                             "-o /dev/null -w '%{http_code}' $url/cimom");
    EXPECT_EQ(late.out, "503");
    // Without end, though no client waits for it any more.
    EXPECT_EQ(shell(enumeration("EnumerateInstances", "Many_Endless") +
                    "-o /dev/null -w '%{http_code}' $url/cimom")
                  .out,
              "503");
    EXPECT_EQ(shell(enumeration("EnumerateInstanceNames", "Many_Thing") +
                    "-o /dev/null -w '%{http_code}' $url/cimom")
                  .out,
              "200");
    expectLittleMemory();
    EXPECT_EQ(server_->end(), 0);
    EXPECT_THAT(log(), testing::HasSubstr("ending without waiting for operations that do not "
                                          "return"));
}

}  // namespace
