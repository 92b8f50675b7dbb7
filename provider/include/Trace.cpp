#include "include/Trace.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstring>
#include <string_view>

#include "include/TracePoint.h"

namespace ZR {

namespace {

constexpr std::array plainFormats{
    "ENTERING: %s() in %s [Line: %d]",
    "EXITING: %s() in %s [Line: %d]",
    "METHOD: %s() was invoked in %s [Line: %d]",
    "MESSAGE [File: %s, Line: %d]: %s",
};

constexpr std::array parameterFormats{
    "ENTERING: %s() in %s [Line: %d],Parameters List: %s",
    "EXITING: %s() in %s [Line: %d],Parameters List: %s",
    "METHOD: %s() was invoked in %s [Line: %d],Parameters List: %s",
    "MESSAGE [File: %s, Line: %d]: %s,Parameters List: %s",
};

constexpr const char* textVariable = "VARIABLE: '%s' has Value '%s' at line %d in %s";
constexpr const char* numberVariable = "VARIABLE: '%s' has Value '%d' at line %d in %s";

/// The argument of one conversion: %s takes a text, %d a number.
struct Argument {
    // Implicit, so that a line reads like its format; the digits are written as needed.
    // NOLINTBEGIN(cppcoreguidelines-pro-type-member-init)
    Argument(const char* argument) : text(argument == nullptr ? "(null)" : argument) {}
    Argument(unsigned argument) {
        const auto* end =
            std::to_chars(digits.data(), digits.data() + digits.size(), static_cast<int>(argument))
                .ptr;
        text = std::string_view(digits.data(), end);
    }
    // NOLINTEND(cppcoreguidelines-pro-type-member-init)
    Argument(const Argument&) = delete;
    Argument& operator=(const Argument&) = delete;

    std::array<char, 12> digits;
    std::string_view text;
};

using Buffer = std::array<char, traceBufferSize>;

/// Formats into the zeroed buffer, up to its last byte, which stays zero. Knows
/// just the conversions that the formats above have.
template <std::size_t count>
const char* format(Buffer& buffer, std::string_view text, const Argument (&arguments)[count]) {
    buffer.fill('\0');
    char* out = buffer.data();
    const char* const last = buffer.data() + buffer.size() - 1;
    const auto put = [&out, last](std::string_view piece) {
        const auto room = static_cast<std::size_t>(last - out);
        const std::size_t size = std::min(piece.size(), room);
        std::memcpy(out, piece.data(), size);
        out += size;
    };
    for (const Argument& argument : arguments) {
        const std::size_t conversion = text.find('%');
        put(text.substr(0, conversion));
        put(argument.text);
        text.remove_prefix(conversion + 2);
    }
    put(text);
    return buffer.data();
}

const char* formatNothing(Buffer& buffer) {
    buffer.fill('\0');
    return buffer.data();
}

constexpr const char* separator =
    "==============================================================================";
static_assert(std::string_view(separator).size() == 78);

constexpr const char* markFile = "include/Trace";

}  // namespace

const char* trace(const char* variable, const char* file, unsigned line, const char* value) {
    static thread_local Buffer buffer;
    return format(buffer, textVariable, {variable, value, line, file});
}

const char* trace(const char* variable, const char* file, unsigned line, unsigned value) {
    static thread_local Buffer buffer;
    return format(buffer, numberVariable, {variable, value, line, file});
}

const char* trace(const char* file, const char* function, unsigned line, MessageType type) {
    static thread_local Buffer buffer;
    if (type > message) {
        return formatNothing(buffer);
    }
    if (type == message) {
        return format(buffer, plainFormats[type], {file, line, function});
    }
    return format(buffer, plainFormats[type], {function, file, line});
}

const char* tracepara(const char* file, const char* function, unsigned line, const char* parameters,
                      MessageType type) {
    static thread_local Buffer buffer;
    if (type > message) {
        return formatNothing(buffer);
    }
    if (type == message) {
        return format(buffer, parameterFormats[type], {file, line, function, parameters});
    }
    return format(buffer, parameterFormats[type], {function, file, line, parameters});
}

void markProviderEntry(const std::string& logger, const char* file, const char* function,
                       unsigned line) {
    const TraceSource source{markFile, logger};
    writeLine(ZR_HERE, flowLevel, [] { return separator; });
    writeLine(ZR_HERE, flowLevel, [&] { return trace(file, function, line, entering); });
}

void markProviderExit(const std::string& logger, const char* file, const char* function,
                      unsigned line) {
    const TraceSource source{markFile, logger};
    writeLine(ZR_HERE, flowLevel, [&] { return trace(file, function, line, exiting); });
    writeLine(ZR_HERE, flowLevel, [] { return separator; });
}

}  // namespace ZR
