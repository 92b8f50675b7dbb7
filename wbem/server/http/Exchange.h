#pragma once

#include <microhttpd.h>

#include <chrono>
#include <cstddef>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include "http/AddressShares.h"
#include "http/Authenticator.h"
#include "http/HttpHead.h"
#include "http/HttpResponse.h"
#include "wbem/Pages.h"

namespace cimom::wbem {

/// One request and its response. The reading thread owns it until it has been handed over:
/// behind its head, when its password has to be checked, and once it is complete. Then whoever
/// comes first gives it back or finishes it: who checks, a worker, the deadline, or the end of
/// the server.
class Exchange {
  public:
    using Clock = std::chrono::steady_clock;

    /// Borrows the shares, of which the client's address is `key`.
    Exchange(MHD_Connection* connection, std::string address, const AddressKey& key,
             AddressShares& shares)
        : memory(shares, key), connection_(connection), address_(std::move(address)), key_(key) {}

    // Of the thread that has it.
    std::optional<CimHeaders> headers;
    std::optional<PageRequest> page;  ///< what a client of a server of pages asks for
    bool wantsContinue = false;       ///< the client sends the body only when it is told to
    std::string body;
    RequestMemory memory;               ///< of the body, then also of what is made from it
    std::size_t discarded = 0;          ///< bytes of the body that are not kept
    std::optional<HttpResponse> early;  ///< decided before the body had arrived
    bool isHeadChecked = true;          ///< false from the head on until its password is right
    Clock::time_point complete{};       ///< when the request had arrived

    [[nodiscard]] const std::string& address() const noexcept { return address_; }
    [[nodiscard]] const AddressKey& key() const noexcept { return key_; }

    /// Lets the connection rest until giveBack() or finish(). Only in its own thread.
    void suspend();
    [[nodiscard]] bool handedOver() const;
    /// Whether it has its response: no client waits for another one.
    [[nodiscard]] bool isFinished() const;
    /// The user is admitted: wakes the connection, which brings the body. Not once finished.
    void giveBack(Identity identity);
    /// Gives the response and wakes the connection. Only the first call counts.
    void finish(HttpResponse response);
    /// The response, once there is one.
    [[nodiscard]] std::optional<HttpResponse> take();
    /// Who sent the request; none without users.
    [[nodiscard]] std::optional<Identity> identity() const;
    void setIdentity(Identity identity);

  private:
    MHD_Connection* const connection_;
    const std::string address_;
    const AddressKey key_;
    mutable std::mutex mutex_;
    bool handedOver_ = false;
    bool finished_ = false;
    std::optional<Identity> identity_;
    std::optional<HttpResponse> response_;
};

using SharedExchange = std::shared_ptr<Exchange>;

}  // namespace cimom::wbem
