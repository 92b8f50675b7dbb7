#include "client/ServerUrl.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <iostream>
#include <sstream>
#include <string_view>

#include "text/DisplayText.h"
#include "text/Failure.h"
#include "zrcommon/File.h"

namespace cimdhcp {

ServerUrl readServerUrl(const std::string& text) {
    const std::size_t scheme = text.find("://");
    const std::size_t authority = scheme == std::string::npos ? 0 : scheme + 3;
    if (std::string_view(text).substr(0, text.find('/', authority)).find('@') !=
        std::string_view::npos) {
        // What is refused is not repeated: it holds a password.
        throw Failure(ExitStatus::usage,
                      "a URL cannot hold a user and a password: any user of this machine could "
                      "read them in the list of processes; put them into a file for --credentials");
    }
    try {
        ServerUrl url{
            cimom::wbem::readHttpUrl(scheme == std::string::npos ? "https://" + text : text), text};
        if (url.path.size() <= 1) {
            url.path = "/cimom";
        }
        return url;
    } catch (const cimom::wbem::UrlError& error) {
        throw Failure(ExitStatus::usage, '"' + printable(text) + "\": " + error.what());
    }
}

std::vector<ServerUrl> readServers(std::istream& lines, const std::string& name) {
    std::vector<ServerUrl> servers;
    std::string line;
    for (unsigned number = 1; std::getline(lines, line); ++number) {
        line.erase(std::min(line.find('#'), line.size()));
        constexpr const char* blanks = " \t\r";
        line.erase(0, line.find_first_not_of(blanks));
        line.erase(line.find_last_not_of(blanks) + 1);
        if (line.empty()) {
            continue;
        }
        try {
            servers.push_back(readServerUrl(line));
        } catch (const Failure& failure) {
            throw Failure(ExitStatus::notLoaded,
                          name + ": line " + std::to_string(number) + ": " + failure.what());
        }
    }
    if (servers.empty()) {
        throw Failure(ExitStatus::notLoaded, name + ": no server is named in it");
    }
    return servers;
}

std::vector<ServerUrl> readServersFile(const std::string& file) {
    if (file == "-") {
        return readServers(std::cin, "standard input");
    }
    constexpr std::size_t longest = 16U << 20U;
    const auto content = ZR::File::read(file, longest);
    if (!content) {
        throw Failure(ExitStatus::notLoaded, printable(file) + ": " + std::strerror(errno));
    }
    std::istringstream lines(*content);
    return readServers(lines, printable(file));
}

}  // namespace cimdhcp
