// The WBEM server over loopback: requests per second and their latency with 1, 8
// and 64 clients, on machines of 4 and 1,000 interfaces; the first byte of a response;
// and instances per second of a long result.
#include <arpa/inet.h>
#include <benchmark/benchmark.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <string_view>
#include <system_error>
#include <thread>
#include <utility>
#include <vector>

#include "cimom/ObjectManager.h"
#include "wbem/Server.h"

namespace {

using Clock = std::chrono::steady_clock;

constexpr std::string_view getInstanceBody =
    "<?xml version=\"1.0\"?><CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\"><MESSAGE ID=\"1\" "
    "PROTOCOLVERSION=\"1.0\"><SIMPLEREQ><IMETHODCALL NAME=\"GetInstance\"><LOCALNAMESPACEPATH>"
    "<NAMESPACE NAME=\"root\"/><NAMESPACE NAME=\"test\"/></LOCALNAMESPACEPATH><IPARAMVALUE "
    "NAME=\"InstanceName\"><INSTANCENAME CLASSNAME=\"Many_Thing\"><KEYBINDING NAME=\"Id\">"
    "<KEYVALUE>thing 0</KEYVALUE></KEYBINDING></INSTANCENAME></IPARAMVALUE></IMETHODCALL>"
    "</SIMPLEREQ></MESSAGE></CIM>";
constexpr std::string_view enumerateBody =
    "<?xml version=\"1.0\"?><CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\"><MESSAGE ID=\"1\" "
    "PROTOCOLVERSION=\"1.0\"><SIMPLEREQ><IMETHODCALL NAME=\"EnumerateInstances\">"
    "<LOCALNAMESPACEPATH><NAMESPACE NAME=\"root\"/><NAMESPACE NAME=\"test\"/></LOCALNAMESPACEPATH>"
    "<IPARAMVALUE NAME=\"ClassName\"><CLASSNAME NAME=\"Many_Thing\"/></IPARAMVALUE></IMETHODCALL>"
    "</SIMPLEREQ></MESSAGE></CIM>";

constexpr std::string_view endpointsBody =
    "<?xml version=\"1.0\"?><CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\"><MESSAGE ID=\"1\" "
    "PROTOCOLVERSION=\"1.0\"><SIMPLEREQ><IMETHODCALL NAME=\"EnumerateInstances\">"
    "<LOCALNAMESPACEPATH><NAMESPACE NAME=\"root\"/><NAMESPACE NAME=\"cimv2\"/>"
    "</LOCALNAMESPACEPATH><IPARAMVALUE NAME=\"ClassName\"><CLASSNAME "
    "NAME=\"QVXZR_DHCPProtocolEndpoint\"/></IPARAMVALUE></IMETHODCALL></SIMPLEREQ></MESSAGE>"
    "</CIM>";

std::string request(const std::string& method, std::string_view body,
                    const std::string& nameSpace = "root/test") {
    return "POST /cimom HTTP/1.1\r\nHost: localhost\r\nContent-Type: application/xml\r\n"
           "CIMOperation: MethodCall\r\nCIMMethod: " +
           method + "\r\nCIMObject: " + nameSpace +
           "\r\nContent-Length: " + std::to_string(body.size()) + "\r\n\r\n" + std::string(body);
}

/// A client on one connection, which only looks for the end of a response.
class Client {
  public:
    explicit Client(std::uint16_t port)
        : fd_(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)), buffer_(1U << 20U) {
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        address.sin_port = htons(port);
        if (::connect(fd_, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
            throw std::system_error(errno, std::generic_category(), "connect");
        }
    }
    ~Client() { ::close(fd_); }
    Client(const Client&) = delete;
    Client& operator=(const Client&) = delete;

    /// The bytes of the response. Its last element is the same for all responses.
    std::size_t ask(const std::string& bytes) {
        if (::send(fd_, bytes.data(), bytes.size(), MSG_NOSIGNAL) !=
            static_cast<ssize_t>(bytes.size())) {
            throw std::system_error(errno, std::generic_category(), "send");
        }
        constexpr std::string_view end = "</CIM>\n";
        // In chunks, more follows; it ends with an empty one.
        constexpr std::string_view chunkEnd = "</CIM>\n\r\n0\r\n\r\n";
        std::size_t total = 0;
        std::string tail;
        while (true) {
            const ssize_t got = ::recv(fd_, buffer_.data(), buffer_.size(), 0);
            firstByte_ = total == 0 ? Clock::now() : firstByte_;
            if (got <= 0) {
                throw std::system_error(errno, std::generic_category(), "recv");
            }
            total += static_cast<std::size_t>(got);
            const std::string_view piece(buffer_.data(), static_cast<std::size_t>(got));
            tail.append(piece.substr(piece.size() - std::min(piece.size(), chunkEnd.size())));
            if (tail.ends_with(chunkEnd) || (total < longResponse && tail.ends_with(end))) {
                return total;
            }
            tail.erase(0, tail.size() - std::min(tail.size(), chunkEnd.size()));
        }
    }

    /// When the last response began to arrive.
    [[nodiscard]] Clock::time_point firstByte() const noexcept { return firstByte_; }

  private:
    static constexpr std::size_t longResponse = 60000;
    Clock::time_point firstByte_;
    int fd_;
    std::vector<char> buffer_;
};

cimom::Configuration manyThings() {
    return {
        {WBEM_TEST_DIR "/schema"}, {WBEM_TEST_DIR "/many.reg"}, {BROKER_PROVIDER_DIR}, "localhost"};
}

/// The real provider on a machine of so many interfaces. A process has one machine,
/// so that each benchmark of another one runs in a process of its own.
cimom::Configuration machine(int interfaces) {
    const std::filesystem::path directory =
        std::filesystem::temp_directory_path() / ("server-benchmark-" + std::to_string(::getpid()));
    std::filesystem::create_directory(directory);
    std::ofstream tree(directory / "tree.json");
    tree
        << R"({"nodes": [{"type": "ComputerSystem", "description": "Computer", "properties": )"
           R"({"Name": "${HOSTNAME}"}, "children": [{"type": "Network", "description": "Network", )"
           R"("children": [)";
    for (int number = 0; number < interfaces; ++number) {
        tree << (number == 0 ? "" : ",")
             << R"({"type": "NetworkInterface", "description": "Ethernet interface", )"
                R"("properties": {"Name": "if)"
             << number
             << R"(", "DHCPEnabled": true, "AddressSource": 1, "InterfaceState": 1, )"
                R"("DHCPServerAddresses": ["192.0.2.1"]}})";
    }
    tree << "]}]}]}";
    tree.close();
    std::ofstream(directory / "platform.conf")
        << "INSTRUMENTATION_TREE=" << (directory / "tree.json").string() << "\nLOG_SINK=none\n";
    ::setenv("ZR_CONFIG", (directory / "platform.conf").c_str(), 1);
    return {{ZR_SOURCE_DIR "/schema"},
            {ZR_SOURCE_DIR "/schema/exact/DHCPClientProvider.registration"},
            {DHCP_PROVIDER_DIR},
            "localhost"};
}

struct Served {
    explicit Served(cimom::Configuration configuration) : manager(std::move(configuration)) {
        cimom::wbem::ServerSettings settings;
        settings.port = 0;
        server = std::make_unique<cimom::wbem::Server>(
            manager, settings, [](cimom::wbem::LogKind, const std::string&) {});
    }

    cimom::ObjectManager manager;
    std::unique_ptr<cimom::wbem::Server> server;
};

void countQuantiles(benchmark::State& state, std::vector<double> latencies) {
    std::sort(latencies.begin(), latencies.end());
    const auto quantile = [&latencies](double part) {
        return latencies[static_cast<std::size_t>(part *
                                                  static_cast<double>(latencies.size() - 1))];
    };
    state.counters["p50_us"] = quantile(0.5);
    state.counters["p99_us"] = quantile(0.99);
    state.counters["max_us"] = latencies.back();
}

double microseconds(Clock::duration duration) {
    return std::chrono::duration<double, std::micro>(duration).count();
}

/// Each client asks, one request after the other.
void askTogether(benchmark::State& state, const Served& served, const std::string& bytes,
                 std::size_t clients, std::size_t requestsEach) {
    std::vector<double> latencies;
    for (auto _ : state) {
        std::vector<std::vector<double>> times(clients);
        std::vector<std::thread> threads;
        for (std::size_t index = 0; index < clients; ++index) {
            threads.emplace_back([&, index] {
                Client client(served.server->port());
                times[index].reserve(requestsEach);
                for (std::size_t count = 0; count < requestsEach; ++count) {
                    const auto start = Clock::now();
                    client.ask(bytes);
                    times[index].push_back(microseconds(Clock::now() - start));
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
    countQuantiles(state, std::move(latencies));
}

void getInstances(benchmark::State& state) {
    const Served served(manyThings());
    askTogether(state, served, request("GetInstance", getInstanceBody),
                static_cast<std::size_t>(state.range(0)), 200);
}

/// The endpoints of a machine: interfaces, clients.
void enumerateEndpoints(benchmark::State& state) {
    const auto interfaces = static_cast<int>(state.range(0));
    const Served served(machine(interfaces));
    askTogether(state, served, request("EnumerateInstances", endpointsBody, "root/cimv2"),
                static_cast<std::size_t>(state.range(1)), interfaces > 100 ? 5 : 200);
}

/// From sending a request to the first byte of its response, which counts as the time.
void firstByteOfFourEndpoints(benchmark::State& state) {
    const Served served(machine(4));
    const std::string bytes = request("EnumerateInstances", endpointsBody, "root/cimv2");
    Client client(served.server->port());
    std::vector<double> latencies;
    for (auto _ : state) {
        const auto start = Clock::now();
        client.ask(bytes);
        latencies.push_back(microseconds(client.firstByte() - start));
        state.SetIterationTime(latencies.back() / 1e6);
    }
    countQuantiles(state, std::move(latencies));
}

void enumerateInstances(benchmark::State& state) {
    const Served served(manyThings());
    const auto count = static_cast<unsigned>(state.range(0));
    ::setenv("MANY_THINGS", std::to_string(count).c_str(), 1);
    const std::string bytes = request("EnumerateInstances", enumerateBody);
    Client client(served.server->port());
    std::size_t size = 0;
    for (auto _ : state) {
        size = client.ask(bytes);
    }
    state.SetItemsProcessed(state.iterations() * count);
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(size));
    state.counters["bytes_each"] = static_cast<double>(size) / count;
}

BENCHMARK(getInstances)->Arg(1)->Arg(8)->Arg(64)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(firstByteOfFourEndpoints)->UseManualTime()->Unit(benchmark::kMicrosecond);
BENCHMARK(enumerateEndpoints)
    ->ArgsProduct({{4, 1000}, {1, 8, 64}})
    ->ArgNames({"interfaces", "clients"})
    ->UseRealTime()
    ->Unit(benchmark::kMillisecond);
BENCHMARK(enumerateInstances)->Arg(100000)->UseRealTime()->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
