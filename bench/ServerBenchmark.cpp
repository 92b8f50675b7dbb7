// The WBEM server over loopback, with the providers as a user has them: the gateway in
// front. What each kind of request costs on a machine of 1,000 interfaces, each beside the
// same bytes from memory through such a socket; requests on connections of their own; and how
// the endpoints' cost grows with interfaces and with clients.
//
// The figures of a request are of a connection that is kept. "us_each" is processor time of
// the process without that of its client, for each object of the response: all of the
// server's threads, its kernel's work included.

#include <arpa/inet.h>
#include <benchmark/benchmark.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <chrono>
#include <cstddef>
#include <ctime>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <system_error>
#include <thread>
#include <utility>
#include <vector>

#include "BenchmarkMachine.h"
#include "RunBenchmarks.h"
#include "cimom/ObjectManager.h"
#include "wbem/Server.h"
#include "zrcommon/SystemName.h"
#include "zrcommon/UniqueFd.h"

namespace {

using Clock = std::chrono::steady_clock;

std::string keyBinding(const std::string& name, const std::string& value) {
    return "<KEYBINDING NAME=\"" + name + "\"><KEYVALUE VALUETYPE=\"string\">" + value +
           "</KEYVALUE></KEYBINDING>";
}

std::string classParameter(const std::string& name, const std::string& className) {
    return "<IPARAMVALUE NAME=\"" + name + "\"><CLASSNAME NAME=\"" + className +
           "\"/></IPARAMVALUE>";
}

std::string objectParameter(const std::string& name, const std::string& className,
                            const std::string& keys) {
    return "<IPARAMVALUE NAME=\"" + name + "\"><INSTANCENAME CLASSNAME=\"" + className + "\">" +
           keys + "</INSTANCENAME></IPARAMVALUE>";
}

/// A request of an operation, as it goes over the wire.
std::string request(const std::string& operation, const std::string& parameters) {
    const std::string body =
        "<?xml version=\"1.0\"?><CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\"><MESSAGE ID=\"1\" "
        "PROTOCOLVERSION=\"1.0\"><SIMPLEREQ><IMETHODCALL NAME=\"" +
        operation +
        "\"><LOCALNAMESPACEPATH><NAMESPACE NAME=\"root\"/><NAMESPACE NAME=\"cimv2\"/>"
        "</LOCALNAMESPACEPATH>" +
        parameters + "</IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>";
    return "POST /cimom HTTP/1.1\r\nHost: localhost\r\nContent-Type: application/xml\r\n"
           "CIMOperation: MethodCall\r\nCIMMethod: " +
           operation +
           "\r\nCIMObject: root/cimv2\r\nContent-Length: " + std::to_string(body.size()) +
           "\r\n\r\n" + body;
}

std::string enumeration(const std::string& operation, const std::string& className) {
    return request(operation, classParameter("ClassName", className));
}

std::string endpointRequest(int number) {
    return request(
        "GetInstance",
        objectParameter("InstanceName", "QVXZR_DHCPProtocolEndpoint",
                        keyBinding("SystemCreationClassName", "QVXZR_ComputerSystem") +
                            keyBinding("SystemName", ZR::getSystemName()) +
                            keyBinding("CreationClassName", "QVXZR_DHCPProtocolEndpoint") +
                            keyBinding("Name", "eth" + std::to_string(number))));
}

sockaddr_in loopback(std::uint16_t port) {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    address.sin_port = htons(port);
    return address;
}

const sockaddr* generic(const sockaddr_in& address) {
    return reinterpret_cast<const sockaddr*>(&address);
}

[[noreturn]] void failIn(const char* call) {
    throw std::system_error(errno, std::generic_category(), call);
}

void sendAll(int fd, std::string_view bytes) {
    while (!bytes.empty()) {
        const ssize_t sent = ::send(fd, bytes.data(), bytes.size(), MSG_NOSIGNAL);
        if (sent <= 0) {
            failIn("send");
        }
        bytes.remove_prefix(static_cast<std::size_t>(sent));
    }
}

/// A client on one connection, which only looks for the end of a response.
class Client {
  public:
    explicit Client(std::uint16_t port)
        : fd_(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)), buffer_(256U << 10U) {
        const sockaddr_in address = loopback(port);
        if (::connect(fd_.get(), generic(address), sizeof address) != 0) {
            failIn("connect");
        }
    }

    /// The response is added to `record`, if there is one.
    void ask(const std::string& bytes, std::string* record = nullptr) {
        sendAll(fd_.get(), bytes);
        constexpr std::string_view end = "</CIM>\n";
        // In chunks, more follows; it ends with an empty one.
        constexpr std::string_view chunkEnd = "</CIM>\n\r\n0\r\n\r\n";
        std::string tail;
        bool chunked = false;
        for (bool first = true;; first = false) {
            const ssize_t got = ::recv(fd_.get(), buffer_.data(), buffer_.size(), 0);
            if (got <= 0) {
                failIn("recv");
            }
            const std::string_view piece(buffer_.data(), static_cast<std::size_t>(got));
            if (record != nullptr) {
                record->append(piece);
            }
            if (first) {
                const std::string_view head = piece.substr(0, piece.find("\r\n\r\n"));
                chunked = head.find("Content-Length") == std::string_view::npos;
            }
            tail.append(piece.substr(piece.size() - std::min(piece.size(), chunkEnd.size())));
            if (tail.ends_with(chunked ? chunkEnd : end)) {
                return;
            }
            tail.erase(0, tail.size() - std::min(tail.size(), chunkEnd.size()));
        }
    }

  private:
    ZR::UniqueFd fd_;
    std::vector<char> buffer_;
};

/// The server of a process, on its machine.
class Served {
  public:
    Served()
        : manager_({{ZR_SOURCE_DIR "/schema"},
                    {ZR_SOURCE_DIR "/schema/DHCPClient.registration"},
                    {DHCP_CLIENT_DIR},
                    "localhost"}) {
        cimom::wbem::ServerSettings settings;
        settings.port = 0;
        // All clients here have one address, and none of them is to be refused.
        settings.limits.connectionsEach = settings.limits.connections;
        settings.limits.connectionRate = settings.limits.connections;
        settings.limits.memory *= 8;
        server_ = std::make_unique<cimom::wbem::Server>(
            manager_, settings, [](cimom::wbem::LogKind, const std::string&) {});
    }

    [[nodiscard]] std::uint16_t port() const { return server_->port(); }

  private:
    cimom::ObjectManager manager_;
    std::unique_ptr<cimom::wbem::Server> server_;
};

/// Sends the same bytes for each request on its one connection.
class Recorded {
  public:
    Recorded(std::size_t requestSize, std::string response)
        : listening_(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
        sockaddr_in address = loopback(0);
        socklen_t size = sizeof address;
        if (::bind(listening_.get(), generic(address), size) != 0 ||
            ::listen(listening_.get(), 1) != 0 ||
            ::getsockname(listening_.get(), reinterpret_cast<sockaddr*>(&address), &size) != 0) {
            failIn("listen");
        }
        port_ = ntohs(address.sin_port);
        thread_ = std::thread(
            [this, requestSize, response = std::move(response)] { serve(requestSize, response); });
    }
    /// After the client has gone.
    ~Recorded() { thread_.join(); }
    Recorded(const Recorded&) = delete;
    Recorded& operator=(const Recorded&) = delete;

    [[nodiscard]] std::uint16_t port() const { return port_; }

  private:
    void serve(std::size_t requestSize, const std::string& response) const {
        const ZR::UniqueFd fd{::accept4(listening_.get(), nullptr, nullptr, SOCK_CLOEXEC)};
        std::array<char, 4096> buffer{};
        std::size_t missing = requestSize;
        for (;;) {
            const ssize_t got =
                ::recv(fd.get(), buffer.data(), std::min(missing, buffer.size()), 0);
            if (got <= 0) {
                return;
            }
            missing -= static_cast<std::size_t>(got);
            if (missing == 0) {
                sendAll(fd.get(), response);
                missing = requestSize;
            }
        }
    }

    ZR::UniqueFd listening_;
    std::uint16_t port_ = 0;
    std::thread thread_;
};

double microseconds(Clock::duration duration) {
    return std::chrono::duration<double, std::micro>(duration).count();
}

double processorTime(clockid_t clock) {
    timespec time{};
    ::clock_gettime(clock, &time);
    return static_cast<double>(time.tv_sec) * 1e6 + static_cast<double>(time.tv_nsec) / 1e3;
}

/// What others did in this process: the server, as the client runs on this thread.
double othersProcessorTime() {
    return processorTime(CLOCK_PROCESS_CPUTIME_ID) - processorTime(CLOCK_THREAD_CPUTIME_ID);
}

void countLatencies(benchmark::State& state, std::vector<double> latencies) {
    std::sort(latencies.begin(), latencies.end());
    const auto quantile = [&latencies](double part) {
        return latencies[static_cast<std::size_t>(part *
                                                  static_cast<double>(latencies.size() - 1))];
    };
    state.counters["min_us"] = latencies.front();
    state.counters["p50_us"] = quantile(0.5);
    state.counters["p99_us"] = quantile(0.99);
}

void askAgainAndAgain(benchmark::State& state, std::uint16_t port, const std::string& bytes,
                      int objects) {
    Client client(port);
    client.ask(bytes);
    std::vector<double> latencies;
    const double before = othersProcessorTime();
    for (auto _ : state) {
        const auto start = Clock::now();
        client.ask(bytes);
        latencies.push_back(microseconds(Clock::now() - start));
    }
    state.counters["us_each"] =
        (othersProcessorTime() - before) / static_cast<double>(latencies.size()) / objects;
    countLatencies(state, std::move(latencies));
}

/// A request on a machine of 1,000 interfaces, and how many objects its response has.
struct Row {
    std::string name;
    std::string bytes;
    int objects;
};

constexpr int interfaces = 1000;

std::vector<Row> rows() {
    const std::string system =
        objectParameter("ObjectName", "QVXZR_ComputerSystem",
                        keyBinding("CreationClassName", "QVXZR_ComputerSystem") +
                            keyBinding("Name", ZR::getSystemName()));
    return {
        {"endpoints", enumeration("EnumerateInstances", "QVXZR_DHCPProtocolEndpoint"), interfaces},
        {"capabilities", enumeration("EnumerateInstances", "QVXZR_DHCPCapabilities"), interfaces},
        {"endpoint names", enumeration("EnumerateInstanceNames", "QVXZR_DHCPProtocolEndpoint"),
         interfaces},
        {"hosted points of the system",
         request("AssociatorNames", system + classParameter("AssocClass", "QVXZR_HostedDHCPPoint")),
         interfaces},
        {"one endpoint", endpointRequest(interfaces / 2), 1},
        {"element setting data", enumeration("EnumerateInstances", "QVXZR_DHCPElementSettingData"),
         interfaces},
    };
}

/// Whether a response has so many objects, by an element that each has once. It is counted as
/// it came, in chunks whose ends may part an element.
bool hasObjects(const std::string& response, int wanted) {
    for (const std::string_view element :
         {"<VALUE.NAMEDINSTANCE>", "<OBJECTPATH>", "<INSTANCE ", "<INSTANCENAME "}) {
        int found = 0;
        for (auto at = response.find(element); at != std::string::npos;
             at = response.find(element, at + 1)) {
            ++found;
        }
        if (found != 0) {
            return found <= wanted && found * 100 > wanted * 95;
        }
    }
    return false;
}

void askServer(benchmark::State& state, const Row& row) {
    bench::setInterfaces(interfaces);
    const Served served;
    std::string response;
    Client(served.port()).ask(row.bytes, &response);
    if (!hasObjects(response, row.objects)) {
        state.SkipWithError("not as many objects as there are");
        return;
    }
    askAgainAndAgain(state, served.port(), row.bytes, row.objects);
}

void askRecorded(benchmark::State& state, const Row& row) {
    bench::setInterfaces(interfaces);
    std::string response;
    {
        const Served served;
        Client(served.port()).ask(row.bytes, &response);
    }
    const Recorded recorded(row.bytes.size(), std::move(response));
    askAgainAndAgain(state, recorded.port(), row.bytes, row.objects);
}

/// One endpoint of a machine that has no other, on a new connection.
void connectAndAsk(benchmark::State& state) {
    bench::setInterfaces(1);
    const Served served;
    const std::string bytes = endpointRequest(0);
    std::vector<double> latencies;
    for (auto _ : state) {
        const auto start = Clock::now();
        Client(served.port()).ask(bytes);
        latencies.push_back(microseconds(Clock::now() - start));
    }
    countLatencies(state, std::move(latencies));
}

void enumerateEndpoints(benchmark::State& state) {
    bench::setInterfaces(state.range(0));
    const Served served;
    askAgainAndAgain(state, served.port(),
                     enumeration("EnumerateInstances", "QVXZR_DHCPProtocolEndpoint"),
                     static_cast<int>(state.range(0)));
}

/// Each client asks for the four endpoints of a machine, one request after the other.
void askTogether(benchmark::State& state) {
    bench::setInterfaces(4);
    const Served served;
    const std::string bytes = enumeration("EnumerateInstances", "QVXZR_DHCPProtocolEndpoint");
    constexpr int requestsEach = 50;
    std::vector<double> latencies;
    for (auto _ : state) {
        std::vector<std::vector<double>> times(static_cast<std::size_t>(state.range(0)));
        std::vector<std::thread> threads;
        threads.reserve(times.size());
        for (std::vector<double>& own : times) {
            threads.emplace_back([&served, &bytes, &own] {
                Client client(served.port());
                for (int count = 0; count < requestsEach; ++count) {
                    const auto start = Clock::now();
                    client.ask(bytes);
                    own.push_back(microseconds(Clock::now() - start));
                }
            });
        }
        for (std::thread& thread : threads) {
            thread.join();
        }
        for (const auto& each : times) {
            latencies.insert(latencies.end(), each.begin(), each.end());
        }
    }
    state.SetItemsProcessed(static_cast<std::int64_t>(latencies.size()));
    countLatencies(state, std::move(latencies));
}

}  // namespace

int main(int argc, char** argv) {
    const bench::Machine machine;
    for (const Row& row : rows()) {
        benchmark::RegisterBenchmark(("from memory: " + row.name).c_str(), askRecorded, row)
            ->UseRealTime()
            ->Unit(benchmark::kMicrosecond);
        benchmark::RegisterBenchmark(("served: " + row.name).c_str(), askServer, row)
            ->UseRealTime()
            ->Unit(benchmark::kMicrosecond);
    }
    benchmark::RegisterBenchmark("served: one endpoint, new connection", connectAndAsk)
        ->UseRealTime()
        ->Unit(benchmark::kMicrosecond);
    benchmark::RegisterBenchmark("endpoints of interfaces", enumerateEndpoints)
        ->RangeMultiplier(10)
        ->Range(1, 10000)
        ->UseRealTime()
        ->Unit(benchmark::kMicrosecond);
    benchmark::RegisterBenchmark("clients together", askTogether)
        ->RangeMultiplier(4)
        ->Range(1, 256)
        ->UseRealTime()
        ->Unit(benchmark::kMillisecond);
    benchmark::ConsoleReporter reporter;
    return bench::run(argc, argv, reporter) ? 0 : 2;
}
