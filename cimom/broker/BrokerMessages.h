#pragma once

#include <cmpidt.h>

#include <cstdarg>
#include <string>
#include <string_view>

namespace cimom::broker {

/// The template with $0 to $9 replaced by the arguments: `count` pairs of a
/// CMPIType, passed as int, and a value as C widens it (32-bit integers as long,
/// smaller ones and booleans as int, reals as double, texts as pointers).
/// A placeholder without argument stays. False, with nothing written, for a type
/// that cannot be a message argument or for more than ten.
bool formatMessage(std::string_view text, CMPICount count, std::va_list arguments,
                   std::string& message);

}  // namespace cimom::broker
