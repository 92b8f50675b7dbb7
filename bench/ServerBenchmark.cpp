// The WBEM server over loopback: requests per second and their latency with 1, 8
// and 64 clients, and instances per second of a long result.
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
#include <memory>
#include <string>
#include <string_view>
#include <system_error>
#include <thread>
#include <vector>

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

std::string request(const std::string& method, std::string_view body) {
    return "POST /cimom HTTP/1.1\r\nHost: localhost\r\nContent-Type: application/xml\r\n"
           "CIMOperation: MethodCall\r\nCIMMethod: " +
           method + "\r\nCIMObject: root/test\r\nContent-Length: " + std::to_string(body.size()) +
           "\r\n\r\n" + std::string(body);
}

/// A client on one connection, which only looks for the end of an answer.
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

    /// The bytes of the answer. Its last element is the same for all answers.
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
            if (got <= 0) {
                throw std::system_error(errno, std::generic_category(), "recv");
            }
            total += static_cast<std::size_t>(got);
            const std::string_view piece(buffer_.data(), static_cast<std::size_t>(got));
            tail.append(piece.substr(piece.size() - std::min(piece.size(), chunkEnd.size())));
            if (tail.ends_with(chunkEnd) || (total < longAnswer && tail.ends_with(end))) {
                return total;
            }
            tail.erase(0, tail.size() - std::min(tail.size(), chunkEnd.size()));
        }
    }

  private:
    static constexpr std::size_t longAnswer = 60000;
    int fd_;
    std::vector<char> buffer_;
};

struct Served {
    Served()
        : manager({{WBEM_TEST_DIR "/schema"},
                   {WBEM_TEST_DIR "/many.reg"},
                   {BROKER_PROVIDER_DIR},
                   "localhost"}) {
        cimom::wbem::ServerSettings settings;
        settings.port = 0;
        server = std::make_unique<cimom::wbem::Server>(
            manager, settings, [](cimom::wbem::LogKind, const std::string&) {});
    }

    cimom::ObjectManager manager;
    std::unique_ptr<cimom::wbem::Server> server;
};

/// Each client asks, one request after the other, for the time of one iteration.
void getInstances(benchmark::State& state) {
    const Served served;
    const std::string bytes = request("GetInstance", getInstanceBody);
    const auto clients = static_cast<std::size_t>(state.range(0));
    constexpr std::size_t requestsEach = 200;
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
                    times[index].push_back(
                        std::chrono::duration<double, std::micro>(Clock::now() - start).count());
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
    std::sort(latencies.begin(), latencies.end());
    const auto quantile = [&latencies](double part) {
        return latencies[static_cast<std::size_t>(part *
                                                  static_cast<double>(latencies.size() - 1))];
    };
    state.SetItemsProcessed(static_cast<std::int64_t>(latencies.size()));
    state.counters["p50_us"] = quantile(0.5);
    state.counters["p99_us"] = quantile(0.99);
    state.counters["max_us"] = latencies.back();
}

void enumerateInstances(benchmark::State& state) {
    const Served served;
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
BENCHMARK(enumerateInstances)->Arg(100000)->UseRealTime()->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
