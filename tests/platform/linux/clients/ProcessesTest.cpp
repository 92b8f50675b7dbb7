// A process file system laid out by hand: processes of other namespaces, ended
// ones and hidden ones cannot all be had at will. DhcpLifeTest.cpp uses the real one.

#include "clients/Processes.h"

#include <gmock/gmock.h>
#include <grp.h>
#include <gtest/gtest.h>
#include <linux/capability.h>
#include <net/if.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <iomanip>
#include <sstream>

#include "LinuxSupport.h"
#include "kit/ChildProcess.h"
#include "kit/Diagnostics.h"
#include "kit/Namespaces.h"

namespace ZR::Live {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class ProcessesTest : public testing::Test {
  protected:
    ProcessesTest() { linkNamespace("thread-self", "net:[1]"); }

    void linkNamespace(const std::string& process, const char* name) const {
        std::filesystem::create_directories(proc_.path("/" + process + "/ns"));
        std::filesystem::create_symlink(name, proc_.path("/" + process + "/ns/net"));
    }
    static std::string status(char state, unsigned realUser, unsigned user,
                              std::uint64_t capabilities, int parent = 1) {
        std::ostringstream text;
        text << "Name:\tx\nUmask:\t0022\nState:\t" << state << " (sleeping)\nTgid:\t7\nPPid:\t"
             << parent << "\nUid:\t" << realUser << '\t' << user << '\t' << user << '\t' << user
             << "\nCapEff:\t" << std::hex << std::setfill('0') << std::setw(16) << capabilities
             << "\n";
        return text.str();
    }
    void add(const std::string& process, const std::string& name, const std::string& commandLine,
             const char* networkNamespace = "net:[1]") const {
        proc_.write("/" + process + "/comm", name + "\n");
        proc_.write("/" + process + "/cmdline", commandLine);
        proc_.write("/" + process + "/status", status('S', 0, 0, 0));
        if (networkNamespace != nullptr) {
            linkNamespace(process, networkNamespace);
        }
    }
    ClientFacts read() const {
        ClientFacts facts;
        readProcesses({.files = "", .proc = proc_.path()}, facts);
        return facts;
    }

    TemporaryDirectory proc_;
    const std::string commandLine_{"dhclient\0-lf\0/l\0eth1\0", 22};
};

TEST_F(ProcessesTest, AClientIsFoundByItsName) {
    add("17", "dhclient", commandLine_);
    add("18", "dhclientx", commandLine_);
    add("19", "sh", commandLine_);
    EXPECT_THAT(read().processes, ElementsAre(ClientProcess{.client = Client::Dhclient,
                                                            .interfaces = {"eth1"_name},
                                                            .leaseFile = "/l",
                                                            .ipv6 = false,
                                                            .pid = 17}));
}

TEST_F(ProcessesTest, ClientsOfOtherNamespacesConcernOtherLinks) {
    add("17", "dhclient", commandLine_, "net:[2]");
    EXPECT_THAT(read().processes, IsEmpty());
}

TEST_F(ProcessesTest, AClientOfAnUnknownNamespaceIsNotTrusted) {
    add("17", "dhclient", commandLine_, nullptr);
    EXPECT_THAT(read().processes, IsEmpty());
    EXPECT_THAT(ZR::Testing::textsOf(read().diagnostics), IsEmpty());
}

TEST_F(ProcessesTest, WithoutAnOwnNamespaceNoClientIsTrusted) {
    std::filesystem::remove_all(proc_.path("/thread-self"));
    add("17", "dhclient", commandLine_, nullptr);
    EXPECT_THAT(read().processes, IsEmpty());
}

TEST_F(ProcessesTest, AnEndedClientKeepsItsNameOnly) {
    add("17", "dhclient", "");
    EXPECT_THAT(read().processes, IsEmpty());
}

TEST_F(ProcessesTest, EachClientIsKnownByItsName) {
    const auto text = [](const char* characters, std::size_t size) {
        return std::string{characters, size};
    };
    add("11", "dhcpcd", "dhcpcd: eth1 [ip4] [ip6]");
    add("12", "udhcpc", text("udhcpc\0-i\0eth2\0", 15));
    add("13", "busybox", text("busybox\0udhcpc\0-i\0eth3\0", 23));
    add("14", "udhcpc6", text("udhcpc6\0-i\0eth4\0", 16));
    add("15", "dhcp6c", text("dhcp6c\0eth5\0", 12));
    add("16", "busybox", text("busybox\0sh\0", 11));
    std::vector<std::tuple<Client, InterfaceName, std::int32_t>> found;
    for (const ClientProcess& process : read().processes) {
        found.emplace_back(process.client, process.interfaces.at(0), process.pid);
    }
    EXPECT_THAT(found, testing::UnorderedElementsAre(std::tuple{Client::Dhcpcd, "eth1"_name, 11},
                                                     std::tuple{Client::Udhcpc, "eth2"_name, 12},
                                                     std::tuple{Client::Udhcpc, "eth3"_name, 13},
                                                     std::tuple{Client::Udhcpc, "eth4"_name, 14},
                                                     std::tuple{Client::Dhcp6c, "eth5"_name, 15}));
}

TEST_F(ProcessesTest, ManagersAreToldWithWhereTheyRun) {
    using Where = ManagerProcess::Where;
    add("11", "systemd-network", "/lib/systemd/systemd-networkd");
    add("12", "NetworkManager", "/usr/sbin/NetworkManager", "net:[2]");
    add("13", "wickedd-dhcp4", "", nullptr);
    add("14", "connmand", "/usr/sbin/connmand");
    EXPECT_THAT(
        read().managers,
        testing::UnorderedElementsAre(
            ManagerProcess{.client = Client::Networkd, .where = Where::Here, .pid = 11},
            ManagerProcess{.client = Client::NetworkManager, .where = Where::Elsewhere, .pid = 12},
            ManagerProcess{.client = Client::Wicked, .where = Where::Unknown, .pid = 13},
            ManagerProcess{.client = Client::Connman, .where = Where::Here, .pid = 14}));
}

TEST_F(ProcessesTest, AClientWhoseNamespaceIsForbiddenIsReported) {
    using std::filesystem::perms;
    constexpr uid_t nobody = 65534;
    add("17", "dhclient", commandLine_);
    std::filesystem::permissions(proc_.path("/17/ns"), perms::none);
    std::filesystem::permissions(
        proc_.path(),
        perms::group_read | perms::group_exec | perms::others_read | perms::others_exec,
        std::filesystem::perm_options::add);
    // Nothing is forbidden to root.
    const ZR::Testing::ChildResult other = ZR::Testing::inChild([this] {
        if (::geteuid() == 0 && ::setuid(nobody) != 0) {
            return std::string("cannot be another user");
        }
        const ClientFacts facts = read();
        std::string text = std::to_string(facts.processes.size()) + " processes";
        for (const Diagnostic& diagnostic : facts.diagnostics) {
            text += "; " + diagnostic.text;
        }
        return text;
    });
    std::filesystem::permissions(proc_.path("/17/ns"), perms::owner_all);
    EXPECT_EQ(other.output,
              "0 processes; cannot tell the links of process 17 (dhclient): Permission denied");
}

TEST_F(ProcessesTest, WhatIsNotAProcessIsNotLookedAt) {
    add("self", "dhclient", commandLine_);
    add("0", "dhclient", commandLine_);
    std::filesystem::create_directories(proc_.path("/21"));
    EXPECT_THAT(read().processes, IsEmpty());
}

// A client's name on a thread of the kernel shows whether it was looked at.
TEST_F(ProcessesTest, ThreadsOfTheKernelAreNotLookedAt) {
    proc_.write("/2/stat", "2 (k) thr ead) S 0 0 0 0 -1 2129984 0 0\n");
    proc_.write("/2/task/2/children", "17 4 ");
    add("4", "dhclient", commandLine_);
    add("17", "dhclient", commandLine_);
    add("174", "dhclient", commandLine_);
    const ClientFacts facts = read();
    ASSERT_EQ(facts.processes.size(), 1U);
    EXPECT_EQ(facts.processes[0].pid, 174);
}

TEST_F(ProcessesTest, ChildrenOfAProgramWithTheKernelsNumberAreLookedAt) {
    for (const char* status : {"2 (kthreadd) S 0 0 0 0 -1 4194560 0 0\n", "2 (kthreadd) S 0",
                               "2 kthreadd S 0 0 0 0 -1 2129984 0 0\n", ""}) {
        proc_.write("/2/stat", status);
        proc_.write("/2/task/2/children", "17 ");
        add("17", "dhclient", commandLine_);
        EXPECT_EQ(read().processes.size(), 1U) << status;
        std::filesystem::remove_all(proc_.path("/17"));
    }
}

TEST_F(ProcessesTest, AnyListOfThreadsOfTheKernelIsRead) {
    proc_.write("/2/stat", "2 (kthreadd) S 0 0 0 0 -1 2129984 0 0\n");
    add("17", "dhclient", commandLine_);
    EXPECT_EQ(read().processes.size(), 1U) << "the kernel need not tell";
    std::string many;
    for (int number = 100; number < 5'000; ++number) {
        many += std::to_string(number) + " ";
    }
    for (const std::string& children : {std::string{"x 17x  -3 99999999999 "}, many}) {
        proc_.write("/2/task/2/children", children);
        EXPECT_EQ(read().processes.size(), 1U);
        proc_.write("/2/task/2/children", children + "17 ");
        EXPECT_THAT(read().processes, IsEmpty());
    }
}

TEST(ProcessStatus, CapturedOfARealKernel) {
    const auto status = parseProcessStatus(File::read("/proc/self/status").value());
    ASSERT_TRUE(status);
    EXPECT_EQ(status->state, 'R');
    EXPECT_EQ(status->parent, ::getppid());
    EXPECT_EQ(status->realUser, ::getuid());
    EXPECT_EQ(status->user, ::geteuid());
    EXPECT_FALSE(status->hasEnded());
}

TEST(ProcessStatus, WhatIsMissingIsNotGuessed) {
    EXPECT_EQ(parseProcessStatus("State:\tZ (zombie)\nUid:\t1\t2\t3\t4\n"),
              (ProcessStatus{.state = 'Z', .parent = 0, .realUser = 1, .user = 2}));
    for (const char* text :
         {"", "State:\tS\n", "Uid:\t1\t2\t3\t4\n", "State:\nUid:\t1\t2\n", "State:\tS\nUid:\t1\n",
          "State:\tS\nUid:\tx\t2\n", "State:\tS\nUid:\t1\t4294967296\n"}) {
        EXPECT_EQ(parseProcessStatus(text), std::nullopt) << text;
    }
}

TEST_F(ProcessesTest, WhatHasEndedIsNotAClientWhateverItsNameAndArguments) {
    add("17", "dhclient", commandLine_);
    add("18", "NetworkManager", "");
    for (const char state : {'Z', 'X'}) {
        proc_.write("/17/status", status(state, 0, 0, 0));
        proc_.write("/18/status", status(state, 0, 0, 0));
        EXPECT_EQ(read(), ClientFacts{});
    }
}

TEST_F(ProcessesTest, AClientOfAnotherUserIsNotTrusted) {
    add("17", "dhclient", commandLine_);
    add("18", "NetworkManager", "");
    proc_.write("/17/status", status('S', 1000, 1000, 0));
    proc_.write("/18/status", status('S', 1000, 1000, 0));
    const ClientFacts facts = read();
    EXPECT_THAT(facts.processes, IsEmpty());
    EXPECT_THAT(facts.managers, IsEmpty());
    EXPECT_THAT(facts.hiddenClients, IsEmpty());
    EXPECT_THAT(facts.diagnostics,
                testing::UnorderedElementsAre(
                    Diagnostic{"process 17 (dhclient) is not trusted: user 1000 may not open the "
                               "sockets of a DHCP client",
                               Diagnostic::Kind::Untrusted},
                    Diagnostic{"process 18 (NetworkManager) is not trusted: user 1000 may not "
                               "open the sockets of a DHCP client",
                               Diagnostic::Kind::Untrusted}));
}

TEST_F(ProcessesTest, AForgedClientOfAnotherNamespaceIsNotWorthAWord) {
    add("17", "dhclient", commandLine_, "net:[2]");
    add("18", "NetworkManager", "", "net:[2]");
    proc_.write("/17/status", status('S', 1000, 1000, 0));
    proc_.write("/18/status", status('S', 1000, 1000, 0));
    EXPECT_EQ(read(), ClientFacts{});
}

TEST_F(ProcessesTest, ACapabilityCountsInOurOwnUserNamespaceOnly) {
    add("17", "dhclient", commandLine_);
    const auto found = [this] { return read().processes.size(); };
    const auto userNamespace = [this](const char* process, const char* name) {
        const std::string link = proc_.path(std::string{"/"} + process + "/ns/user");
        std::filesystem::remove(link);
        std::filesystem::create_symlink(name, link);
    };
    for (const int capability : {CAP_NET_RAW, CAP_NET_BIND_SERVICE, CAP_NET_ADMIN}) {
        proc_.write("/17/status", status('S', 1000, 1000, std::uint64_t{1} << capability));
        userNamespace("thread-self", "user:[1]");
        userNamespace("17", "user:[1]");
        EXPECT_EQ(found(), 1U);
        userNamespace("17", "user:[2]");
        EXPECT_EQ(found(), 0U);
        // Who may not read that reads which users there are.
        std::filesystem::remove(proc_.path("/17/ns/user"));
        EXPECT_EQ(found(), 0U);
        proc_.write("/thread-self/uid_map", "         0          0 4294967295\n");
        proc_.write("/17/uid_map", "         0       1000          1\n");
        EXPECT_EQ(found(), 0U);
        proc_.write("/17/uid_map", "         0          0 4294967295\n");
        EXPECT_EQ(found(), 1U);
        proc_.write("/17/uid_map", "");
        proc_.write("/thread-self/uid_map", "");
        EXPECT_EQ(found(), 0U);
    }
    userNamespace("17", "user:[1]");
    proc_.write("/17/status", status('S', 1000, 1000, std::uint64_t{1} << CAP_SYS_TIME));
    EXPECT_EQ(found(), 0U);
}

TEST_F(ProcessesTest, AProgramThatLendsItsRightsIsNotAClient) {
    add("17", "dhclient", commandLine_);
    proc_.write("/17/status", status('S', 1000, 0, ~std::uint64_t{0}));
    EXPECT_THAT(read().processes, IsEmpty());
    EXPECT_THAT(ZR::Testing::textsOf(read().diagnostics),
                ElementsAre("process 17 (dhclient) is not trusted: every user may start its "
                            "program, which is set-user-ID"));
    proc_.write("/17/status", status('S', 0, 0, 0));
    EXPECT_EQ(read().processes.size(), 1U);
    proc_.write("/17/exe", "");
    ASSERT_EQ(::chmod(proc_.path("/17/exe").c_str(), 04755), 0);
    EXPECT_THAT(read().processes, IsEmpty());
}

TEST_F(ProcessesTest, AProgramWithACapabilityIsTheClientItIsNamedAfter) {
    add("17", "dhclient", commandLine_);
    proc_.write("/17/status", status('S', 1000, 1000, std::uint64_t{1} << CAP_NET_RAW));
    for (const char* process : {"17", "thread-self"}) {
        std::filesystem::create_symlink("user:[1]",
                                        proc_.path(std::string{"/"} + process + "/ns/user"));
    }
    const auto found = [this](const char* program) {
        std::filesystem::remove(proc_.path("/17/exe"));
        std::filesystem::create_symlink(program, proc_.path("/17/exe"));
        return read().processes.size();
    };
    EXPECT_EQ(found("/usr/bin/ping"), 0U);
    EXPECT_EQ(found("/usr/sbin/dhclient"), 1U);
    EXPECT_EQ(found("/usr/sbin/dhclient (deleted)"), 1U);
    EXPECT_EQ(found("/bin/busybox"), 1U);
}

TEST_F(ProcessesTest, DhcpcdKeepsItsRightsInAnotherProcess) {
    add("20", "dhcpcd", "dhcpcd: eth1 [ip4] [ip6]");
    add("21", "dhcpcd", "dhcpcd: [privileged proxy] eth1 [ip4] [ip6]");
    proc_.write("/20/status", status('S', 102, 102, 0));
    proc_.write("/21/status", status('S', 0, 0, 0, 20));
    const ClientFacts facts = read();
    ASSERT_EQ(facts.processes.size(), 1U);
    EXPECT_EQ(facts.processes[0].pid, 20);
    EXPECT_EQ(facts.processes[0].user, 102U);
    EXPECT_THAT(ZR::Testing::textsOf(facts.diagnostics), IsEmpty());
    // So does a further one that has not taken its own title yet.
    add("22", "dhcpcd", "dhcpcd: eth1 [ip4] [ip6]");
    proc_.write("/22/status", status('S', 102, 102, 0, 20));
    EXPECT_EQ(read().processes.size(), 2U);
    std::filesystem::remove_all(proc_.path("/22"));
    // Another one of root has nothing to do with it.
    proc_.write("/21/status", status('S', 0, 0, 0, 1));
    EXPECT_THAT(read().processes, IsEmpty());
    // Only dhcpcd does so.
    proc_.write("/20/comm", "dhclient\n");
    proc_.write("/21/status", status('S', 0, 0, 0, 20));
    EXPECT_THAT(read().processes, IsEmpty());
}

TEST_F(ProcessesTest, ThePacketSocketsOfAClientNameItsLinks) {
    proc_.write("/thread-self/net/packet",
                "sk       RefCnt Type Proto  Iface R Rmem   User   Inode\n"
                "0 3      3    0003   5     1 0      0      501\n"
                "0 3      3    0003   6     1 0      0      502\n"
                "0 3      3    0806   7     1 0      0      503\n"
                "0 3      3    0003   8     1 0      0      504\n");
    const auto open = [this](const char* process, const char* descriptor, const char* what) {
        const std::string directory = proc_.path(std::string{"/"} + process + "/fd");
        std::filesystem::create_directories(directory);
        std::filesystem::create_symlink(what, directory + "/" + descriptor);
    };
    add("17", "dhclient", commandLine_);
    EXPECT_EQ(read().processes.at(0).heardLinks, std::nullopt);
    open("17", "0", "/dev/null");
    open("17", "3", "socket:[501]");
    open("17", "4", "socket:[503]");
    open("17", "5", "socket:[999]");
    open("17", "6", "socket:[501]");
    EXPECT_EQ(read().processes.at(0).heardLinks, std::vector<std::uint32_t>{5});
    std::filesystem::remove_all(proc_.path("/17"));

    // Of dhcpcd each link is heard by a process of its own.
    add("20", "dhcpcd", "dhcpcd: [manager] [ip4] [ip6]");
    add("21", "dhcpcd", "dhcpcd: [privileged proxy]");
    add("22", "dhcpcd", "dhcpcd: [BPF BOOTP] eth1");
    add("23", "dhcpcd", "dhcpcd: [BPF ARP] eth2 192.0.2.1");
    proc_.write("/21/status", status('S', 0, 0, 0, 20));
    proc_.write("/22/status", status('S', 102, 102, 0, 21));
    proc_.write("/23/status", status('S', 102, 102, 0, 21));
    open("20", "3", "/dev/null");
    open("21", "3", "/dev/null");
    open("22", "3", "socket:[502]");
    open("23", "3", "socket:[504]");
    EXPECT_EQ(read().processes.at(0).heardLinks, std::vector<std::uint32_t>{6});
}

/// A copy of sleep(1) that has the name of a client, started by a shell command that says
/// PROGRAM for it, and ended with the object.
class Impostor {
  public:
    Impostor(const std::string& name, std::string command) : path_(directory_.path("/" + name)) {
        run("chmod 755 " + directory_.path("") + " && cp /bin/sleep " + path_);
        command.replace(command.find("PROGRAM"), 7, path_ + " infinity");
        process_ = ::fork();
        if (process_ == 0) {
            ::execl("/bin/sh", "sh", "-c", ("exec " + command).c_str(), nullptr);
            ::_exit(127);
        }
        for (int i = 0; i < 500 && nameNow() != name + "\n"; ++i) {
            ::usleep(10'000);
        }
        EXPECT_EQ(nameNow(), name + "\n");
    }
    Impostor(const Impostor&) = delete;
    Impostor& operator=(const Impostor&) = delete;
    ~Impostor() {
        ::kill(process_, SIGKILL);
        ::waitpid(process_, nullptr, 0);
    }

    [[nodiscard]] pid_t process() const { return process_; }

  private:
    [[nodiscard]] std::string nameNow() const {
        return File::read("/proc/" + std::to_string(process_) + "/comm").value_or("");
    }

    TemporaryDirectory directory_;
    std::string path_;
    pid_t process_ = -1;
};

std::size_t clientsFound() {
    ClientFacts facts;
    readProcesses({}, facts);
    return facts.processes.size();
}

TEST(ForgedProcesses, OfARealKernel) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(60, [] {
        const std::string asNobody = "setpriv --reuid 65534 --regid 65534 --clear-groups ";
        for (const char* name : {"udhcpc", "dhclient", "dhcpcd", "dhcp6c", "NetworkManager"}) {
            const Impostor impostor{name, asNobody + "PROGRAM"};
            ClientFacts facts;
            readProcesses({}, facts);
            EXPECT_THAT(facts.processes, IsEmpty()) << name;
            EXPECT_THAT(facts.managers, IsEmpty()) << name;
            ASSERT_EQ(facts.diagnostics.size(), 1U) << name;
            EXPECT_EQ(facts.diagnostics[0].kind, Diagnostic::Kind::Untrusted) << name;
        }
        // Root of a user namespace has all capabilities there, and none here.
        {
            const Impostor impostor{"dhclient",
                                    asNobody + "unshare --user --map-root-user PROGRAM"};
            EXPECT_EQ(clientsFound(), 0U);
        }
        {
            const Impostor real{"dhclient", "PROGRAM"};
            EXPECT_EQ(clientsFound(), 1U);
            ::kill(real.process(), SIGKILL);
            siginfo_t ended{};
            ASSERT_EQ(::waitid(P_PID, static_cast<id_t>(real.process()), &ended, WEXITED | WNOWAIT),
                      0);
            EXPECT_EQ(clientsFound(), 0U) << "it has ended and was not waited for";
        }
        const Impostor capable{
            "dhclient",
            "setpriv --reuid 65534 --regid 65534 --clear-groups --inh-caps +net_raw "
            "--ambient-caps +net_raw PROGRAM"};
        EXPECT_EQ(clientsFound(), 1U);
    }));
}

/// The client that asks in vain on eth1, once it hears that link; none after some seconds.
std::optional<ClientProcess> askingClient(std::uint32_t ifindex) {
    for (int i = 0; i < 1000; ++i) {
        ClientFacts facts;
        readProcesses({}, facts);
        if (facts.diagnostics.empty() && facts.processes.size() == 1 &&
            facts.processes[0].heardLinks &&
            *facts.processes[0].heardLinks == std::vector{ifindex}) {
            return facts.processes[0];
        }
        ::usleep(10'000);
    }
    return std::nullopt;
}

void expectHeard(const char* program, const std::string& command) {
    if (::access(program, X_OK) != 0) {
        GTEST_SKIP() << "needs " << program;
    }
    EXPECT_TRUE(passesInNamespaces(60, [&] {
        run("mkdir -p /var/lib/dhcp /var/lib/dhcpcd && ip link add eth1 type veth peer name far && "
            "ip link set far up && ip link set eth1 up");
        const std::uint32_t ifindex = ::if_nametoindex("eth1");
        run(command + " </dev/null >/dev/null 2>&1 &");
        const auto client = askingClient(ifindex);
        ASSERT_TRUE(client) << command;
        EXPECT_EQ(client->interfaces, std::vector{"eth1"_name});
        if (client->client == Client::Dhclient) {
            run("ip link set eth1 name lan0");
            EXPECT_TRUE(askingClient(ifindex)) << "a link keeps its index";
        }
    }));
}

TEST(RealProcesses, DhclientIsHeardOnItsLink) {
    ZR_NEEDS_NAMESPACES();
    expectHeard("/usr/sbin/dhclient", "/usr/sbin/dhclient -d -sf /bin/true eth1");
}

TEST(RealProcesses, DhcpcdIsHeardOnItsLinkByAProcessOfItsOwn) {
    ZR_NEEDS_NAMESPACES();
    expectHeard("/usr/sbin/dhcpcd", "/usr/sbin/dhcpcd -B -4 -c /bin/true eth1");
}

TEST(RealProcesses, UdhcpcIsHeardOnItsLink) {
    ZR_NEEDS_NAMESPACES();
    // It listens only for a while after each of its requests.
    expectHeard("/usr/sbin/udhcpc", "/usr/sbin/udhcpc -f -s /bin/true -i eth1");
}

TEST(HiddenProcesses, OfARealKernel) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(60, [] {
        const Impostor client{"dhclient", "PROGRAM"};
        const auto asNobody = [] {
            return ZR::Testing::inChild([] {
                       if (::setgroups(0, nullptr) != 0 || ::setgid(65534) != 0 ||
                           ::setuid(65534) != 0) {
                           return std::string("cannot be another user");
                       }
                       ClientFacts facts;
                       readProcesses({}, facts);
                       std::ostringstream text;
                       text << facts.processes.size() << " clients, " << facts.hiddenClients.size()
                            << " hidden, " << (facts.processesHidden ? "more" : "no more");
                       for (const Diagnostic& diagnostic : facts.diagnostics) {
                           text << "; "
                                << (diagnostic.kind == Diagnostic::Kind::Denied ? "" : "not ")
                                << "denied: " << diagnostic.text;
                       }
                       return text.str();
                   })
                .output;
        };
        EXPECT_EQ(asNobody(),
                  "0 clients, 1 hidden, no more; denied: cannot tell the links of "
                  "process " +
                      std::to_string(client.process()) + " (dhclient): Permission denied");
        for (const char* option : {"2", "1"}) {
            run(std::string{"mount -o remount,hidepid="} + option + " /proc");
            EXPECT_EQ(asNobody(),
                      "0 clients, 0 hidden, more; denied: /proc hides the processes of "
                      "other users: a DHCP client among them is not seen");
            EXPECT_EQ(clientsFound(), 1U) << "nothing is hidden from root";
        }
    }));
}

TEST_F(ProcessesTest, WhatABuildDoesNotReadIsHiddenAndTold) {
    add("11", "dhcpcd", "dhcpcd: eth1 [ip4] [ip6]");
    add("12", "dhcpcd", "dhcpcd: [BPF BOOTP] eth1");
    add("13", "busybox", std::string{"busybox\0udhcpc\0-i\0eth3\0", 23});
    add("14", "busybox", std::string{"busybox\0sh\0", 11});
    add("15", "NetworkManager", "");
    add("16", "dhclient", commandLine_);
    add("17", "connmand", "", "net:[2]");
    ClientFacts facts;
    readProcessesExcept(
        std::array{Client::Dhcpcd, Client::Udhcpc, Client::NetworkManager, Client::Connman},
        {.files = "", .proc = proc_.path()}, facts);
    std::vector<std::pair<Client, std::int32_t>> hidden;
    for (const ClientProcess& process : facts.hiddenClients) {
        EXPECT_THAT(process.interfaces, IsEmpty()) << "any link may be its";
        hidden.emplace_back(process.client, process.pid);
    }
    EXPECT_THAT(hidden, testing::UnorderedElementsAre(
                            std::pair{Client::Dhcpcd, 11}, std::pair{Client::Dhcpcd, 12},
                            std::pair{Client::Udhcpc, 13}, std::pair{Client::NetworkManager, 15}));
    EXPECT_THAT(facts.processes, ElementsAre(testing::Field(&ClientProcess::pid, 16)));
    EXPECT_THAT(facts.managers, IsEmpty()) << "what is not read is not asked either";
    const std::string rest =
        " runs, which this build does not read: on which links it uses DHCP cannot be told";
    EXPECT_THAT(ZR::Testing::textsOf(facts.diagnostics),
                testing::UnorderedElementsAre("dhcpcd" + rest, "dhcpcd" + rest, "udhcpc" + rest,
                                              "NetworkManager" + rest));
    EXPECT_THAT(facts.diagnostics,
                testing::Each(testing::Field(&ZR::Diagnostic::kind, ZR::Diagnostic::Kind::Note)));
}

TEST_F(ProcessesTest, WithoutAProcessFileSystemThereIsAReason) {
    ClientFacts facts;
    readProcesses({.files = "", .proc = proc_.path("/none")}, facts);
    EXPECT_THAT(ZR::Testing::textsOf(facts.diagnostics),
                ElementsAre("cannot read " + proc_.path("/none") + ": No such file or directory"));
}

}  // namespace
}  // namespace ZR::Live
