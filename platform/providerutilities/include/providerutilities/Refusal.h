#pragma once

#include <cmpidt.h>

#include <stdexcept>
#include <string>

namespace ZR {

/// Ends a request with a status other than OK. The message is for the client.
class Refusal : public std::runtime_error {
  public:
    Refusal(CMPIrc code, const std::string& message) : std::runtime_error(message), code_(code) {}

    [[nodiscard]] CMPIrc code() const noexcept { return code_; }

  private:
    CMPIrc code_;
};

}  // namespace ZR
