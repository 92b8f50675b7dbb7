#include "kit/WireSupport.h"

#include <arpa/inet.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdlib>
#include <sstream>
#include <system_error>

#include "cimom/Names.h"

namespace cimom::test {

std::string parameter(const std::string& name, const std::string& value) {
    return "<IPARAMVALUE NAME=\"" + name + "\">" + value + "</IPARAMVALUE>";
}

std::string classParameter(const std::string& className, const std::string& name) {
    return parameter(name, "<CLASSNAME NAME=\"" + className + "\"/>");
}

std::string valueParameter(const std::string& name, const std::string& value) {
    return parameter(name, "<VALUE>" + value + "</VALUE>");
}

std::string listParameter(const std::string& name, const std::vector<std::string>& values) {
    std::string list = "<VALUE.ARRAY>";
    for (const std::string& value : values) {
        list += "<VALUE>" + value + "</VALUE>";
    }
    return parameter(name, list + "</VALUE.ARRAY>");
}

std::string instanceName(const std::string& className, const std::string& id) {
    return "<INSTANCENAME CLASSNAME=\"" + className +
           "\"><KEYBINDING NAME=\"Id\"><KEYVALUE VALUETYPE=\"string\">" + id +
           "</KEYVALUE></KEYBINDING></INSTANCENAME>";
}

std::string callXml(const std::string& method, const std::string& parameters,
                    const std::string& nameSpace) {
    std::string components;
    std::istringstream parts(nameSpace);
    for (std::string part; std::getline(parts, part, '/');) {
        components += "<NAMESPACE NAME=\"" + part + "\"/>";
    }
    return "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n<CIM CIMVERSION=\"2.0\" "
           "DTDVERSION=\"2.0\"><MESSAGE ID=\"17\" PROTOCOLVERSION=\"1.0\"><SIMPLEREQ>"
           "<IMETHODCALL NAME=\"" +
           method + "\"><LOCALNAMESPACEPATH>" + components + "</LOCALNAMESPACEPATH>" + parameters +
           "</IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>";
}

wbem::XmlElement checked(const std::string& body) {
    try {
        wbem::XmlElement element = wbem::readXml(body, 64);
        EXPECT_THAT(violations(element), testing::IsEmpty()) << body.substr(0, 2000);
        return element;
    } catch (const wbem::XmlError& error) {
        ADD_FAILURE() << error.what() << '\n' << body.substr(0, 2000);
        return {};
    }
}

wbem::XmlElement responseOf(const std::string& body) {
    const wbem::XmlElement cim = checked(body);
    if (cim.name != "CIM") {
        return {};
    }
    const wbem::XmlElement& message = cim.children.at(0);
    EXPECT_EQ(*message.attribute("ID"), "17");
    return message.children.at(0).children.at(0);
}

std::string errorOf(const wbem::XmlElement& response) {
    if (response.children.empty() || response.children[0].name != "ERROR") {
        return "";
    }
    return *response.children[0].attribute("CODE") + ' ' +
           *response.children[0].attribute("DESCRIPTION");
}

std::vector<wbem::XmlElement> returned(const wbem::XmlElement& response) {
    EXPECT_EQ(errorOf(response), "");
    if (response.children.empty() || response.children[0].name != "IRETURNVALUE") {
        ADD_FAILURE() << response.name << " without IRETURNVALUE";
        return {};
    }
    return response.children[0].children;
}

std::string output(const wbem::XmlElement& response, const std::string& name) {
    for (const wbem::XmlElement& child : response.children) {
        if (child.name == "PARAMVALUE" && *child.attribute("NAME") == name) {
            return child.children.at(0).text;
        }
    }
    ADD_FAILURE() << "no output parameter " << name;
    return "";
}

std::string HttpResponse::header(const std::string& name) const {
    for (const auto& [each, value] : headers) {
        if (sameName(each, name)) {
            return value;
        }
    }
    return "";
}

RawClient::RawClient(std::uint16_t port, const char* from)
    : fd_(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    address.sin_port = htons(port);
    // Nothing here takes that long, but a test must not hang.
    const timeval patience{60, 0};
    sockaddr_in own{};
    own.sin_family = AF_INET;
    own.sin_addr.s_addr = ::inet_addr(from);
    if (fd_ < 0 || ::bind(fd_, reinterpret_cast<const sockaddr*>(&own), sizeof own) != 0 ||
        ::setsockopt(fd_, SOL_SOCKET, SO_RCVTIMEO, &patience, sizeof patience) != 0 ||
        ::connect(fd_, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
        throw std::system_error(errno, std::generic_category(), "connect");
    }
}

RawClient::~RawClient() {
    if (fd_ >= 0) {
        ::close(fd_);
    }
}

bool RawClient::send(const std::string& bytes) {
    std::size_t sent = 0;
    while (sent < bytes.size()) {
        const ssize_t now = ::send(fd_, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
        if (now < 0) {
            return false;
        }
        sent += static_cast<std::size_t>(now);
    }
    return true;
}

bool RawClient::fill() {
    std::array<char, 65536> piece{};
    const ssize_t got = ::recv(fd_, piece.data(), piece.size(), 0);
    if (got > 0) {
        buffered_.append(piece.data(), static_cast<std::size_t>(got));
    }
    return got > 0;
}

bool RawClient::waitForEnd() {
    while (fill()) {
    }
    std::array<char, 1> byte{};
    const ssize_t got = ::recv(fd_, byte.data(), byte.size(), MSG_DONTWAIT);
    return got == 0 || (got < 0 && errno != EAGAIN && errno != EWOULDBLOCK);
}

std::optional<std::string> RawClient::line() {
    std::size_t end = 0;
    while ((end = buffered_.find("\r\n")) == std::string::npos) {
        if (!fill()) {
            return std::nullopt;
        }
    }
    std::string text = buffered_.substr(0, end);
    buffered_.erase(0, end + 2);
    return text;
}

std::optional<HttpResponse> RawClient::receive() {
    auto response = receiveAny();
    constexpr unsigned ok = 200;
    if (response && response->status == ok) {
        checked(response->body);
    }
    return response;
}

bool RawClient::awaitResponse() {
    std::array<char, 1> byte{};
    return ::recv(fd_, byte.data(), byte.size(), MSG_PEEK) == 1;
}

bool RawClient::isRespondedWithin(std::chrono::milliseconds time) {
    pollfd wanted{fd_, POLLIN, 0};
    return ::poll(&wanted, 1, static_cast<int>(time.count())) == 1 && awaitResponse();
}

std::optional<HttpResponse> RawClient::receiveAny() {
    HttpResponse response;
    auto status = line();
    while (status == "HTTP/1.1 100 Continue") {
        line();
        status = line();
    }
    if (!status || status->size() < 12) {
        return std::nullopt;
    }
    response.status = static_cast<unsigned>(std::stoul(status->substr(9, 3)));
    while (true) {
        const auto header = line();
        if (!header) {
            return std::nullopt;
        }
        if (header->empty()) {
            break;
        }
        const std::size_t colon = header->find(':');
        const std::size_t value = header->find_first_not_of(' ', colon + 1);
        response.headers.emplace_back(header->substr(0, colon),
                                      value == std::string::npos ? "" : header->substr(value));
    }
    const auto take = [this, &response](std::size_t length) {
        while (buffered_.size() < length) {
            if (!fill()) {
                return false;
            }
        }
        response.body += buffered_.substr(0, length);
        buffered_.erase(0, length);
        return true;
    };
    if (response.header("Transfer-Encoding") != "chunked") {
        const std::string length = response.header("Content-Length");
        return take(length.empty() ? 0 : std::stoul(length)) ? std::optional(response)
                                                             : std::nullopt;
    }
    while (true) {
        const auto size = line();
        if (!size) {
            return std::nullopt;
        }
        const std::size_t length = std::stoul(*size, nullptr, 16);
        if (length == 0) {
            line();
            return response;
        }
        if (!take(length) || !line()) {
            return std::nullopt;
        }
    }
}

std::string headFor(const std::string& method, const std::string& length,
                    const std::string& further) {
    return "POST /cimom HTTP/1.1\r\nHost: localhost\r\nContent-Type: application/xml; "
           "charset=\"utf-8\"\r\nCIMOperation: MethodCall\r\nCIMMethod: " +
           method + "\r\nCIMObject: root%2Ftest\r\n" +
           (length.empty() ? "" : "Content-Length: " + length + "\r\n") + further + "\r\n";
}

std::string httpRequest(const std::string& method, const std::string& body,
                        const std::string& further) {
    return headFor(method, std::to_string(body.size()), further) + body;
}

wbem::ServerSettings TestServer::onFreePort(wbem::ServerSettings settings) {
    if (!settings.port) {
        settings.port = 0;
    }
    return settings;
}

namespace {

/// Calls a function of the library, which stays loaded for the process.
template <typename... Arguments>
unsigned tellMany(const char* function, Arguments... arguments) {
    static const Library library(dlopen(BROKER_PROVIDER_DIR "/libManyProvider.so", RTLD_NOW),
                                 dlclose);
    using Function = unsigned (*)(Arguments...);
    return reinterpret_cast<Function>(dlsym(library.get(), function))(arguments...);
}

}  // namespace

Configuration manyConfiguration() {
    const std::filesystem::path here = WBEM_TEST_DIR;
    return {{here / "schema"}, {here / "many.reg"}, {BROKER_PROVIDER_DIR}, "testhost"};
}

void setManyThings(unsigned count) {
    tellMany("manySetCount", count);
}

void holdWaiting() {
    tellMany("manyHold");
}

unsigned releaseWaiting() {
    return tellMany("manyRelease");
}

void awaitWaiting(unsigned count) {
    tellMany("manyAwait", count);
}

TestServer::TestServer(wbem::ServerSettings settings, const std::string& registrations)
    : TestServer(std::move(settings), configuration(registrations)) {}

namespace {

ObjectManager& prepared(ObjectManager& manager,
                        const std::function<void(ObjectManager&)>& prepare) {
    if (prepare) {
        prepare(manager);
    }
    return manager;
}

}  // namespace

TestServer::TestServer(wbem::ServerSettings settings, Configuration configuration,
                       const std::function<void(ObjectManager&)>& prepare)
    : manager_(std::move(configuration)),
      server_(prepared(manager_, prepare), onFreePort(std::move(settings)),
              [this](wbem::LogKind kind, const std::string& line) {
                  const std::lock_guard lock(mutex_);
                  log_.emplace_back(kind, line);
              }) {}

HttpResponse TestServer::ask(const std::string& request) {
    RawClient client(port());
    client.send(request);
    auto response = client.receive();
    if (!response) {
        ADD_FAILURE() << "no response to " << request.substr(0, 500);
        return {};
    }
    return *std::move(response);
}

wbem::XmlElement TestServer::call(const std::string& method, const std::string& parameters,
                                  const std::string& nameSpace) {
    std::string request = httpRequest(method, callXml(method, parameters, nameSpace));
    const std::string object = "CIMObject: root%2Ftest";
    request.replace(request.find(object), object.size(), "CIMObject: " + nameSpace);
    const HttpResponse response = ask(request);
    EXPECT_EQ(response.status, 200U) << response.header("CIMError");
    return responseOf(response.body);
}

std::vector<std::string> TestServer::log(wbem::LogKind kind) {
    const std::lock_guard lock(mutex_);
    std::vector<std::string> lines;
    for (const auto& [each, line] : log_) {
        if (each == kind) {
            lines.push_back(line);
        }
    }
    return lines;
}

}  // namespace cimom::test
