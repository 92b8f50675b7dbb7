#include "transport/ListeningSocket.h"

#include <arpa/inet.h>
#include <gtest/gtest.h>
#include <netinet/in.h>

namespace cimom::wbem {

TEST(ListeningSocket, TakesAFreePortWhenAskedForNone) {
    const ListeningSocket socket("127.0.0.1", 0);
    EXPECT_GT(socket.port(), 0);
    EXPECT_THROW(ListeningSocket("127.0.0.1", socket.port()), SocketError);
}

TEST(ListeningSocket, IsFreedAtItsEnd) {
    std::uint16_t port = 0;
    {
        const ListeningSocket socket("127.0.0.1", 0);
        port = socket.port();
    }
    EXPECT_EQ(ListeningSocket("127.0.0.1", port).port(), port);
}

TEST(ListeningSocket, WantsANumericAddress) {
    EXPECT_THROW(ListeningSocket("localhost", 0), SocketError);
}

TEST(ListeningSocket, TellsAddressesOfClientsInNumbers) {
    sockaddr_in four{};
    four.sin_family = AF_INET;
    four.sin_addr.s_addr = htonl(0xC0000207);
    EXPECT_EQ(addressText(reinterpret_cast<const sockaddr*>(&four)), "192.0.2.7");
    sockaddr_in6 six{};
    six.sin6_family = AF_INET6;
    six.sin6_addr = IN6ADDR_LOOPBACK_INIT;
    EXPECT_EQ(addressText(reinterpret_cast<const sockaddr*>(&six)), "::1");
    four.sin_family = AF_UNIX;
    EXPECT_EQ(addressText(reinterpret_cast<const sockaddr*>(&four)), "unknown");
    EXPECT_EQ(addressText(nullptr), "unknown");
}

}  // namespace cimom::wbem
