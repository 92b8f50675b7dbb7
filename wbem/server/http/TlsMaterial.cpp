#include "http/TlsMaterial.h"

#include <gnutls/x509.h>

#include <algorithm>
#include <array>
#include <utility>

namespace cimom::wbem {

namespace {

/// How long a ticket can be used, in seconds. GnuTLS derives the keys that encrypt tickets
/// from the one that it is given, anew for each three times as long.
constexpr int ticketLifetime = 3600;

[[noreturn]] void failTls(const std::string& what, int error) {
    throw ServerError(what + ": " + gnutls_strerror(error));
}

/// GnuTLS takes bytes that it only reads by a pointer to plain ones, too.
gnutls_datum_t datumOf(std::string& text) {
    return {reinterpret_cast<unsigned char*>(text.data()), static_cast<unsigned>(text.size())};
}

using KeyId = std::array<unsigned char, 32>;

std::string dateOf(std::time_t time) {
    std::tm parts{};
    std::array<char, 32> text{};
    ::gmtime_r(&time, &parts);
    return {text.data(), std::strftime(text.data(), text.size(), "%Y-%m-%d %H:%M:%S UTC", &parts)};
}

void checkStrength(gnutls_x509_crt_t certificate) {
    constexpr unsigned leastRsa = 2048;
    constexpr unsigned leastCurve = 256;
    unsigned bits = 0;
    const int kind = gnutls_x509_crt_get_pk_algorithm(certificate, &bits);
    const char* const name = gnutls_pk_get_name(static_cast<gnutls_pk_algorithm_t>(kind));
    const std::string key = std::string("TLS: a certificate has a key of the kind ") +
                            (name == nullptr ? "unknown" : name) + " with " + std::to_string(bits) +
                            " bits";
    switch (kind) {
        case GNUTLS_PK_RSA:
        case GNUTLS_PK_RSA_PSS:
            if (bits < leastRsa) {
                throw ServerError(key + ": at least " + std::to_string(leastRsa) + " are needed");
            }
            break;
        case GNUTLS_PK_ECDSA:
            if (bits < leastCurve) {
                throw ServerError(key + ": at least " + std::to_string(leastCurve) + " are needed");
            }
            break;
        case GNUTLS_PK_EDDSA_ED25519:
        case GNUTLS_PK_EDDSA_ED448:
            break;
        default:
            throw ServerError(key + ": RSA, ECDSA or EdDSA is needed");
    }
}

void checkSignature(gnutls_x509_crt_t certificate) {
    const int kind = gnutls_x509_crt_get_signature_algorithm(certificate);
    const auto sign = static_cast<gnutls_sign_algorithm_t>(kind);
    switch (kind < 0 ? GNUTLS_DIG_UNKNOWN : gnutls_sign_get_hash_algorithm(sign)) {
        case GNUTLS_DIG_MD2:
        case GNUTLS_DIG_MD5:
        case GNUTLS_DIG_SHA1:
        case GNUTLS_DIG_RMD160:
            throw ServerError(std::string("TLS: a certificate is signed with ") +
                              gnutls_sign_get_name(sign) +
                              ", which can be forged: SHA-256 or better is needed");
        default:
            break;
    }
}

// Called by GnuTLS in a handshake. A file is never read here.
int lendMaterial(gnutls_session_t session, const gnutls_datum_t* /*authorities*/,
                 int /*authorityCount*/, const gnutls_pk_algorithm_t* /*kinds*/, int /*kindCount*/,
                 gnutls_pcert_st** chain, unsigned* length, gnutls_privkey_t* key) {
    const auto* const material = static_cast<const TlsMaterial*>(gnutls_db_get_ptr(session));
    if (material == nullptr) {
        return -1;
    }
    material->lend(chain, length, key);
    return 0;
}

gnutls_session_t sessionOf(MHD_Connection* connection) {
    const auto* const info =
        MHD_get_connection_info(connection, MHD_CONNECTION_INFO_GNUTLS_SESSION);
    return info == nullptr ? nullptr : static_cast<gnutls_session_t>(info->tls_session);
}

}  // namespace

class TlsMaterial::Key {
  public:
    explicit Key(std::string text) {
        gnutls_x509_privkey_t plain = nullptr;
        if (const int error = gnutls_x509_privkey_init(&plain); error < 0) {
            failTls("TLS key", error);
        }
        const gnutls_datum_t data = datumOf(text);
        std::size_t size = id_.size();
        int error = gnutls_x509_privkey_import2(plain, &data, GNUTLS_X509_FMT_PEM, nullptr, 0);
        if (error >= 0) {
            error =
                gnutls_x509_privkey_get_key_id(plain, GNUTLS_KEYID_USE_SHA256, id_.data(), &size);
        }
        if (error >= 0) {
            error = gnutls_privkey_init(&key_);
        }
        if (error >= 0) {
            error = gnutls_privkey_import_x509(key_, plain, GNUTLS_PRIVKEY_IMPORT_COPY);
        }
        gnutls_x509_privkey_deinit(plain);
        if (error < 0) {
            gnutls_privkey_deinit(key_);
            failTls("TLS key", error);
        }
    }
    ~Key() { gnutls_privkey_deinit(key_); }
    Key(const Key&) = delete;
    Key& operator=(const Key&) = delete;

    [[nodiscard]] gnutls_privkey_t get() const noexcept { return key_; }
    /// What tells keys apart: the same for a private key and its public one.
    [[nodiscard]] const KeyId& id() const noexcept { return id_; }

  private:
    gnutls_privkey_t key_ = nullptr;
    KeyId id_{};
};

/// The certificates of a PEM text, sorted: that of the server first.
class TlsMaterial::Certificates {
  public:
    explicit Certificates(std::string text) {
        const gnutls_datum_t data = datumOf(text);
        const int error = gnutls_x509_crt_list_import2(&list_, &size_, &data, GNUTLS_X509_FMT_PEM,
                                                       GNUTLS_X509_CRT_LIST_SORT);
        if (error < 0) {
            failTls("TLS certificate", error);
        }
    }
    ~Certificates() {
        for (unsigned index = 0; index < size_; ++index) {
            gnutls_x509_crt_deinit(list_[index]);
        }
        gnutls_free(list_);
    }
    Certificates(const Certificates&) = delete;
    Certificates& operator=(const Certificates&) = delete;

    [[nodiscard]] gnutls_x509_crt_t first() const noexcept { return list_[0]; }
    [[nodiscard]] gnutls_x509_crt_t* list() const noexcept { return list_; }
    [[nodiscard]] unsigned size() const noexcept { return size_; }

    void checkStrengths() const {
        for (unsigned index = 0; index < size_; ++index) {
            checkStrength(list_[index]);
            // A root is trusted for what it is, not for its signature.
            if (index == 0 || gnutls_x509_crt_check_issuer(list_[index], list_[index]) == 0) {
                checkSignature(list_[index]);
            }
        }
    }

    [[nodiscard]] KeyId keyId() const {
        KeyId made{};
        std::size_t size = made.size();
        const int error =
            gnutls_x509_crt_get_key_id(first(), GNUTLS_KEYID_USE_SHA256, made.data(), &size);
        if (error < 0) {
            failTls("TLS certificate", error);
        }
        return made;
    }

  private:
    gnutls_x509_crt_t* list_ = nullptr;
    unsigned size_ = 0;
};

/// The certificates in the form in which a handshake takes them.
class TlsMaterial::Chain {
  public:
    explicit Chain(const Certificates& certificates) : parts_(certificates.size()) {
        unsigned size = certificates.size();
        const int error =
            gnutls_pcert_import_x509_list(parts_.data(), certificates.list(), &size, 0);
        if (error < 0) {
            failTls("TLS certificate", error);
        }
        parts_.resize(size);
    }
    ~Chain() {
        for (gnutls_pcert_st& part : parts_) {
            gnutls_pcert_deinit(&part);
        }
    }
    Chain(const Chain&) = delete;
    Chain& operator=(const Chain&) = delete;

    [[nodiscard]] gnutls_pcert_st* data() noexcept { return parts_.data(); }
    [[nodiscard]] unsigned size() const noexcept { return static_cast<unsigned>(parts_.size()); }

  private:
    std::vector<gnutls_pcert_st> parts_;
};

class TlsMaterial::TicketKey {
  public:
    TicketKey() {
        if (const int error = gnutls_session_ticket_key_generate(&key_); error < 0) {
            failTls("TLS tickets", error);
        }
    }
    ~TicketKey() {
        gnutls_memset(key_.data, 0, key_.size);
        gnutls_free(key_.data);
    }
    TicketKey(const TicketKey&) = delete;
    TicketKey& operator=(const TicketKey&) = delete;

    [[nodiscard]] const gnutls_datum_t& get() const noexcept { return key_; }

  private:
    gnutls_datum_t key_{};
};

TlsMaterial::TlsMaterial(const ServerSettings::Tls& texts)
    : key_(std::make_unique<Key>(texts.key)), ticketKey_(std::make_unique<TicketKey>()) {
    const Certificates certificates(texts.certificate);
    if (certificates.keyId() != key_->id()) {
        throw ServerError("TLS: the key is not that of the certificate");
    }
    certificates.checkStrengths();
    from_ = gnutls_x509_crt_get_activation_time(certificates.first());
    until_ = gnutls_x509_crt_get_expiration_time(certificates.first());
    chain_ = std::make_unique<Chain>(certificates);
}

TlsMaterial::~TlsMaterial() = default;

std::vector<std::string> TlsMaterial::warnings(std::time_t now) const {
    std::vector<std::string> found;
    if (now < from_) {
        found.push_back("TLS: clients refuse the certificate, which is valid from " +
                        dateOf(from_) + " on only; or the clock is wrong");
    }
    if (now > until_) {
        found.push_back("TLS: clients refuse the certificate, which has expired on " +
                        dateOf(until_));
    }
    return found;
}

void TlsMaterial::lend(gnutls_pcert_st** chain, unsigned* length,
                       gnutls_privkey_t* key) const noexcept {
    *chain = chain_->data();
    *length = chain_->size();
    *key = key_->get();
}

void TlsMaterial::enableTickets(gnutls_session_t session) const noexcept {
    gnutls_db_set_cache_expiration(session, ticketLifetime);
    // Without tickets a session is as good, and only costs more to begin.
    static_cast<void>(gnutls_session_ticket_enable_server(session, &ticketKey_->get()));
}

TlsSessions::TlsSessions(const ServerSettings::Tls& texts,
                         std::function<void(const std::string&)> tell)
    : tell_(std::move(tell)), current_(made(texts)) {}

std::shared_ptr<TlsMaterial> TlsSessions::made(const ServerSettings::Tls& texts) const {
    auto material = std::make_shared<TlsMaterial>(texts);
    for (const std::string& warning : material->warnings(std::time(nullptr))) {
        tell_(warning);
    }
    return material;
}

void TlsSessions::renew(const ServerSettings::Tls& texts) {
    auto material = made(texts);
    const std::lock_guard lock(mutex_);
    current_.swap(material);
}

void TlsSessions::addOptions(std::vector<MHD_OptionItem>& options) {
    options.push_back({MHD_OPTION_HTTPS_CERT_CALLBACK, 0,
                       reinterpret_cast<void*>(
                           static_cast<gnutls_certificate_retrieve_function2*>(&lendMaterial))});
    options.push_back({MHD_OPTION_HTTPS_PRIORITIES, 0, priorities_.data()});
}

void TlsSessions::opened(MHD_Connection* connection) {
    gnutls_session_t session = sessionOf(connection);
    if (session == nullptr) {
        return;
    }
    const std::lock_guard lock(mutex_);
    used_.insert_or_assign(connection, current_);
    // The pointer is free for this: sessions are kept by the clients, in tickets, and not in
    // a data base of the server.
    gnutls_db_set_ptr(session, current_.get());
    current_->enableTickets(session);
}

void TlsSessions::closed(MHD_Connection* connection) {
    const std::lock_guard lock(mutex_);
    used_.erase(connection);
}

}  // namespace cimom::wbem
