#pragma once

#include <cstddef>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "client/MachineInterfaces.h"
#include "text/Columns.h"
#include "text/Style.h"

namespace cimdhcp {

class Client;

/// Asks the provider for what it serves. Throws Failure for any response that is neither
/// OK nor says that the class is not served.
[[nodiscard]] ServedInstances askProvider(Client& client);

/// The interfaces as a table, with a line below it when none of them uses DHCP;
/// that line alone when there are none. The system stands in a column of its own
/// when not all of them are the host's.
[[nodiscard]] std::string overviewTable(const std::vector<InterfaceOverview>& interfaces,
                                        std::optional<std::size_t> width, const Style& style = {});

/// All columns, that of the system first.
[[nodiscard]] const std::vector<Column<InterfaceOverview>>& overviewColumns();

/// {"interfaces": [{"interface", "system", "dhcp", "state", "address", "servers",
/// "configurationName"}]}; what is not known is null.
[[nodiscard]] std::string overviewJson(const std::vector<InterfaceOverview>& interfaces);

/// One line for what could not be read of the machine, with the first few of many;
/// empty when there was nothing.
[[nodiscard]] std::string diagnosticLine(std::span<const ZR::Diagnostic> diagnostics);

}  // namespace cimdhcp
