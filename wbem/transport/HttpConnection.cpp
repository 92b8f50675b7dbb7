#include "transport/HttpConnection.h"

#include <curl/curl.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <new>

#include "cimom/Names.h"

namespace cimom::wbem {

namespace {

/// Bytes of all headers of a response.
constexpr std::size_t longestHeaders = 65536;

struct FreeHandle {
    void operator()(CURL* handle) const noexcept { curl_easy_cleanup(handle); }
};
struct FreeList {
    void operator()(curl_slist* list) const noexcept { curl_slist_free_all(list); }
};
using Headers = std::unique_ptr<curl_slist, FreeList>;

/// The library is set up once, before the first handle of any thread.
void setUpLibrary() {
    static const CURLcode done = curl_global_init(CURL_GLOBAL_DEFAULT);
    if (done != CURLE_OK) {
        throw ConnectionError(curl_easy_strerror(done));
    }
}

void append(Headers& list, const std::string& header) {
    curl_slist* const longer = curl_slist_append(list.get(), header.c_str());
    if (longer == nullptr) {
        throw std::bad_alloc();
    }
    // The head changes only when the list was empty.
    static_cast<void>(list.release());
    list.reset(longer);
}

}  // namespace

const std::string* ReceivedResponse::header(std::string_view name) const noexcept {
    const auto found = std::find_if(headers.begin(), headers.end(), [name](const auto& each) {
        return sameName(each.first, name);
    });
    return found == headers.end() ? nullptr : &found->second;
}

/// The handle, and what its callbacks fill. The callbacks are called from C, which no
/// exception may pass through: a reason to stop is kept until the transfer has returned.
class HttpConnection::Transfer {
  public:
    Transfer(HttpUrl url, HttpSettings settings, const Deadline& deadline)
        : url_(std::move(url)), settings_(std::move(settings)), deadline_(deadline) {
        setUpLibrary();
        handle_.reset(curl_easy_init());
        if (!handle_) {
            throw std::bad_alloc();
        }
        set(CURLOPT_ERRORBUFFER, error_.data());
        set(CURLOPT_NOSIGNAL, 1L);
        set(CURLOPT_PROTOCOLS_STR, "http,https");
        set(CURLOPT_URL, url_.text().c_str());
        set(CURLOPT_PROXY, "");
        set(CURLOPT_HTTP_VERSION, static_cast<long>(CURL_HTTP_VERSION_1_1));
        set(CURLOPT_SSLVERSION, static_cast<long>(CURL_SSLVERSION_TLSv1_2));
        set(CURLOPT_WRITEFUNCTION, &takeBody);
        set(CURLOPT_WRITEDATA, this);
        set(CURLOPT_HEADERFUNCTION, &takeHeader);
        set(CURLOPT_HEADERDATA, this);
        set(CURLOPT_XFERINFOFUNCTION, &goOn);
        set(CURLOPT_XFERINFODATA, this);
        set(CURLOPT_NOPROGRESS, 0L);
        // A name that is still being looked up at the end is not waited for.
        set(CURLOPT_QUICK_EXIT, 1L);
        if (settings_.insecure) {
            set(CURLOPT_SSL_VERIFYPEER, 0L);
            set(CURLOPT_SSL_VERIFYHOST, 0L);
        } else if (settings_.caCertificates) {
            set(CURLOPT_CAINFO, settings_.caCertificates->c_str());
            // Those of the system's directory would count, too, and cost a connection 50 ms and
            // some megabytes.
            set(CURLOPT_CAPATH, static_cast<const char*>(nullptr));
        }
        if (settings_.credential) {
            set(CURLOPT_HTTPAUTH, static_cast<long>(CURLAUTH_BASIC));
            set(CURLOPT_USERNAME, settings_.credential->user.c_str());
            set(CURLOPT_PASSWORD, settings_.credential->password.c_str());
        }
    }

    ReceivedResponse post(const std::vector<std::string>& headers, const std::string& body) {
        const auto left = deadline_.left();
        if (left.count() == 0) {
            throw ConnectionError(tooLate(), ConnectionError::Kind::tooLate);
        }
        Headers list;
        for (const std::string& header : headers) {
            append(list, header);
        }
        // No "100 Continue" is waited for: a server without it would cost a second.
        append(list, "Expect:");
        response_ = {};
        headerBytes_ = 0;
        reason_ = Reason::none;
        error_.front() = '\0';
        set(CURLOPT_TIMEOUT_MS, static_cast<long>(left.count()));
        set(CURLOPT_CONNECTTIMEOUT_MS,
            static_cast<long>(std::min(left, settings_.connectPatience).count()));
        set(CURLOPT_HTTPHEADER, list.get());
        set(CURLOPT_POSTFIELDSIZE_LARGE, static_cast<curl_off_t>(body.size()));
        set(CURLOPT_POSTFIELDS, body.c_str());
        const CURLcode code = curl_easy_perform(handle_.get());
        set(CURLOPT_HTTPHEADER, static_cast<curl_slist*>(nullptr));
        set(CURLOPT_POSTFIELDS, static_cast<const char*>(nullptr));
        if (reason_ == Reason::memory) {
            throw std::bad_alloc();
        }
        if (code != CURLE_OK) {
            throw ConnectionError(reasonOf(code), reason_ == Reason::none
                                                      ? kindOf(code)
                                                      : ConnectionError::Kind::other);
        }
        long status = 0;
        curl_easy_getinfo(handle_.get(), CURLINFO_RESPONSE_CODE, &status);
        response_.status = static_cast<unsigned>(status);
        return std::move(response_);
    }

    [[nodiscard]] const HttpSettings& settings() const noexcept { return settings_; }
    void extend(const Deadline& deadline) { deadline_ = deadline; }

  private:
    enum class Reason { none, memory, noRoom, bodyTooLong, headersTooLong, interrupted };

    template <typename Value>
    void set(CURLoption option, Value value) {
        const CURLcode code = curl_easy_setopt(handle_.get(), option, value);
        if (code != CURLE_OK) {
            throw ConnectionError(curl_easy_strerror(code));
        }
    }

    template <typename Step>
    std::size_t guarded(std::size_t taken, const Step& step) noexcept {
        try {
            step();
        } catch (const std::bad_alloc&) {
            reason_ = Reason::memory;
        }
        return reason_ == Reason::none ? taken : 0;
    }

    static std::size_t takeBody(char* data, std::size_t /*one*/, std::size_t size, void* self) {
        Transfer& transfer = *static_cast<Transfer*>(self);
        return transfer.guarded(size, [&] {
            if (size > transfer.settings_.longestResponse - transfer.response_.body.size()) {
                transfer.reason_ = Reason::bodyTooLong;
            } else if (transfer.settings_.mayGrow && !transfer.settings_.mayGrow(size)) {
                transfer.reason_ = Reason::noRoom;
            } else {
                transfer.response_.body.append(data, size);
            }
        });
    }

    static std::size_t takeHeader(char* data, std::size_t /*one*/, std::size_t size, void* self) {
        Transfer& transfer = *static_cast<Transfer*>(self);
        return transfer.guarded(size, [&] {
            transfer.headerBytes_ += size;
            if (transfer.headerBytes_ > longestHeaders) {
                transfer.reason_ = Reason::headersTooLong;
                return;
            }
            const std::string_view line(data, size);
            if (line.starts_with("HTTP/")) {
                transfer.response_.headers.clear();  // "100 Continue" came before
            }
            const std::size_t colon = line.find(':');
            if (colon != std::string_view::npos) {
                std::string value(line.substr(colon + 1));
                value.erase(value.find_last_not_of(" \t\r\n") + 1);
                value.erase(0, value.find_first_not_of(" \t"));
                transfer.response_.headers.emplace_back(line.substr(0, colon), std::move(value));
            }
        });
    }

    static int goOn(void* self, curl_off_t /*downloadTotal*/, curl_off_t /*downloaded*/,
                    curl_off_t /*uploadTotal*/, curl_off_t /*uploaded*/) {
        Transfer& transfer = *static_cast<Transfer*>(self);
        const std::atomic<bool>* const interrupted = transfer.settings_.interrupted;
        if (interrupted != nullptr && interrupted->load()) {
            transfer.reason_ = Reason::interrupted;
            return 1;
        }
        return 0;
    }

    /// Whether a time that is over is the one for the connection to stand, the only one that is
    /// shorter than the whole.
    [[nodiscard]] bool isUnconnected() const { return deadline_.left().count() > 0; }

    [[nodiscard]] std::string tooLate() const {
        return "no response within " +
               std::to_string(
                   std::chrono::ceil<std::chrono::seconds>(deadline_.patience()).count()) +
               " s";
    }

    [[nodiscard]] std::string detail(CURLcode code) const {
        return error_.front() == '\0' ? curl_easy_strerror(code) : error_.data();
    }

    [[nodiscard]] std::string systemError() const {
        long number = 0;
        curl_easy_getinfo(handle_.get(), CURLINFO_OS_ERRNO, &number);
        return number == 0 ? std::string() : std::strerror(static_cast<int>(number));
    }

    [[nodiscard]] ConnectionError::Kind kindOf(CURLcode code) const {
        switch (code) {
            case CURLE_OPERATION_TIMEDOUT:
                return isUnconnected() ? ConnectionError::Kind::other
                                       : ConnectionError::Kind::tooLate;
            case CURLE_PEER_FAILED_VERIFICATION:
                return ConnectionError::Kind::notTrusted;
            case CURLE_SSL_CACERT_BADFILE:
                return ConnectionError::Kind::badCertificates;
            default:
                return ConnectionError::Kind::other;
        }
    }

    [[nodiscard]] std::string reasonOf(CURLcode code) const {
        switch (reason_) {
            case Reason::noRoom:
                return "there was no room for the response in time";
            case Reason::bodyTooLong:
                return "the response is longer than " + std::to_string(settings_.longestResponse) +
                       " bytes";
            case Reason::headersTooLong:
                return "the headers of the response are longer than " +
                       std::to_string(longestHeaders) + " bytes";
            case Reason::interrupted:
                return "interrupted";
            case Reason::memory:
            case Reason::none:
                break;
        }
        switch (code) {
            case CURLE_OPERATION_TIMEDOUT:
                return isUnconnected() ? "cannot be reached: no connection within " +
                                             std::to_string(std::chrono::ceil<std::chrono::seconds>(
                                                                settings_.connectPatience)
                                                                .count()) +
                                             " s"
                                       : tooLate();
            case CURLE_COULDNT_RESOLVE_HOST:
                return "there is no address for the name " + url_.host;
            case CURLE_COULDNT_CONNECT: {
                const std::string error = systemError();
                return "cannot be reached: " + (error.empty() ? detail(code) : error);
            }
            case CURLE_PEER_FAILED_VERIFICATION:
                return "its certificate is not to be trusted (" + detail(code) + ')';
            case CURLE_SSL_CACERT_BADFILE:
                return "the certificates that vouch for it cannot be read (" + detail(code) + ')';
            case CURLE_SSL_CONNECT_ERROR:
                return "it does not speak TLS, or none that is accepted (" + detail(code) + ')';
            case CURLE_GOT_NOTHING:
                return "it closed the connection without a response";
            case CURLE_PARTIAL_FILE:
                return "the response is cut off";
            default:
                return "no usable response (" + detail(code) + ')';
        }
    }

    const HttpUrl url_;
    const HttpSettings settings_;
    Deadline deadline_;
    std::unique_ptr<CURL, FreeHandle> handle_;
    std::array<char, CURL_ERROR_SIZE> error_{};
    ReceivedResponse response_;
    std::size_t headerBytes_ = 0;
    Reason reason_ = Reason::none;
};

HttpConnection::HttpConnection(const HttpUrl& url, HttpSettings settings, const Deadline& deadline)
    : transfer_(std::make_unique<Transfer>(url, std::move(settings), deadline)) {}

HttpConnection::~HttpConnection() = default;

ReceivedResponse HttpConnection::post(const std::vector<std::string>& headers,
                                      const std::string& body) {
    return transfer_->post(headers, body);
}

void HttpConnection::extend(const Deadline& deadline) {
    transfer_->extend(deadline);
}

const HttpSettings& HttpConnection::settings() const noexcept {
    return transfer_->settings();
}

}  // namespace cimom::wbem
