#pragma once

#include <microhttpd.h>

#include <chrono>
#include <cstddef>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include "cimxml/Errors.h"
#include "http/HttpHead.h"
#include "operations/Answer.h"

namespace cimom::wbem {

/// What a client is answered: a CIM answer, or a failure of HTTP.
struct HttpAnswer {
    unsigned status = 200;
    std::string cimError;
    std::optional<Answer> body;
    std::string begun;          ///< the part of the body that is already written
    bool authenticate = false;  ///< tell the client that it needs credentials

    static HttpAnswer failure(unsigned status, std::string cimError = "");
    static HttpAnswer failure(const HttpFailure& failure);
    /// Of credentials, or of a request without them.
    static HttpAnswer refusal();
    /// Writes the beginning of the body at once.
    static HttpAnswer of(Answer answer);
};

/// One request and its answer. The reading thread owns it until it has been
/// handed over; then whoever comes first finishes it: a worker, the deadline, or
/// the end of the server.
class Exchange {
  public:
    using Clock = std::chrono::steady_clock;

    Exchange(MHD_Connection* connection, std::string address)
        : connection_(connection), address_(std::move(address)) {}

    // While the request is being read, by one thread.
    std::optional<CimHeaders> headers;
    std::string body;
    std::size_t discarded = 0;        ///< bytes of the body that are not kept
    std::optional<HttpAnswer> early;  ///< decided before the body had arrived
    Clock::time_point complete{};     ///< when the request had arrived

    [[nodiscard]] const std::string& address() const noexcept { return address_; }

    /// Lets the connection rest until finish(). Only in its own thread.
    void suspend();
    [[nodiscard]] bool handedOver() const;
    /// Whether it has its answer: nobody waits for another one.
    [[nodiscard]] bool isFinished() const;
    /// Gives the answer and wakes the connection. Only the first call counts.
    void finish(HttpAnswer answer);
    /// The answer, once there is one.
    [[nodiscard]] std::optional<HttpAnswer> take();

  private:
    MHD_Connection* const connection_;
    const std::string address_;
    mutable std::mutex mutex_;
    bool handedOver_ = false;
    bool finished_ = false;
    std::optional<HttpAnswer> answer_;
};

using SharedExchange = std::shared_ptr<Exchange>;

/// Sends the answer of a request, which may go on for long after the call.
/// `manPost`: the request was an M-POST. Answers what libmicrohttpd wants to hear.
[[nodiscard]] MHD_Result sendAnswer(MHD_Connection* connection, HttpAnswer answer, bool manPost,
                                    std::chrono::microseconds serverTime);

}  // namespace cimom::wbem
