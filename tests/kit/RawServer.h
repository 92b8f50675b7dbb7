#pragma once

#include <cstdint>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "zrcommon/UniqueFd.h"

namespace test {

/// A server on 127.0.0.1 that sends whatever a test wants, right or wrong: it reads a
/// request, sends the next of its responses as it is, and closes the connection. After
/// the last one it sends nothing more and holds connections open.
class RawServer {
  public:
    explicit RawServer(std::vector<std::string> responses);
    ~RawServer();
    RawServer(const RawServer&) = delete;
    RawServer& operator=(const RawServer&) = delete;

    [[nodiscard]] std::uint16_t port() const noexcept { return port_; }
    /// "http://127.0.0.1:40123"
    [[nodiscard]] std::string url() const;
    /// What has arrived so far, head and body.
    [[nodiscard]] std::vector<std::string> requests() const;

  private:
    void serve();

    ZR::UniqueFd listening_;
    ZR::UniqueFd end_;  ///< readable when it is to end
    ZR::UniqueFd ender_;
    std::uint16_t port_ = 0;
    std::vector<std::string> responses_;
    mutable std::mutex mutex_;
    std::vector<std::string> requests_;
    std::vector<ZR::UniqueFd> held_;
    std::thread thread_;
};

/// A port of 127.0.0.1 on which no server listens.
std::uint16_t deadPort();

/// A good HTTP response with that body.
std::string httpResponse(const std::string& body, const std::string& status = "200 OK",
                         const std::string& headers = "");

/// The message around an operation's result.
std::string cimResponse(const std::string& method, const std::string& content);

}  // namespace test
