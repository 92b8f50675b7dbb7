#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "tklogger/TKMessageBuffer.h"

/// The vocabulary in which the provider tells the logging service what it does:
/// line formats, levels, and the marks that frame each request.
namespace ZR {

/// Levels of the lines.
inline constexpr int parameterLevel = 3000;  ///< entering and exiting lines with parameters
inline constexpr int flowLevel = 4000;       ///< all other flow and variable lines
inline constexpr int failureLevel = 6000;    ///< failures

/// The kinds of lines that trace and tracepara format. Any other value formats nothing.
enum MessageType : unsigned int {
    entering = 0,
    exiting = 1,
    method = 2,
    message = 3,
};

/// Size of each helper's text buffer; longer lines end after one character less.
inline constexpr std::size_t traceBufferSize = 512;

// Each of these formats one line into a buffer of its own, one per thread, and
// returns the buffer: the text is valid until the same helper is called again on
// the same thread. Numbers are written as signed decimals of 32 bits.

/// VARIABLE: 'variable' has Value 'value' at line N in file
const char* trace(const char* variable, const char* file, unsigned line, const char* value);
const char* trace(const char* variable, const char* file, unsigned line, unsigned value);

/// The entering, exiting or method line of a function; for `message`, the message
/// line with `function` standing where the message goes.
const char* trace(const char* file, const char* function, unsigned line, MessageType type);

/// The same with a list of parameters behind it.
const char* tracepara(const char* file, const char* function, unsigned line, const char* parameters,
                      MessageType type);

/// The same texts for callers that know their lengths; they share the helpers' buffers.
namespace TraceText {

/// A text that may be null, which is written as formatted printing writes it.
inline std::string_view of(const char* text) {
    return text == nullptr ? "(null)" : text;
}

std::string_view variable(std::string_view name, std::string_view file, unsigned line,
                          std::string_view value);
std::string_view variable(std::string_view name, std::string_view file, unsigned line,
                          unsigned value);
std::string_view plain(std::string_view file, std::string_view function, unsigned line,
                       MessageType type);
std::string_view withParameters(std::string_view file, std::string_view function, unsigned line,
                                std::string_view parameters, MessageType type);

}  // namespace TraceText

/// Frame a request: a separator and the entering line; the exiting line and a
/// separator. Their source location is that of the mark itself.
void markProviderEntry(const std::string& logger, const char* file, const char* function,
                       unsigned line);
void markProviderExit(const std::string& logger, const char* file, const char* function,
                      unsigned line);

}  // namespace ZR
