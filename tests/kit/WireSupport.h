#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <cstdint>
#include <functional>
#include <mutex>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "cimxml/XmlDocument.h"
#include "kit/ElementTable.h"
#include "kit/TestManager.h"
#include "wbem/Server.h"

namespace cimom::test {

/// The body of a request for an intrinsic operation; `parameters` are IPARAMVALUEs.
std::string callXml(const std::string& method, const std::string& parameters,
                    const std::string& nameSpace = "root/test");
std::string parameter(const std::string& name, const std::string& value);
/// Parameters of the usual kinds.
std::string classParameter(const std::string& className, const std::string& name = "ClassName");
std::string valueParameter(const std::string& name, const std::string& value);
std::string listParameter(const std::string& name, const std::vector<std::string>& values);
/// INSTANCENAME of a class with the key Id.
std::string instanceName(const std::string& className, const std::string& id);

/// The parsed body, which must be of the structure of DSP0203.
wbem::XmlElement checked(const std::string& body);
/// SIMPLERSP's only child: IMETHODRESPONSE or METHODRESPONSE.
wbem::XmlElement responseOf(const std::string& body);
/// "CODE DESCRIPTION", or empty for a response without ERROR.
std::string errorOf(const wbem::XmlElement& response);
/// The elements in IRETURNVALUE.
std::vector<wbem::XmlElement> returned(const wbem::XmlElement& response);
/// The text of an output parameter.
std::string output(const wbem::XmlElement& response, const std::string& name);

struct HttpResponse {
    unsigned status = 0;
    std::vector<std::pair<std::string, std::string>> headers;
    std::string body;

    /// Empty when there is no such header.
    [[nodiscard]] std::string header(const std::string& name) const;
};

/// A client that sends whatever a test wants to.
class RawClient {
  public:
    /// `from`: the loopback address that it has.
    explicit RawClient(std::uint16_t port, const char* from = "127.0.0.1");
    ~RawClient();
    RawClient(RawClient&& other) noexcept : fd_(std::exchange(other.fd_, -1)) {}
    RawClient(const RawClient&) = delete;
    RawClient& operator=(const RawClient&) = delete;

    /// False when the server has closed the connection.
    bool send(const std::string& bytes);
    /// The next response; none when the connection ends before it is whole. The body of
    /// a good one must be of the structure of DSP0203.
    std::optional<HttpResponse> receive();
    /// Likewise, with any body, which may be compressed.
    std::optional<HttpResponse> receiveAny();
    /// Waits until a response begins to arrive, and reads nothing of it.
    bool awaitResponse();
    /// Whether anything of a response arrives in that time; reads nothing of it.
    bool isRespondedWithin(std::chrono::milliseconds time);
    /// Waits for the server to close the connection; false after ten seconds.
    bool waitForEnd();

  private:
    std::optional<std::string> line();
    bool fill();

    int fd_;
    std::string buffered_;
};

/// The head of a good request, up to and with the empty line.
std::string headFor(const std::string& method, const std::string& length,
                    const std::string& further = "");
/// A good request with that body.
std::string httpRequest(const std::string& method, const std::string& body,
                        const std::string& further = "");

/// The provider of many instances and of operations that do not return by
/// themselves: its classes are Many_Thing, Many_Waiting and Many_Endless, which goes
/// on delivering, whatever it is told.
Configuration manyConfiguration();
/// How many instances of Many_Thing there are from now on.
void setManyThings(unsigned count);
/// Makes operations on Many_Waiting and Many_Endless wait until they are released.
void holdWaiting();
/// How many operations were waiting.
unsigned releaseWaiting();
/// Waits until so many operations wait.
void awaitWaiting(unsigned count);

/// A server for the test providers, and the lines that it logs.
class TestServer {
  public:
    explicit TestServer(wbem::ServerSettings settings = {},
                        const std::string& registrations = "test.reg");
    /// `prepare` gets the manager before the server listens; empty: nothing is prepared.
    TestServer(wbem::ServerSettings settings, Configuration configuration,
               const std::function<void(ObjectManager&)>& prepare = nullptr);

    [[nodiscard]] std::uint16_t port() const { return server_.port(); }
    /// Sends a request over a connection of its own. Fails the test when there is no response.
    HttpResponse ask(const std::string& request);
    /// The response to an operation, which must have been carried out.
    wbem::XmlElement call(const std::string& method, const std::string& parameters,
                          const std::string& nameSpace = "root/test");
    /// To change what can be changed while it runs.
    [[nodiscard]] wbem::Server& running() noexcept { return server_; }
    /// What was logged of that kind so far.
    std::vector<std::string> log(wbem::LogKind kind);

  private:
    static wbem::ServerSettings onFreePort(wbem::ServerSettings settings);

    ObjectManager manager_;
    std::mutex mutex_;
    std::vector<std::pair<wbem::LogKind, std::string>> log_;
    wbem::Server server_;
};

}  // namespace cimom::test
