#include <arpa/inet.h>
#include <netinet/in.h>

#include <stdexcept>

#include "wbem/ServerSettings.h"

namespace cimom::wbem {

namespace {

/// 127.0.0.0/8 and ::1. Throws ServerError for a text that is not an address.
bool isLoopback(const std::string& address) {
    in_addr four{};
    if (::inet_pton(AF_INET, address.c_str(), &four) == 1) {
        constexpr unsigned loopbackNet = 127;
        return (ntohl(four.s_addr) >> 24U) == loopbackNet;
    }
    in6_addr six{};
    if (::inet_pton(AF_INET6, address.c_str(), &six) == 1) {
        return IN6_IS_ADDR_LOOPBACK(&six) != 0;
    }
    throw ServerError("\"" + address + "\" is not an IPv4 or IPv6 address");
}

}  // namespace

void checkSettings(const ServerSettings& settings) {
    if (!isLoopback(settings.address)) {
        const std::string reachable = settings.address + " can be reached from other machines: ";
        if (!settings.tls) {
            throw ServerError(reachable +
                              "this needs TLS (--tls-cert and --tls-key), or passwords could be "
                              "read on the way");
        }
        if (!settings.users) {
            throw ServerError(reachable +
                              "this needs users (--users, made by \"cimdhcp user add\"), or "
                              "anybody could use it");
        }
    }
    try {
        settings.limits.check();
    } catch (const std::invalid_argument& error) {
        throw ServerError(error.what());
    }
}

}  // namespace cimom::wbem
