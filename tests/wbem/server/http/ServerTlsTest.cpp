// Certificates, keys and sessions of a server with TLS.
#include <arpa/inet.h>
#include <gmock/gmock.h>
#include <gnutls/abstract.h>
#include <gnutls/gnutls.h>
#include <gnutls/x509.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <ctime>
#include <optional>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

#include "http/TlsMaterial.h"
#include "kit/WireSupport.h"

namespace cimom::test {

using ::testing::HasSubstr;
using ::testing::IsEmpty;
using wbem::ServerSettings;
using wbem::TlsMaterial;

constexpr std::time_t day = 86400;

/// What a certificate is to be like.
struct Wanted {
    gnutls_pk_algorithm_t kind = GNUTLS_PK_ECDSA;
    unsigned bits = GNUTLS_CURVE_TO_BITS(GNUTLS_ECC_CURVE_SECP256R1);
    gnutls_digest_algorithm_t digest = GNUTLS_DIG_SHA256;
    std::time_t from = std::time(nullptr) - day;
    std::time_t until = std::time(nullptr) + day;
    std::string name = "localhost";
};

void require(int result) {
    if (result < 0) {
        throw std::runtime_error(gnutls_strerror(result));
    }
}

std::string taken(gnutls_datum_t& made) {
    std::string text(reinterpret_cast<const char*>(made.data), made.size);
    gnutls_free(made.data);
    return text;
}

/// A certificate that is signed with its own key.
ServerSettings::Tls selfSigned(const Wanted& wanted) {
    gnutls_x509_privkey_t key = nullptr;
    gnutls_x509_crt_t certificate = nullptr;
    gnutls_privkey_t signer = nullptr;
    require(gnutls_x509_privkey_init(&key));
    require(gnutls_x509_privkey_generate(key, wanted.kind, wanted.bits, 0));
    require(gnutls_x509_crt_init(&certificate));
    require(gnutls_x509_crt_set_version(certificate, 3));
    require(gnutls_x509_crt_set_serial(certificate, "\1", 1));
    require(gnutls_x509_crt_set_key(certificate, key));
    require(gnutls_x509_crt_set_dn(certificate, ("CN=" + wanted.name).c_str(), nullptr));
    require(gnutls_x509_crt_set_activation_time(certificate, wanted.from));
    require(gnutls_x509_crt_set_expiration_time(certificate, wanted.until));
    require(gnutls_privkey_init(&signer));
    require(gnutls_privkey_import_x509(signer, key, 0));
    require(gnutls_x509_crt_privkey_sign(certificate, certificate, signer, wanted.digest, 0));
    gnutls_datum_t text{};
    ServerSettings::Tls made;
    require(gnutls_x509_crt_export2(certificate, GNUTLS_X509_FMT_PEM, &text));
    made.certificate = taken(text);
    require(gnutls_x509_privkey_export2_pkcs8(key, GNUTLS_X509_FMT_PEM, nullptr, GNUTLS_PKCS_PLAIN,
                                              &text));
    made.key = taken(text);
    gnutls_privkey_deinit(signer);
    gnutls_x509_crt_deinit(certificate);
    gnutls_x509_privkey_deinit(key);
    return made;
}

std::string materialFailure(const ServerSettings::Tls& texts) {
    try {
        const TlsMaterial material(texts);
        return "none";
    } catch (const wbem::ServerError& error) {
        return error.what();
    }
}

std::string materialFailure(gnutls_pk_algorithm_t kind, unsigned bits,
                            gnutls_digest_algorithm_t digest = GNUTLS_DIG_SHA256) {
    Wanted wanted;
    wanted.kind = kind;
    wanted.bits = bits;
    wanted.digest = digest;
    return materialFailure(selfSigned(wanted));
}

TEST(TlsMaterial, IsACertificateWithItsKey) {
    const ServerSettings::Tls good = selfSigned({});
    EXPECT_EQ(materialFailure(good), "none");
    EXPECT_EQ(materialFailure({good.certificate, selfSigned({}).key}),
              "TLS: the key is not that of the certificate");
    EXPECT_THAT(materialFailure({good.key, good.key}), testing::StartsWith("TLS certificate: "));
    EXPECT_THAT(materialFailure({good.certificate, good.certificate}),
                testing::StartsWith("TLS key: "));
    EXPECT_THAT(materialFailure({"", ""}), testing::StartsWith("TLS key: "));
    // A chain has what others have signed behind the server's own.
    EXPECT_EQ(materialFailure({good.certificate + selfSigned({}).certificate, good.key}), "none");
}

TEST(TlsMaterial, IsStrongEnough) {
    EXPECT_EQ(materialFailure(GNUTLS_PK_RSA, 1024),
              "TLS: a certificate has a key of the kind RSA with 1024 bits: at least 2048 are "
              "needed");
    EXPECT_EQ(materialFailure(GNUTLS_PK_RSA, 2048), "none");
    EXPECT_THAT(materialFailure(GNUTLS_PK_ECDSA, GNUTLS_CURVE_TO_BITS(GNUTLS_ECC_CURVE_SECP224R1)),
                HasSubstr("with 224 bits: at least 256 are needed"));
    EXPECT_EQ(materialFailure(GNUTLS_PK_ECDSA, GNUTLS_CURVE_TO_BITS(GNUTLS_ECC_CURVE_SECP384R1)),
              "none");
    EXPECT_EQ(materialFailure(GNUTLS_PK_EDDSA_ED25519,
                              GNUTLS_CURVE_TO_BITS(GNUTLS_ECC_CURVE_ED25519), GNUTLS_DIG_SHA512),
              "none");
    Wanted old;
    old.digest = GNUTLS_DIG_SHA1;
    EXPECT_EQ(materialFailure(selfSigned(old)),
              "TLS: a certificate is signed with ECDSA-SHA1, which can be forged: SHA-256 or "
              "better is needed");
}

TEST(TlsMaterial, TellsOfDatesThatClientsRefuse) {
    Wanted wanted;
    wanted.from = 1'700'000'000;
    wanted.until = 1'800'000'000;
    const TlsMaterial material(selfSigned(wanted));
    EXPECT_THAT(material.warnings(wanted.from), IsEmpty());
    EXPECT_THAT(material.warnings(wanted.until), IsEmpty());
    EXPECT_THAT(material.warnings(wanted.from - 1),
                testing::ElementsAre("TLS: clients refuse the certificate, which is valid from "
                                     "2023-11-14 22:13:20 UTC on only; or the clock is wrong"));
    EXPECT_THAT(material.warnings(wanted.until + 1),
                testing::ElementsAre("TLS: clients refuse the certificate, which has expired on "
                                     "2027-01-15 08:00:00 UTC"));
}

/// One connection with TLS, which believes every certificate.
class TlsClient {
  public:
    explicit TlsClient(std::uint16_t port, const std::string& priorities = "NORMAL",
                       const std::string& session = "")
        : fd_(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        address.sin_port = htons(port);
        const timeval patience{10, 0};
        if (fd_ < 0 ||
            ::setsockopt(fd_, SOL_SOCKET, SO_RCVTIMEO, &patience, sizeof patience) != 0 ||
            ::connect(fd_, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
            throw std::system_error(errno, std::generic_category(), "connect");
        }
        require(gnutls_certificate_allocate_credentials(&credentials_));
        require(gnutls_init(&session_, GNUTLS_CLIENT));
        require(gnutls_priority_set_direct(session_, priorities.c_str(), nullptr));
        require(gnutls_credentials_set(session_, GNUTLS_CRD_CERTIFICATE, credentials_));
        if (!session.empty()) {
            require(gnutls_session_set_data(session_, session.data(), session.size()));
        }
        gnutls_transport_set_int(session_, fd_);
        int result = GNUTLS_E_AGAIN;
        while (result < 0 && gnutls_error_is_fatal(result) == 0) {
            result = gnutls_handshake(session_);
        }
        open_ = result >= 0;
    }
    ~TlsClient() {
        gnutls_deinit(session_);
        gnutls_certificate_free_credentials(credentials_);
        ::close(fd_);
    }
    TlsClient(const TlsClient&) = delete;
    TlsClient& operator=(const TlsClient&) = delete;

    [[nodiscard]] bool open() const { return open_; }
    [[nodiscard]] bool resumed() const { return gnutls_session_is_resumed(session_) != 0; }
    [[nodiscard]] std::string suite() const {
        return std::string(gnutls_kx_get_name(gnutls_kx_get(session_))) + ' ' +
               gnutls_cipher_get_name(gnutls_cipher_get(session_));
    }

    /// Sends a request and waits for the head of its response, which has no body.
    bool ask() {
        const std::string request = "OPTIONS * HTTP/1.1\r\nHost: h\r\n\r\n";
        if (gnutls_record_send(session_, request.data(), request.size()) < 0) {
            return false;
        }
        std::string response;
        std::array<char, 4096> piece{};
        while (response.find("\r\n\r\n") == std::string::npos) {
            const ssize_t got = gnutls_record_recv(session_, piece.data(), piece.size());
            if (got > 0) {
                response.append(piece.data(), static_cast<std::size_t>(got));
            } else if (got == 0 || gnutls_error_is_fatal(static_cast<int>(got)) != 0) {
                return false;
            }
        }
        return response.starts_with("HTTP/1.1 200 ");
    }

    /// The name that the server's certificate is for.
    [[nodiscard]] std::string serverName() const {
        unsigned size = 0;
        const gnutls_datum_t* const chain = gnutls_certificate_get_peers(session_, &size);
        gnutls_x509_crt_t certificate = nullptr;
        require(gnutls_x509_crt_init(&certificate));
        gnutls_datum_t name{};
        int result = gnutls_x509_crt_import(certificate, chain, GNUTLS_X509_FMT_DER);
        result = result < 0 ? result : gnutls_x509_crt_get_dn2(certificate, &name);
        gnutls_x509_crt_deinit(certificate);
        require(result);
        return taken(name);
    }

    /// What a further connection can resume this session with.
    [[nodiscard]] std::string session() const {
        gnutls_datum_t data{};
        require(gnutls_session_get_data2(session_, &data));
        return taken(data);
    }

  private:
    int fd_;
    gnutls_certificate_credentials_t credentials_ = nullptr;
    gnutls_session_t session_ = nullptr;
    bool open_ = false;
};

ServerSettings withTls(const Wanted& wanted) {
    ServerSettings settings;
    settings.tls = selfSigned(wanted);
    return settings;
}

std::string only(const std::string& version, const std::string& further) {
    return "NORMAL:-VERS-ALL:+VERS-" + version + further;
}

TEST(WbemTls, OffersTheProfileAndNothingElse) {
    constexpr unsigned rsaBits = 2048;
    for (const bool rsa : {false, true}) {
        Wanted wanted;
        if (rsa) {
            wanted.kind = GNUTLS_PK_RSA;
            wanted.bits = rsaBits;
        }
        TestServer server(withTls(wanted));
        for (const char* cipher : {"AES-128-GCM", "AES-256-GCM", "CHACHA20-POLY1305"}) {
            for (const char* version : {"TLS1.2", "TLS1.3"}) {
                TlsClient client(server.port(),
                                 only(version, ":-CIPHER-ALL:+" + std::string(cipher)));
                ASSERT_TRUE(client.open()) << version << cipher;
                EXPECT_THAT(client.suite(), HasSubstr(cipher));
                EXPECT_TRUE(client.ask());
            }
        }
        const std::string keys = rsa ? "ECDHE-RSA" : "ECDHE-ECDSA";
        for (const char* group : {"X25519", "SECP256R1", "SECP384R1"}) {
            for (const char* version : {"TLS1.2", "TLS1.3"}) {
                EXPECT_TRUE(TlsClient(server.port(),
                                      only(version, ":-KX-ALL:+" + keys + ":-GROUP-ALL:+GROUP-" +
                                                        std::string(group)))
                                .open())
                    << version << group;
            }
        }
        for (const std::string& refused :
             {only("TLS1.1", ""), only("TLS1.0", ""), only("TLS1.2", ":-CIPHER-ALL:+AES-128-CBC"),
              only("TLS1.2", ":-CIPHER-ALL:+AES-256-CBC"),
              only("TLS1.2", ":-CIPHER-ALL:+AES-128-CCM"),
              only("TLS1.3", ":-CIPHER-ALL:+AES-128-CCM"), only("TLS1.2", ":-KX-ALL:+RSA"),
              only("TLS1.2", ":-KX-ALL:+DHE-RSA"), only("TLS1.3", ":-GROUP-ALL:+GROUP-FFDHE2048"),
              only("TLS1.3", ":-GROUP-ALL:+GROUP-SECP521R1")}) {
            EXPECT_FALSE(TlsClient(server.port(), refused).open()) << refused;
        }
    }
}

TEST(WbemTls, DoesNotStartWithWhatIsWeak) {
    Wanted wanted;
    wanted.digest = GNUTLS_DIG_SHA1;
    EXPECT_THROW(TestServer server(withTls(wanted)), wbem::ServerError);
    wanted = {};
    wanted.until = std::time(nullptr) - 1;
    TestServer server(withTls(wanted));
    EXPECT_THAT(server.log(wbem::LogKind::failure),
                testing::ElementsAre(HasSubstr("which has expired on")));
}

TEST(WbemTls, TakesAnotherCertificateWhileItRuns) {
    Wanted wanted;
    wanted.name = "first";
    TestServer server(withTls(wanted));
    TlsClient before(server.port());
    ASSERT_TRUE(before.ask());
    EXPECT_EQ(before.serverName(), "CN=first");
    wanted.name = "second";
    const ServerSettings::Tls second = selfSigned(wanted);
    server.running().renewTls(second);
    TlsClient after(server.port());
    ASSERT_TRUE(after.ask());
    EXPECT_EQ(after.serverName(), "CN=second");
    EXPECT_TRUE(before.ask());
    // One that cannot be used changes nothing.
    EXPECT_THROW(server.running().renewTls({second.certificate, selfSigned({}).key}),
                 wbem::ServerError);
    TlsClient last(server.port());
    ASSERT_TRUE(last.ask());
    EXPECT_EQ(last.serverName(), "CN=second");
    TestServer plain;
    EXPECT_THROW(plain.running().renewTls(second), wbem::ServerError);
}

TEST(WbemTls, SessionsAreResumedByTickets) {
    TestServer server(withTls({}));
    for (const char* version : {"TLS1.2", "TLS1.3"}) {
        const std::string priorities = only(version, "");
        std::string session;
        {
            TlsClient client(server.port(), priorities);
            ASSERT_TRUE(client.ask());
            EXPECT_FALSE(client.resumed());
            session = client.session();
        }
        {
            TlsClient client(server.port(), priorities, session);
            ASSERT_TRUE(client.ask()) << version;
            EXPECT_TRUE(client.resumed()) << version;
        }
        // With another certificate, clients have to see it.
        server.running().renewTls(selfSigned({}));
        TlsClient client(server.port(), priorities, session);
        ASSERT_TRUE(client.ask()) << version;
        EXPECT_FALSE(client.resumed()) << version;
    }
}

}  // namespace cimom::test
