#pragma once

#include <microhttpd.h>

#include <chrono>
#include <cstddef>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include "http/HttpHead.h"
#include "http/HttpResponse.h"
#include "wbem/Pages.h"

namespace cimom::wbem {

/// One request and its response. The reading thread owns it until it has been
/// handed over; then whoever comes first finishes it: a worker, the deadline, or
/// the end of the server.
class Exchange {
  public:
    using Clock = std::chrono::steady_clock;

    Exchange(MHD_Connection* connection, std::string address)
        : connection_(connection), address_(std::move(address)) {}

    // While the request is being read, by one thread.
    std::optional<CimHeaders> headers;
    std::optional<PageRequest> page;  ///< what a client of a server of pages asks for
    std::string body;
    std::size_t discarded = 0;          ///< bytes of the body that are not kept
    std::optional<HttpResponse> early;  ///< decided before the body had arrived
    Clock::time_point complete{};       ///< when the request had arrived

    [[nodiscard]] const std::string& address() const noexcept { return address_; }

    /// Lets the connection rest until finish(). Only in its own thread.
    void suspend();
    [[nodiscard]] bool handedOver() const;
    /// Whether it has its response: no client waits for another one.
    [[nodiscard]] bool isFinished() const;
    /// Gives the response and wakes the connection. Only the first call counts.
    void finish(HttpResponse response);
    /// The response, once there is one.
    [[nodiscard]] std::optional<HttpResponse> take();

  private:
    MHD_Connection* const connection_;
    const std::string address_;
    mutable std::mutex mutex_;
    bool handedOver_ = false;
    bool finished_ = false;
    std::optional<HttpResponse> response_;
};

using SharedExchange = std::shared_ptr<Exchange>;

}  // namespace cimom::wbem
