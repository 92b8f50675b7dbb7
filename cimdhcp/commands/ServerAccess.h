#pragma once

#include <atomic>
#include <vector>

#include "arguments/Commands.h"
#include "client/Credentials.h"
#include "client/RemoteClient.h"
#include "client/ServerUrl.h"

namespace cimdhcp {

/// How the servers that the options name are reached. Safe for concurrent use.
class ServerAccess {
  public:
    /// Reads what the options name: files of certificates and of credentials. Requests end
    /// when `interrupted` is true. Borrows both. Throws Failure.
    ServerAccess(const Options& options, const std::atomic<bool>& interrupted);

    /// A client with as much time for all its requests as the options give. Throws Failure
    /// when a password would be sent where others can read it.
    [[nodiscard]] RemoteClient clientOf(const ServerUrl& server) const;
    /// How such a client gets to the server. Throws Failure as clientOf() does.
    [[nodiscard]] HttpSettings settingsFor(const ServerUrl& server) const;

  private:
    const Options& options_;
    HttpSettings settings_;
    std::vector<Credential> credentials_;
};

/// Those of --connect, then those of --hosts, each once, however often it is named. Throws
/// Failure.
[[nodiscard]] std::vector<ServerUrl> serversOf(const Options& options);

/// Writes what --insecure means, if it is given.
void warnOfInsecurity(const Options& options, std::ostream& err);

}  // namespace cimdhcp
