#pragma once

#include <stdexcept>
#include <string>

namespace cimdhcp {

/// How the program ends.
enum class ExitStatus : int {
    ok = 0,
    notDone = 1,        ///< the request was not fulfilled, or what it names does not exist
    usage = 2,          ///< the command line cannot be understood
    notLoaded = 3,      ///< what is needed cannot be loaded, reached, understood or written
    notAllDone = 4,     ///< some of several servers have failed
    interrupted = 130,  ///< as shells report the end by SIGINT
};

/// Ends the command. what() is one line for the user, with a remedy where there is one.
class Failure : public std::runtime_error {
  public:
    Failure(ExitStatus status, const std::string& message)
        : std::runtime_error(message), status_(status) {}

    [[nodiscard]] ExitStatus status() const noexcept { return status_; }

  private:
    ExitStatus status_;
};

}  // namespace cimdhcp
