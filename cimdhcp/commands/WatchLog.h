#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "client/MachineInterfaces.h"
#include "commands/WatchedChanges.h"
#include "text/Presentation.h"

namespace cimdhcp {

/// Compares what machines look like with what they looked like before, and writes the
/// differences.
class WatchLog {
  public:
    struct Form {
        bool json = false;
        bool hosts = false;  ///< each line names its machine
        std::string arrow = "->";
    };

    /// Watches the interfaces with these names, or all if there are none, of the machines
    /// with those names.
    WatchLog(std::vector<std::string> interfaces, std::vector<std::string> machines, Form form,
             const Outputs& outputs);

    /// A machine looks like this now. Of its first look, nothing is written.
    /// Throws Failure when the output cannot be written.
    void saw(std::size_t machine, std::vector<InterfaceOverview> interfaces, std::int64_t now);
    /// A machine could not be looked at. Told once for the same reason.
    void failed(std::size_t machine, const std::string& reason);
    [[nodiscard]] bool hasFailed(std::size_t machine) const {
        return !views_[machine].trouble.empty();
    }

    /// Time has passed: leases may have ended. Throws like saw().
    void age(std::int64_t now);
    /// The next moment for age().
    [[nodiscard]] std::optional<std::int64_t> nextAge(std::int64_t now) const;

    /// Tells on standard error that the watch has begun.
    void announce() const;

  private:
    struct View {
        std::string machine;
        bool seen = false;
        std::vector<InterfaceOverview> interfaces;
        std::vector<WatchedInterface> states;
        std::string trouble;  ///< why it could not be looked at last time
    };

    void update(View& view, std::int64_t now) const;
    void write(const View& view, const WatchedChange& change, std::int64_t now) const;

    std::vector<std::string> interfaces_;
    std::vector<View> views_;
    Form form_;
    const Outputs& outputs_;
};

}  // namespace cimdhcp
