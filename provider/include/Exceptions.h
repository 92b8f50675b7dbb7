#pragma once

#include <exception>
#include <string>

/// How failures inside the provider travel to the request handlers, which turn
/// them into log lines. Each carries one message; what() is valid as long as the
/// exception.
namespace ZR {

/// A malformed or incomplete moniker or object path was met.
class FrameworkException : public std::exception {
  public:
    explicit FrameworkException(std::string message);
    ~FrameworkException() override;
    [[nodiscard]] const char* what() const noexcept override;

  private:
    std::string message_;
};

/// The instrumentation could not deliver a node that must exist.
class InstrumentationException : public std::exception {
  public:
    explicit InstrumentationException(std::string message);
    ~InstrumentationException() override;
    [[nodiscard]] const char* what() const noexcept override;

  private:
    std::string message_;
};

/// An adapter could not obtain an object that a path refers to.
class ProviderException : public std::exception {
  public:
    explicit ProviderException(std::string message);
    ~ProviderException() override;
    [[nodiscard]] const char* what() const noexcept override;

  private:
    std::string message_;
};

}  // namespace ZR
