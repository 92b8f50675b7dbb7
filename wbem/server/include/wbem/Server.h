#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "cimom/Forward.h"
#include "wbem/Metrics.h"
#include "wbem/Pages.h"
#include "wbem/ServerSettings.h"

namespace cimom::wbem {

/// A WBEM server: CIM-XML over HTTP at /cimom, for one object manager.
///
/// A few threads read requests and write responses; a fixed pool of others carries
/// operations out. A slow client costs a connection, never a thread. A provider
/// that does not return costs a thread, in whose place comes another one, a fixed
/// number of times.
class Server {
  public:
    /// Listens from now on. Borrows the manager. Throws ServerError.
    Server(ObjectManager& manager, ServerSettings settings, ServerLog log);
    /// Serves pages in place of CIM-XML, with the same limits and users. Throws ServerError.
    Server(PageHandler pages, ServerSettings settings, ServerLog log);
    /// Responds with 503 to what is under way, and waits for operations that run.
    ~Server();
    Server(const Server&) = delete;
    Server& operator=(const Server&) = delete;

    /// New connections get this certificate and key from now on; those that are open go on.
    /// Throws ServerError, and keeps what it had. Safe on any thread, as is renewUsers().
    void renewTls(const ServerSettings::Tls& tls);
    /// These are the users from now on; what has been admitted is carried out. Throws
    /// ServerError for a server that has none.
    void renewUsers(std::vector<User> users);

    [[nodiscard]] std::uint16_t port() const noexcept;
    /// "http://127.0.0.1:5988/cimom"; of a server of pages "http://127.0.0.1:5988/".
    [[nodiscard]] std::string url() const;
    /// Lives as long as the server.
    [[nodiscard]] const ServerCounts& counts() const noexcept;

  private:
    class Implementation;
    std::unique_ptr<Implementation> implementation_;
};

}  // namespace cimom::wbem
