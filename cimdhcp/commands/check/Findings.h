#pragma once

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

#include "text/Failure.h"
#include "text/ProgressBar.h"

namespace cimdhcp {

class Client;
struct MachineInterfaces;

/// One thing that was looked at, for an administrator.
struct Finding {
    enum class Verdict { good, notable, bad };

    Verdict verdict = Verdict::good;
    std::string what;    ///< a few words
    std::string detail;  ///< what was found
    std::string remedy;  ///< what to do about it; empty when nothing has to be done

    bool operator==(const Finding&) const = default;
};

/// "1 class", "2 classes".
[[nodiscard]] std::string counted(std::size_t count, const std::string& one,
                                  const std::string& several);

/// The findings as a list with a line of the sum at its end.
[[nodiscard]] std::string findingsText(const std::vector<Finding>& findings);
/// {"findings": [{"verdict": "good" | "notable" | "bad", "what", "detail", "remedy"}]}
[[nodiscard]] std::string findingsJson(const std::vector<Finding>& findings);

/// Whether nothing bad was found.
[[nodiscard]] bool isGood(const std::vector<Finding>& findings) noexcept;
/// How a program ends that has printed findings which are not good.
[[nodiscard]] Failure somethingIsWrong();

/// What is wrong, or worth a look, about the DHCP clients of a machine, each with its
/// remedy: clients without a lease, links that are down, leases that have ended, and what
/// the diagnostics tell. Like troubles are one finding. `now` in seconds since the epoch.
[[nodiscard]] std::vector<Finding> machineFindings(const MachineInterfaces& machine,
                                                   std::int64_t now);

/// Asks an object manager for each class of this project, as its clients do, and tells which
/// of the responses are wrong, and what that comes from: a library that is not found, a class
/// without a provider, missing neighbours, the exact provider without its gateway. Of each
/// class, the first and the last instance are asked for and followed. Each class is two steps.
/// Throws Failure when the first request has no response.
[[nodiscard]] std::vector<Finding> serverFindings(Client& client, const TellStep& tell = untold);

/// Directories whose files shells or network scripts read.
[[nodiscard]] const std::vector<std::filesystem::path>& sourcedDirectories();

/// Examines the directory of the ifcfg-INTERFACE files: that it is there, can be read and
/// written by this user, and is none of those given, nor inside one, by whatever name.
void lookAtDataDirectory(const std::string& directory, std::vector<Finding>& findings,
                         const std::vector<std::filesystem::path>& sourced = sourcedDirectories());

}  // namespace cimdhcp
