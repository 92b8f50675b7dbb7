// Where servers are and who may ask them: the first line is a URL, all lines are a list
// of them, and the whole is a file of credentials.
#include "client/ServerUrl.h"

#include <sstream>

#include "Input.h"
#include "client/Credentials.h"
#include "text/Failure.h"

namespace {

/// Whether a user, maybe with a password, stands before the host.
bool hasPassword(const std::string& text) {
    const std::size_t scheme = text.find("://");
    const std::size_t start = scheme == std::string::npos ? 0 : scheme + 3;
    return text.substr(0, text.find('/', start)).find('@') != std::string::npos;
}

void checkUrl(const std::string& text) {
    try {
        const cimdhcp::ServerUrl url = cimdhcp::readServerUrl(text);
        fuzz::require(
            url.given == text && !url.host.empty() && url.port != 0 && url.path.starts_with('/'),
            "a URL is whole");
        cimdhcp::ServerUrl again = cimdhcp::readServerUrl(url.text());
        again.given = url.given;
        fuzz::require(again == url, "a URL survives being written");
    } catch (const cimdhcp::Failure& failure) {
        fuzz::require(failure.status() == cimdhcp::ExitStatus::usage, "what is wrong is the usage");
        fuzz::require(
            !hasPassword(text) || std::string(failure.what()).find(text) == std::string::npos,
            "a password is not repeated");
    }
}

void checkList(const std::string& text) {
    std::istringstream lines(text);
    try {
        const auto servers = cimdhcp::readServers(lines, "hosts");
        fuzz::require(servers.size() <= fuzz::fields(text, '\n').size(), "a line is one server");
    } catch (const cimdhcp::Failure& failure) {
        fuzz::require(std::string_view(failure.what()).find('\n') == std::string_view::npos,
                      "what is wrong is told in one line");
    }
}

/// A word in quotes.
std::string quoted(const std::string& word) {
    std::string text = "\"";
    for (const char letter : word) {
        text +=
            letter == '"' || letter == '\\' ? std::string{'\\', letter} : std::string(1, letter);
    }
    return text + '"';
}

void checkCredentials(std::string_view text) {
    std::vector<cimdhcp::Credential> credentials;
    try {
        credentials = cimdhcp::parseCredentials(text, "credentials");
    } catch (const cimdhcp::Failure& failure) {
        fuzz::require(std::string_view(failure.what()).find('\n') == std::string_view::npos,
                      "what is wrong is told in one line");
        return;
    }
    std::string again;
    bool plain = true;
    for (const cimdhcp::Credential& credential : credentials) {
        // No URL has such a host, and none is written as it was read.
        plain = plain && !credential.host.empty() &&
                credential.host.find_first_of("[]") == std::string::npos;
        const bool brackets = credential.host.find(':') != std::string::npos;
        again += "machine " +
                 quoted((brackets ? '[' + credential.host + ']' : credential.host) +
                        (credential.port ? ':' + std::to_string(*credential.port) : "")) +
                 " login " + quoted(credential.user) + " password " + quoted(credential.password) +
                 '\n';
        const auto port = credential.port.value_or(1);
        fuzz::require(cimdhcp::credentialFor(credentials, credential.host, port) != nullptr,
                      "a host has a credential");
    }
    fuzz::require(!plain || cimdhcp::parseCredentials(again, "credentials") == credentials,
                  "credentials survive being written");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    checkUrl(std::string(text.substr(0, text.find('\n'))));
    checkList(std::string(text));
    checkCredentials(text);
    return 0;
}
