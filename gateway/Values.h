#pragma once

#include <cmpift.h>

#include <cstdint>
#include <optional>
#include <string>

namespace ZR::DHCPClientGateway {

/// A property of an instance; one with a null state when it is absent or null.
[[nodiscard]] CMPIData propertyOf(const CMPIInstance* instance, const char* name);

/// Whether there is no value.
[[nodiscard]] bool isNull(const CMPIData& data) noexcept;

/// The text of a text value; none for null and for other types.
[[nodiscard]] std::optional<std::string> textOf(const CMPIData& data);

/// The value of a whole number that is not negative; none for null and for other types.
[[nodiscard]] std::optional<std::uint64_t> numberOf(const CMPIData& data);

/// Whether two values are the same: texts, date-times, booleans, numbers whatever their
/// types, and arrays of these. Two nulls are; values of other types are not.
[[nodiscard]] bool sameValue(const CMPIData& one, const CMPIData& other);

}  // namespace ZR::DHCPClientGateway
