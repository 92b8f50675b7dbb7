#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>

#include "cimom/Instance.h"

namespace cimom::wbem {

struct ListenerSettings {
    std::string address = "127.0.0.1";  ///< a numeric IPv4 or IPv6 address
    std::uint16_t port = 0;             ///< 0: one that is free
    // What one server may cost.
    std::size_t headers = 16384;        ///< bytes of all headers together
    std::size_t body = 1U << 20U;       ///< bytes of a message
    std::size_t depth = 64;             ///< of XML elements
    std::size_t connections = 512;      ///< at the same time
    std::chrono::seconds patience{30};  ///< for a message to go on
};

/// What a listener was handed over.
struct ReceivedIndication {
    Instance instance;
    std::string path;  ///< of the request, "/" at least: what stood in the URL of the destination
    std::string address;  ///< of the server that sent it
};

/// Gets the indications, one after the other, in a thread of the listener. It copies what it
/// needs and returns; true: the indication is taken, false: there is no room for it now, and the
/// server is to send it again.
using ReceiveIndication = std::function<bool(const ReceivedIndication&)>;

/// Why a listener does not start.
class ListenerError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// Takes indications from WBEM servers: ExportIndication of CIM-XML over HTTP (DSP0200). It
/// knows neither users nor TLS, and takes what any server that reaches it sends: whose
/// indications are wanted is told by the path of the URL, which a stranger cannot guess if it is
/// made so.
class Listener {
  public:
    /// Listens from now on. Throws ListenerError.
    Listener(ListenerSettings settings, ReceiveIndication receive);
    /// Returns when the receiver is not called any more.
    ~Listener();
    Listener(const Listener&) = delete;
    Listener& operator=(const Listener&) = delete;

    [[nodiscard]] std::uint16_t port() const noexcept;

  private:
    class Implementation;
    std::unique_ptr<Implementation> implementation_;
};

}  // namespace cimom::wbem
