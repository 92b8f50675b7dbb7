#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string_view>
#include <variant>
#include <vector>

#include "Machine.h"
#include "formats/InterfaceName.h"
#include "formats/IpAddress.h"
#include "zrclient/NodeLexicon.h"

namespace ZR::Live {

/// What a value was taken from. All empty: the kernel's links and addresses. Borrows
/// the facts.
struct Origin {
    std::optional<Client> client;
    std::string_view file;
    std::int32_t pid = 0;  ///< of a process; 0 for none

    bool operator==(const Origin&) const = default;
};

/// A list of addresses as a value. A type of its own, for the reason that NumberList has
/// (Snapshot.h).
struct AddressList {
    std::vector<IpAddress> addresses;

    bool operator==(const AddressList&) const = default;
};

/// What the value of a property may be made of. The tree has texts of names and addresses.
using FoundValue = std::variant<bool, std::uint64_t, InterfaceName, IpAddress, AddressList>;

/// A value, and what it was taken from.
struct Finding {
    FoundValue value;
    Origin origin{};
};

/// One row of the precedence table: where the value of a property may come from.
struct DecisionRow {
    NodeLexicon::Properties property;
    std::string_view reason;
    /// nullopt: this row cannot tell, the next one of the property is asked.
    std::optional<Finding> (*find)(const InterfaceView& view);
};

/// The precedence table: of each property the first row that finds a value counts. A
/// property for which no row finds one is left out.
[[nodiscard]] std::span<const DecisionRow> precedence();

}  // namespace ZR::Live
