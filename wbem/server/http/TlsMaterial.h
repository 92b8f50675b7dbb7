#pragma once

#include <gnutls/abstract.h>
#include <gnutls/gnutls.h>
#include <microhttpd.h>

#include <ctime>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <unordered_map>
#include <vector>

#include "wbem/ServerSettings.h"

namespace cimom::wbem {

/// Versions, key exchanges and ciphers that current recommendations for servers have:
/// TLS 1.2 and 1.3, each with forward secrecy and an authenticating cipher.
inline constexpr const char* tlsPriorities =
    "NORMAL:-VERS-ALL:+VERS-TLS1.3:+VERS-TLS1.2:-KX-ALL:+ECDHE-ECDSA:+ECDHE-RSA:-CIPHER-ALL:"
    "+AES-128-GCM:+AES-256-GCM:+CHACHA20-POLY1305:-GROUP-ALL:+GROUP-X25519:+GROUP-SECP256R1:"
    "+GROUP-SECP384R1";

/// A certificate with its chain and its private key, checked; and the key of the session
/// tickets that are given out under it. Never changes: safe for concurrent use.
class TlsMaterial {
  public:
    /// Throws ServerError for texts that are no certificate or key, for a key that does not
    /// fit, and for keys and signatures that can be forged today.
    explicit TlsMaterial(const ServerSettings::Tls& texts);
    ~TlsMaterial();
    TlsMaterial(const TlsMaterial&) = delete;
    TlsMaterial& operator=(const TlsMaterial&) = delete;

    /// What is wrong at that time and does not keep the server from starting: dates at which
    /// clients refuse the certificate, though the clock may be the one that is wrong.
    [[nodiscard]] std::vector<std::string> warnings(std::time_t now) const;

    /// Lends certificate and key to one handshake.
    void lend(gnutls_pcert_st** chain, unsigned* length, gnutls_privkey_t* key) const noexcept;
    /// Lets a session give out tickets, and resume those that were given out under this
    /// material.
    void enableTickets(gnutls_session_t session) const noexcept;

  private:
    class Key;
    class Certificates;
    class Chain;
    class TicketKey;

    std::unique_ptr<Key> key_;
    std::unique_ptr<Chain> chain_;
    std::unique_ptr<TicketKey> ticketKey_;
    std::time_t from_ = 0;   ///< the certificate is valid from then on
    std::time_t until_ = 0;  ///< and until then
};

/// What the connections of a server need of TLS. New ones take the newest material; those
/// that have begun keep theirs. Safe for concurrent use.
class TlsSessions {
  public:
    /// Throws ServerError. `tell` gets warnings, during this call and renew().
    TlsSessions(const ServerSettings::Tls& texts, std::function<void(const std::string&)> tell);

    /// From now on other material is used, and tickets of the one before are worth nothing.
    /// Throws ServerError, and keeps what it had.
    void renew(const ServerSettings::Tls& texts);

    /// Adds the options of a server that uses this, which has to outlive the server.
    void addOptions(std::vector<MHD_OptionItem>& options);
    /// For each connection, before its handshake and at its end.
    void opened(MHD_Connection* connection);
    void closed(MHD_Connection* connection);

  private:
    [[nodiscard]] std::shared_ptr<TlsMaterial> made(const ServerSettings::Tls& texts) const;

    const std::function<void(const std::string&)> tell_;
    std::string priorities_ = tlsPriorities;  ///< as the library takes it, not constant
    std::mutex mutex_;
    std::shared_ptr<TlsMaterial> current_;
    /// What each connection may still read from.
    std::unordered_map<MHD_Connection*, std::shared_ptr<const TlsMaterial>> used_;
};

}  // namespace cimom::wbem
