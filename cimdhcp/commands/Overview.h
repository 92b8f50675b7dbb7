#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "client/MachineInterfaces.h"
#include "text/Columns.h"
#include "text/JsonText.h"
#include "text/Style.h"

namespace cimdhcp {

class Client;

// `now` is the moment of the look, in seconds since the epoch: states and the ends of leases
// are told from it.

/// Whether what could not be read is asked for, too.
enum class AskDiagnostics : bool { No, Yes };

/// Asks the provider for all that it tells of interfaces: by its own classes, or as far as
/// those of the standard tell where it does not serve these. Throws Failure for any response
/// that is neither OK nor says that the class is not served, and where neither kind of
/// classes is served.
[[nodiscard]] MachineInterfaces askMachine(Client& client, AskDiagnostics diagnostics);
/// The same, where the DHCP classes of the standard have been asked for.
[[nodiscard]] MachineInterfaces askMachine(Client& client, AskDiagnostics diagnostics,
                                           const ServedInstances& served);
/// What the provider tells by the DHCP classes of the standard.
[[nodiscard]] ServedInstances askServed(Client& client);

/// The interfaces as a table, with a line below it when none of them uses DHCP;
/// that line alone when there are none. The system stands in a column of its own
/// when not all of them are the host's. What there is not is "-", what is not known "?".
[[nodiscard]] std::string overviewTable(const std::vector<InterfaceOverview>& interfaces,
                                        std::int64_t now, std::optional<std::size_t> width,
                                        const Style& style = {});

/// All columns, that of the system first.
[[nodiscard]] std::vector<Column<InterfaceOverview>> overviewColumns(std::int64_t now);

/// {"interfaces": [{"interface", "system", "dhcp", "state", "link", "client", "address",
/// "expires", "servers", "configurationName", "leases", "unknown"}]}. What there is not is
/// null, and what is not known, too, whose names "unknown" lists. Moments are
/// {"seconds", "time"}; "leases" has what DHCPLease nodes have, each with its state.
[[nodiscard]] std::string overviewJson(const std::vector<InterfaceOverview>& interfaces,
                                       std::int64_t now);

/// One of these interfaces.
[[nodiscard]] JsonMembers interfaceJson(const InterfaceOverview& interface, std::int64_t now);

/// Notes for standard error: what of the table nothing tells. Empty when all is known.
[[nodiscard]] std::string unknownText(const std::vector<InterfaceOverview>& interfaces,
                                      std::int64_t now);

}  // namespace cimdhcp
