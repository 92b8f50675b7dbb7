// The live machine against a real kernel whose responses are lost, cut, forged or refused
// on their way. What the kernel says is real; what becomes of it is done between the
// kernel and the C library.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <linux/netlink.h>
#include <linux/rtnetlink.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <random>

#include "LinuxSupport.h"
#include "LiveMachine.h"
#include "kit/Namespaces.h"
#include "kit/SystemCalls.h"
#include "zrcommon/UniqueFd.h"

namespace ZR::Live {
namespace {

using NodeLexicon::Properties;
using Testing::Call;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using Testing::SystemCalls;

nlmsghdr headerOf(std::span<const std::byte> message) {
    nlmsghdr header{};
    std::memcpy(&header, message.data(), sizeof header);
    return header;
}

void setHeader(std::span<std::byte> message, const nlmsghdr& header) {
    std::memcpy(message.data(), &header, sizeof header);
}

/// The messages of one datagram, in place.
std::vector<std::span<std::byte>> messagesIn(std::span<std::byte> bytes) {
    std::vector<std::span<std::byte>> messages;
    while (bytes.size() >= sizeof(nlmsghdr)) {
        const std::size_t length = headerOf(bytes).nlmsg_len;
        if (length < sizeof(nlmsghdr) || length > bytes.size()) {
            break;
        }
        messages.push_back(bytes.first(length));
        bytes = bytes.subspan(std::min<std::size_t>(NLMSG_ALIGN(length), bytes.size()));
    }
    return messages;
}

/// Hands each datagram of a response, with its number from 0, to a function that may
/// change its bytes and returns how many there are now.
using Change = std::function<std::size_t(std::span<std::byte> bytes, unsigned number)>;

SystemCalls::Receive changing(Change change) {
    return [change = std::move(change), number = 0U](int fd, msghdr* message, int flags) mutable {
        const ssize_t got = SystemCalls::reallyReceive(fd, message, flags);
        if (got <= 0) {
            return got;
        }
        auto* const bytes = static_cast<std::byte*>(message->msg_iov->iov_base);
        return static_cast<ssize_t>(change({bytes, static_cast<std::size_t>(got)}, number++));
    };
}

/// A machine with two bridges that have an address each.
class Kernel {
  public:
    Kernel() {
        for (const char* const bridge : {"br0", "br1"}) {
            run(std::string{"ip link add "} + bridge + " type bridge");
        }
        run("ip addr add 192.0.2.1/24 dev br0 && ip addr add 192.0.2.2/24 dev br1");
    }

    /// Reads while the calls are as `prepare` makes them.
    std::shared_ptr<const Snapshot> read(const std::function<void(SystemCalls&)>& prepare) {
        // A kernel that is busy elsewhere may be late by itself, which is another matter.
        diagnostics_.clear();
        for (int attempt = 1;; ++attempt) {
            const auto before = static_cast<std::ptrdiff_t>(diagnostics_.size());
            const auto tree = [&] {
                SystemCalls calls;
                prepare(calls);
                return machine_.read();
            }();
            // A trouble that lasts is told once.
            const bool late = diagnostic().find("in time") != std::string::npos ||
                              diagnostic().find("timed out") != std::string::npos;
            if (!late || attempt == 4) {
                return tree;
            }
            if (!machine_.changed()) {
                diagnostics_.erase(diagnostics_.begin(), diagnostics_.begin() + before);
                return tree;
            }
        }
    }
    std::shared_ptr<const Snapshot> read(const SystemCalls::Receive& receive) {
        return read([&](SystemCalls& calls) { calls.onReceive(receive); });
    }

    /// What can be told of the machine although something went wrong is right.
    void expectRight(const Snapshot& tree) const {
        EXPECT_THAT(interfaceNames(tree), ElementsAre("br0", "br1")) << diagnostic();
        EXPECT_EQ(valueOf(tree, "br0", Properties::IPv4Address), PropertyValue{"192.0.2.1"});
        EXPECT_EQ(valueOf(tree, "br1", Properties::IPv4Address), PropertyValue{"192.0.2.2"});
    }

    /// Nothing is told, for a reason, and the trouble is not kept longer than it lasts.
    void expectNothing(const Snapshot& tree, const std::string& reason) {
        EXPECT_THAT(interfaceNames(tree), IsEmpty());
        EXPECT_THAT(diagnostic(), HasSubstr(reason));
        expectRecovered();
    }
    void expectRecovered() {
        EXPECT_TRUE(machine_.changed()) << "it would go on telling this";
        expectRight(*read([](SystemCalls&) {}));
        EXPECT_EQ(diagnostic(), "");
        EXPECT_FALSE(machine_.changed());
    }

    [[nodiscard]] std::string diagnostic() const {
        std::string all;
        for (const std::string& each : diagnostics_) {
            all += each + '\n';
        }
        return all;
    }
    [[nodiscard]] bool changed() { return machine_.changed(); }

  private:
    static Surroundings surroundings(std::vector<std::string>& diagnostics) {
        Surroundings result;
        result.report = [&diagnostics](std::string_view text) { diagnostics.emplace_back(text); };
        return result;
    }

    std::vector<std::string> diagnostics_;
    LiveMachine machine_{surroundings(diagnostics_)};
};

/// Runs the body with a machine of its own, where that is possible.
void withKernel(const std::function<void(Kernel&)>& body) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(110, [&] {
        Kernel kernel;
        body(kernel);
    }));
}

TEST(NetlinkFaults, WithoutAnyTheCallsReallyPass) {
    withKernel([](Kernel& kernel) {
        const auto tree = kernel.read([](SystemCalls&) {});
        kernel.expectRight(*tree);
        EXPECT_EQ(kernel.diagnostic(), "");
        unsigned received = 0;
        unsigned sent = 0;
        kernel.read([&](SystemCalls& calls) {
            calls.onReceive([&](int fd, msghdr* message, int flags) {
                ++received;
                return SystemCalls::reallyReceive(fd, message, flags);
            });
            calls.onSend([&](int fd, const void* bytes, std::size_t size) {
                ++sent;
                return SystemCalls::reallySend(fd, bytes, size);
            });
        });
        EXPECT_EQ(sent, 2U);
        EXPECT_GE(received, 2U);
    });
}

/// Leaves the kernel so little room that it must cut what it says.
SystemCalls::Receive cutting(unsigned times) {
    return [left = times](int fd, msghdr* message, int flags) mutable {
        const std::size_t room = message->msg_iov->iov_len;
        if (left > 0) {
            --left;
            message->msg_iov->iov_len = 64;
        }
        const ssize_t got = SystemCalls::reallyReceive(fd, message, flags);
        message->msg_iov->iov_len = room;
        return got;
    };
}

TEST(NetlinkFaults, ADatagramThatWasCutIsAskedForAgain) {
    withKernel([](Kernel& kernel) {
        kernel.expectRight(*kernel.read(cutting(1)));
        kernel.expectRight(*kernel.read(cutting(2)));
    });
}

TEST(NetlinkFaults, DatagramsThatAreCutAgainAndAgainGiveNothing) {
    withKernel([](Kernel& kernel) {
        kernel.expectNothing(*kernel.read(cutting(UINT32_MAX)),
                             "the response is longer than the buffer");
    });
}

SystemCalls::Receive interrupting(unsigned datagrams) {
    return changing([datagrams](std::span<std::byte> bytes, unsigned number) {
        for (const auto message : messagesIn(bytes)) {
            auto header = headerOf(message);
            header.nlmsg_flags |= number < datagrams ? NLM_F_DUMP_INTR : 0;
            setHeader(message, header);
        }
        return bytes.size();
    });
}

TEST(NetlinkFaults, AnInterruptedDumpIsAskedForAgain) {
    withKernel([](Kernel& kernel) {
        kernel.expectRight(*kernel.read(interrupting(1)));
        EXPECT_EQ(kernel.diagnostic(), "");
    });
}

TEST(NetlinkFaults, DumpsThatAreAlwaysInterruptedAreToldAndReadAgain) {
    withKernel([](Kernel& kernel) {
        kernel.expectRight(*kernel.read(interrupting(UINT32_MAX)));
        EXPECT_THAT(kernel.diagnostic(), HasSubstr("changed while they were read"));
        kernel.expectRecovered();
    });
}

TEST(NetlinkFaults, AnOverrunOfTheSocketIsAskedForAgain) {
    withKernel([](Kernel& kernel) {
        for (unsigned call = 1; call <= 4; ++call) {
            SCOPED_TRACE(call);
            kernel.expectRight(*kernel.read(
                [call](SystemCalls& calls) { calls.fail(Call::recvmsg, call, ENOBUFS); }));
        }
        kernel.expectNothing(
            *kernel.read([](SystemCalls& calls) { calls.fail(Call::recvmsg, 1, ENOBUFS, 100); }),
            "parts of the response were lost");
    });
}

TEST(NetlinkFaults, InterruptionsBySignalsAndEarlyWakingChangeNothing) {
    withKernel([](Kernel& kernel) {
        for (const Call call : {Call::recvmsg, Call::sendto}) {
            kernel.expectRight(
                *kernel.read([call](SystemCalls& calls) { calls.fail(call, 1, EINTR, 5); }));
            EXPECT_EQ(kernel.diagnostic(), "") << nameOf(call);
        }
        kernel.expectRight(
            *kernel.read([](SystemCalls& calls) { calls.fail(Call::recvmsg, 1, EAGAIN, 5); }));
        EXPECT_EQ(kernel.diagnostic(), "");
    });
}

TEST(NetlinkFaults, WaitingForNothingEnds) {
    withKernel([](Kernel& kernel) {
        // Nothing is ever there although poll() says so.
        kernel.expectNothing(*kernel.read([](SystemCalls& calls) {
            calls.fail(Call::recvmsg, 1, EAGAIN, UINT32_MAX - 1);
        }),
                             "no response");
        // No response comes, and each wait is interrupted.
        kernel.expectNothing(*kernel.read([](SystemCalls& calls) {
            calls.onSend(
                [](int, const void*, std::size_t size) { return static_cast<ssize_t>(size); });
            calls.fail(Call::poll, 1, EINTR, UINT32_MAX - 1);
        }),
                             "no response");
        kernel.expectNothing(*kernel.read([](SystemCalls& calls) {
            calls.onSend(
                [](int, const void*, std::size_t size) { return static_cast<ssize_t>(size); });
            calls.fail(Call::poll, 1, ENOMEM);
        }),
                             "no response");
    });
}

/// A message that another process forges: an interface that there is not.
void forge(int victim) {
    sockaddr_nl address{};
    socklen_t size = sizeof address;
    auto* const generic = static_cast<sockaddr*>(static_cast<void*>(&address));
    ASSERT_EQ(::getsockname(victim, generic, &size), 0);
    const UniqueFd other{::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC, NETLINK_ROUTE)};
    // The first request of a reader has this number.
    for (std::uint32_t sequence = 1; sequence < 8; ++sequence) {
        auto message = linkMessage(77, "forged").bytes();
        auto header = headerOf(message);
        header.nlmsg_seq = sequence;
        setHeader(message, header);
        ASSERT_EQ(::sendto(other.get(), message.data(), message.size(), 0, generic, size),
                  static_cast<ssize_t>(message.size()))
            << std::strerror(errno);
    }
}

TEST(NetlinkFaults, WhatAnotherProcessSendsIsNotBelieved) {
    withKernel([](Kernel& kernel) {
        unsigned foreign = 0;
        bool sent = false;
        const auto tree = kernel.read([&](int fd, msghdr* message, int flags) {
            if (!sent) {
                sent = true;
                forge(fd);
            }
            const ssize_t got = SystemCalls::reallyReceive(fd, message, flags);
            const auto* const sender = static_cast<const sockaddr_nl*>(message->msg_name);
            foreign += got > 0 && sender->nl_pid != 0 ? 1U : 0U;
            return got;
        });
        EXPECT_GT(foreign, 0U) << "the forged messages came";
        kernel.expectRight(*tree);
    });
}

/// Puts a message with a code in the place of a datagram; it has the number of the
/// request that the datagram responds to.
SystemCalls::Receive saying(std::uint16_t type, std::int32_t code, unsigned times = 1) {
    return changing([=](std::span<std::byte> bytes, unsigned number) {
        if (number >= times) {
            return bytes.size();
        }
        auto header = headerOf(bytes);
        nlmsgerr error{.error = code, .msg = header};
        header.nlmsg_type = type;
        header.nlmsg_len = sizeof header + sizeof error;
        setHeader(bytes, header);
        std::memcpy(bytes.data() + sizeof header, &error, sizeof error);
        return std::size_t{header.nlmsg_len};
    });
}

TEST(NetlinkFaults, ARefusalIsNamed) {
    withKernel([](Kernel& kernel) {
        for (const int error :
             {EPERM, EACCES, EBUSY, ENOMEM, EINVAL, EOPNOTSUPP, ENODEV, EMSGSIZE}) {
            kernel.expectNothing(*kernel.read(saying(NLMSG_ERROR, -error)), std::strerror(error));
        }
        kernel.expectNothing(*kernel.read(saying(NLMSG_ERROR, INT32_MIN)), "refused");
        kernel.expectNothing(*kernel.read(saying(NLMSG_ERROR, 7)), "refused");
    });
}

TEST(NetlinkFaults, ADumpThatIsBrokenOffIsNone) {
    withKernel([](Kernel& kernel) {
        kernel.expectNothing(*kernel.read(saying(NLMSG_DONE, -EINTR)), "broken off");
        kernel.expectRight(*kernel.read(saying(NLMSG_OVERRUN, 0)));
        kernel.expectNothing(*kernel.read(saying(NLMSG_OVERRUN, 0, UINT32_MAX)),
                             "parts of the response were lost");
    });
}

/// Where the attributes of the messages of a datagram begin.
std::vector<std::span<std::byte>> attributesIn(std::span<std::byte> bytes) {
    std::vector<std::span<std::byte>> attributes;
    for (const auto message : messagesIn(bytes)) {
        const std::uint16_t type = headerOf(message).nlmsg_type;
        std::size_t at = NLMSG_HDRLEN;
        if (type == RTM_NEWLINK) {
            at += NLMSG_ALIGN(sizeof(ifinfomsg));
        } else if (type == RTM_NEWADDR) {
            at += NLMSG_ALIGN(sizeof(ifaddrmsg));
        } else {
            continue;
        }
        while (at + sizeof(nlattr) <= message.size()) {
            attributes.push_back(message.subspan(at));
            nlattr attribute{};
            std::memcpy(&attribute, attributes.back().data(), sizeof attribute);
            const std::size_t length = std::max(std::size_t{attribute.nla_len}, sizeof attribute);
            at += (length + 3) & ~std::size_t{3};
        }
    }
    return attributes;
}

TEST(NetlinkFaults, AttributesWhoseLengthCannotBeTrueCostTheirMessageOnly) {
    withKernel([](Kernel& kernel) {
        unsigned swept = 0;
        for (const auto length : std::array<std::uint16_t, 4>{0, 1, 3, 0xFFFF}) {
            for (unsigned datagram = 0; datagram < 4; ++datagram) {
                for (std::size_t position = 0;; ++position) {
                    bool altered = false;
                    const auto tree =
                        kernel.read(changing([&](std::span<std::byte> bytes, unsigned number) {
                            const auto attributes = attributesIn(bytes);
                            if (number == datagram && position < attributes.size()) {
                                altered = true;
                                std::memcpy(attributes[position].data(), &length, sizeof length);
                            }
                            return bytes.size();
                        }));
                    if (!altered) {
                        break;
                    }
                    ++swept;
                    EXPECT_THAT(kernel.diagnostic(), HasSubstr("malformed messages left out"));
                    for (const std::string& name : interfaceNames(*tree)) {
                        EXPECT_TRUE(name == "br0" || name == "br1") << name;
                        const auto address = valueOf(*tree, name, Properties::IPv4Address);
                        const PropertyValue right{name == "br0" ? "192.0.2.1" : "192.0.2.2"};
                        EXPECT_TRUE(address == PropertyValue{} || address == PropertyValue{""} ||
                                    address == right);
                    }
                    kernel.expectRecovered();
                }
            }
        }
        EXPECT_GT(swept, 400U);
        RecordProperty("positions", static_cast<int>(swept));
    });
}

TEST(NetlinkFaults, ADatagramMayEndAnywhere) {
    withKernel([](Kernel& kernel) {
        std::size_t whole = 0;
        kernel.read(changing([&](std::span<std::byte> bytes, unsigned number) {
            whole = number == 0 ? bytes.size() : whole;
            return bytes.size();
        }));
        ASSERT_GT(whole, 1000U);
        for (std::size_t size = 0; size < whole; size += 37) {
            SCOPED_TRACE(size);
            const auto tree =
                kernel.read(changing([size](std::span<std::byte> bytes, unsigned number) {
                    return number == 0 ? size : bytes.size();
                }));
            // No interface that there is not; those that were lost are missing.
            EXPECT_THAT(interfaceNames(*tree), ::testing::Each(::testing::AnyOf("br0", "br1")));
            if (size != 0) {
                kernel.expectRecovered();
            }
        }
    });
}

TEST(NetlinkFaults, AnyByteMayBeWrong) {
    withKernel([](Kernel& kernel) {
        std::mt19937 random(1);
        for (int round = 0; round < 400; ++round) {
            kernel.read(changing([&](std::span<std::byte> bytes, unsigned) {
                // Without the short one that ends a dump each reading would wait for it.
                for (int i = 0; i < 4 && bytes.size() > 100; ++i) {
                    bytes[random() % bytes.size()] = static_cast<std::byte>(random());
                }
                return bytes.size();
            }));
        }
        // A length of more than 2 GiB, which is negative to some.
        for (const std::uint32_t length : {0x80000000U, 0x80000010U, 0xFFFFFFFFU}) {
            const auto tree = kernel.read(changing([&](std::span<std::byte> bytes, unsigned) {
                auto header = headerOf(bytes);
                header.nlmsg_len = length;
                setHeader(bytes, header);
                return bytes.size();
            }));
            kernel.expectNothing(*tree, "network links: ");
        }
        kernel.expectRight(*kernel.read([](SystemCalls&) {}));
    });
}

TEST(NetlinkFaults, AnInterfaceThatGoesBetweenTheDumpsDoesNotStay) {
    withKernel([](Kernel& kernel) {
        const auto tree = kernel.read([](SystemCalls& calls) {
            calls.onSend([number = 0](int fd, const void* bytes, std::size_t size) mutable {
                if (++number == 2) {
                    run("ip link del br1");
                }
                return SystemCalls::reallySend(fd, bytes, size);
            });
        });
        // What was read of br1 was true at its time; its address was gone already.
        EXPECT_EQ(valueOf(*tree, "br0", Properties::IPv4Address), PropertyValue{"192.0.2.1"});
        EXPECT_EQ(valueOf(*tree, "br1", Properties::IPv4Address), PropertyValue{});
        EXPECT_TRUE(kernel.changed());
        EXPECT_THAT(interfaceNames(*kernel.read([](SystemCalls&) {})), ElementsAre("br0"));
        EXPECT_FALSE(kernel.changed());
    });
}

TEST(NetlinkFaults, ARequestThatIsSentInPartIsNone) {
    withKernel([](Kernel& kernel) {
        for (unsigned call = 1; call <= 2; ++call) {
            SCOPED_TRACE(call);
            const auto tree = kernel.read([call](SystemCalls& calls) {
                calls.fail(Call::sendto, call, SystemCalls::halfTransferred);
            });
            EXPECT_THAT(kernel.diagnostic(), HasSubstr("cannot be asked for"));
            EXPECT_EQ(interfaceNames(*tree).empty(), call == 1);
            kernel.expectRecovered();
        }
    });
}

TEST(NetlinkFaults, ARequestThatCannotBeSentIsNamed) {
    withKernel([](Kernel& kernel) {
        for (const int error : {EACCES, EAGAIN, EBADF, ECONNREFUSED, ECONNRESET, EFAULT, EINVAL,
                                EMSGSIZE, ENOBUFS, ENOMEM, ENOTCONN, EOPNOTSUPP, EPIPE}) {
            kernel.expectNothing(
                *kernel.read([error](SystemCalls& calls) { calls.fail(Call::sendto, 1, error); }),
                std::strerror(error));
        }
    });
}

TEST(NetlinkFaults, SignsThatCannotBeHeardAreLookedForOnceASecond) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(passesInNamespaces(60, [] {
        struct Fault {
            Call call;
            unsigned number;
        };
        for (const Fault fault :
             {Fault{Call::epoll_ctl, 1}, {Call::epoll_ctl, 2}, {Call::fcntl, 1}}) {
            Surroundings surroundings;
            surroundings.report = [](std::string_view /*text*/) {};
            LiveMachine machine(std::move(surroundings));
            static_cast<void>(machine.read());
            EXPECT_FALSE(machine.changed());
            SystemCalls calls;
            calls.fail(fault.call, fault.number, ENOMEM);
            const auto before = std::chrono::steady_clock::now();
            const ChangeSigns signs = machine.signs();
            EXPECT_TRUE(calls.failed());
            EXPECT_EQ(machine.changed(), fault.call == Call::epoll_ctl)
                << "what is not heard may have changed";
            EXPECT_EQ(static_cast<bool>(signs.descriptor), fault.call == Call::epoll_ctl);
            ASSERT_TRUE(signs.askAt.has_value());
            EXPECT_LE(*signs.askAt, before + std::chrono::seconds(10));
        }
    }));
}

TEST(NetlinkFaults, AFailingSubscriptionIsNoReasonToTrustWhatIsKnown) {
    withKernel([](Kernel& kernel) {
        kernel.expectRight(*kernel.read([](SystemCalls&) {}));
        for (const int error : {ENOBUFS, ENOMEM, EBADF, ECONNREFUSED, EFAULT, EINVAL, ENOTCONN}) {
            SCOPED_TRACE(error);
            ASSERT_FALSE(kernel.changed());
            run("ip link add br2 type bridge");
            {
                SystemCalls calls;
                calls.fail(Call::recv, 1, error);
                EXPECT_TRUE(kernel.changed());
            }
            EXPECT_THAT(interfaceNames(*kernel.read([](SystemCalls&) {})),
                        ElementsAre("br0", "br1", "br2"));
            run("ip link del br2");
            EXPECT_TRUE(kernel.changed());
            kernel.expectRight(*kernel.read([](SystemCalls&) {}));
        }
    });
}

}  // namespace
}  // namespace ZR::Live
