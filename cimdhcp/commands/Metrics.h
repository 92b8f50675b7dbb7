#pragma once

#include <cstdint>
#include <functional>
#include <iosfwd>
#include <memory>
#include <string>
#include <vector>

#include "arguments/Commands.h"
#include "client/MachineInterfaces.h"
#include "wbem/Metrics.h"
#include "wbem/Server.h"

namespace cimdhcp {

using MetricFamilies = std::vector<cimom::wbem::MetricFamily>;

/// What Prometheus is told of a machine. `now` is the moment of the look, in seconds since the
/// epoch. What is not known has no value; of several interfaces of one name, the first one
/// counts, and of several leases of a family the leading one.
[[nodiscard]] MetricFamilies machineMetrics(const MachineInterfaces& machine, std::int64_t now);

/// Which version of this program tells, with names that begin with the prefix.
[[nodiscard]] cimom::wbem::MetricFamily buildInfo(const std::string& prefix);

/// The families in the form that the request prefers.
[[nodiscard]] cimom::wbem::Page metricsPage(const MetricFamilies& families,
                                            const cimom::wbem::PageRequest& request);

/// Gives the file that content, readable by all: who reads it sees the old or the new one, and
/// never a part. Throws Failure, also for what is not a regular file.
void replaceFile(const std::string& file, const std::string& content);

/// Asks this machine. May be called by several threads at once, and throw Failure.
using AskMetrics = std::function<MetricFamilies()>;

/// Serves GET /metrics, with what `ask` tells of the machine and what `further` tells of the
/// server; where the machine cannot be asked, with the latter alone. Throws ServerError.
[[nodiscard]] std::unique_ptr<cimom::wbem::Server> serveMetrics(
    cimom::wbem::ServerSettings settings, AskMetrics ask, std::function<MetricFamilies()> further,
    const cimom::wbem::ServerLog& log);

}  // namespace cimdhcp
