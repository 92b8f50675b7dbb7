#pragma once

#include <string>
#include <string_view>

#include "broker/objects/BrokerObjectPath.h"

namespace cimom::broker {

/// The kind of any object of this broker by its function table, e.g.
/// "CMPIInstance"; empty for anything else. The object must begin with a
/// handle and a table, as every CMPI object does.
[[nodiscard]] std::string_view kindOf(const void* object) noexcept;

/// root/cimv2:Class.Key="value"
[[nodiscard]] std::string textOf(const PathRecord& path);

/// A text form for people: of a path as above, of an instance its class and
/// properties, of a text the text. Empty for objects that are not this broker's.
[[nodiscard]] std::string describe(const void* object);

}  // namespace cimom::broker
