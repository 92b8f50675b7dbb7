#pragma once

#include <sys/socket.h>

#include <functional>
#include <thread>

#include "transport/ListeningSocket.h"
#include "zrcommon/UniqueFd.h"

namespace cimom::wbem {

/// A thread that takes every new connection of a listening socket, so that those who wait
/// behind a refused one do not wait for long.
class Acceptor {
  public:
    /// Gets a socket that does not block, with the address of the client, and owns it from
    /// then on. Called by the thread; must not throw.
    using Take = std::function<void(int socket, const sockaddr* client, socklen_t length)>;

    /// Throws std::system_error when the system lacks descriptors or threads.
    Acceptor(ListeningSocket socket, Take take);
    /// Takes no more, and closes the listening socket.
    ~Acceptor();
    Acceptor(const Acceptor&) = delete;
    Acceptor& operator=(const Acceptor&) = delete;

  private:
    void run();
    /// Takes those who wait, or many of them; false when the system lacks what a connection needs.
    bool takeSome();

    const ListeningSocket socket_;
    const Take take_;
    const ZR::UniqueFd end_;  ///< readable once the thread has to end
    std::thread thread_;
};

}  // namespace cimom::wbem
