#include "include/Exceptions.h"

#include <utility>

namespace ZR {

FrameworkException::FrameworkException(std::string message) : message_(std::move(message)) {}
FrameworkException::~FrameworkException() = default;
const char* FrameworkException::what() const noexcept {
    return message_.c_str();
}

InstrumentationException::InstrumentationException(std::string message)
    : message_(std::move(message)) {}
InstrumentationException::~InstrumentationException() = default;
const char* InstrumentationException::what() const noexcept {
    return message_.c_str();
}

ProviderException::ProviderException(std::string message) : message_(std::move(message)) {}
ProviderException::~ProviderException() = default;
const char* ProviderException::what() const noexcept {
    return message_.c_str();
}

}  // namespace ZR
