#include "http/Connections.h"

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>

namespace cimom::wbem {

/// A connection whose deadline for requests is over at once, and the other side.
class ConnectionsTest : public testing::Test {
  protected:
    ConnectionsTest() { EXPECT_EQ(::socketpair(AF_UNIX, SOCK_STREAM, 0, sockets_.data()), 0); }
    ~ConnectionsTest() override {
        ::close(sockets_[0]);
        ::close(sockets_[1]);
    }

    bool isCut() {
        connections.endOverdue();
        std::array<char, 1> byte{};
        return ::recv(sockets_[1], byte.data(), byte.size(), MSG_DONTWAIT) == 0;
    }
    [[nodiscard]] int socket() const { return sockets_[0]; }

    Connections connections{std::chrono::seconds(0), std::chrono::hours(1)};

  private:
    std::array<int, 2> sockets_{};
};

TEST_F(ConnectionsTest, AreCutWhenTheirTimeIsOver) {
    connections.opened(socket(), "a");
    EXPECT_TRUE(isCut());
}

TEST_F(ConnectionsTest, HaveTheirTimeForEveryStep) {
    Connections::Connection* const connection = connections.opened(socket(), "a");
    connections.expectTaking(*connection);
    EXPECT_TRUE(connections.isBusy());
    EXPECT_FALSE(isCut());
    connections.expectRequest(*connection);
    EXPECT_FALSE(connections.isBusy());
    EXPECT_TRUE(isCut());
}

TEST_F(ConnectionsTest, AreNotCutWhileAWorkerHasTheirRequest) {
    Connections::Connection* const connection = connections.opened(socket(), "a");
    connections.expectResult(*connection, std::make_shared<Exchange>(nullptr, "a"));
    EXPECT_TRUE(connections.isBusy());
    EXPECT_FALSE(isCut());
}

TEST_F(ConnectionsTest, AreForgottenWhenTheyAreClosed) {
    connections.closed(connections.opened(socket(), "a"));
    EXPECT_FALSE(isCut());
}

}  // namespace cimom::wbem
