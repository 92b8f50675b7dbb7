#pragma once

#include <cmpidt.h>

#include <span>
#include <stdexcept>
#include <string>

namespace ZR {

class Keys;

/// Ends a request with a status other than OK. The message is for the client.
class Refusal : public std::runtime_error {
  public:
    Refusal(CMPIrc code, const std::string& message) : std::runtime_error(message), code_(code) {}

    [[nodiscard]] CMPIrc code() const noexcept { return code_; }

  private:
    CMPIrc code_;
};

enum class KeyKind { text, reference };

/// Throws Refusal with CMPI_RC_ERR_INVALID_PARAMETER unless a path has the keys of its class,
/// all of that kind, and no other ones.
void requireKeys(const char* className, std::span<const char* const> names, KeyKind kind,
                 const Keys& keys);

/// Throws Refusal with CMPI_RC_ERR_NOT_FOUND: nothing of the class has these keys.
[[noreturn]] void refuseMissing(const char* className, const Keys& keys);

}  // namespace ZR
