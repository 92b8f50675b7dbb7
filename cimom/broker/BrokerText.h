#pragma once

#include <cmpidt.h>

#include <cstdarg>
#include <string>
#include <string_view>

#include "broker/objects/BrokerRecords.h"

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

/// The template with $0 to $9 replaced by the arguments: `count` pairs of a
/// CMPIType, passed as int, and a value as C widens it (32-bit integers as long,
/// smaller ones and booleans as int, reals as double, texts as pointers).
/// A placeholder without argument stays. False, with nothing written, for a type
/// that cannot be a message argument or for more than ten.
bool formatMessage(std::string_view text, CMPICount count, std::va_list arguments,
                   std::string& message);

}  // namespace cimom::broker
