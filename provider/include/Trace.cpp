#include "include/Trace.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstring>
#include <string_view>

#include "include/TracePoint.h"

namespace ZR {

namespace {

/// A line format, taken apart at its conversions when the program is compiled: a
/// literal stands before each argument, and the last one behind them all.
struct Format {
    std::array<std::string_view, 5> literals;
    std::size_t arguments = 0;

    consteval explicit Format(std::string_view text) {
        for (std::size_t at = text.find('%'); at != std::string_view::npos; at = text.find('%')) {
            literals[arguments++] = text.substr(0, at);
            text.remove_prefix(at + 2);
        }
        literals[arguments] = text;
    }
};

constexpr std::array plainFormats{
    Format("ENTERING: %s() in %s [Line: %d]"),
    Format("EXITING: %s() in %s [Line: %d]"),
    Format("METHOD: %s() was invoked in %s [Line: %d]"),
    Format("MESSAGE [File: %s, Line: %d]: %s"),
};

constexpr std::array parameterFormats{
    Format("ENTERING: %s() in %s [Line: %d],Parameters List: %s"),
    Format("EXITING: %s() in %s [Line: %d],Parameters List: %s"),
    Format("METHOD: %s() was invoked in %s [Line: %d],Parameters List: %s"),
    Format("MESSAGE [File: %s, Line: %d]: %s,Parameters List: %s"),
};

constexpr Format textVariable("VARIABLE: '%s' has Value '%s' at line %d in %s");
constexpr Format numberVariable("VARIABLE: '%s' has Value '%d' at line %d in %s");

/// The argument of one conversion: %s takes a text, %d a number.
struct Argument {
    // Implicit, so that a line reads like its format; the digits are written as needed.
    // NOLINTBEGIN(cppcoreguidelines-pro-type-member-init)
    Argument(std::string_view argument) : text(argument) {}
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

/// Copies at least `block` bytes as a run of blocks and a last block that overlaps the run.
template <std::size_t block>
inline void copyBlocks(char* out, const char* in, std::size_t size) {
    for (std::size_t done = 0; done + block < size; done += block) {
        std::memcpy(out + done, in + done, block);
    }
    std::memcpy(out + size - block, in + size - block, block);
}

/// Copies a few bytes without a call: pieces of trace lines are short, and calling
/// memcpy for each costs more than the copying.
inline void copyShort(char* out, const char* in, std::size_t size) {
    if (size >= 16) {
        copyBlocks<16>(out, in, size);
    } else if (size >= 8) {
        copyBlocks<8>(out, in, size);
    } else if (size >= 4) {
        copyBlocks<4>(out, in, size);
    } else {
        for (std::size_t done = 0; done < size; ++done) {
            out[done] = in[done];
        }
    }
}

/// A buffer of one helper. Behind the text that was formatted last it is all zero,
/// so that zeroing it for a new text means zeroing what of the old one is longer.
struct Buffer {
    std::array<char, traceBufferSize> text;
    std::size_t used;

    /// Makes the first `size` bytes the whole content.
    std::string_view keep(std::size_t size) {
        if (size < used) {
            std::memset(text.data() + size, 0, used - size);
        }
        used = size;
        return {text.data(), used};
    }
};

/// Formats into the buffer, up to its last byte, which stays zero.
template <std::size_t count>
std::string_view format(Buffer& buffer, const Format& format, const Argument (&arguments)[count]) {
    char* const begin = buffer.text.data();
    char* const last = begin + buffer.text.size() - 1;
    char* end = begin;
    const auto put = [&end, last](std::string_view piece) {
        const std::size_t fits = std::min(piece.size(), static_cast<std::size_t>(last - end));
        copyShort(end, piece.data(), fits);
        end += fits;
    };
    for (std::size_t i = 0; i < count; ++i) {
        put(format.literals[i]);
        put(arguments[i].text);
    }
    put(format.literals[count]);
    return buffer.keep(static_cast<std::size_t>(end - begin));
}

std::string_view formatNothing(Buffer& buffer) {
    return buffer.keep(0);
}

constexpr std::string_view separator =
    "==============================================================================";
static_assert(separator.size() == 78);

constexpr const char* markFile = "include/Trace";

}  // namespace

namespace TraceText {

std::string_view variable(std::string_view name, std::string_view file, unsigned line,
                          std::string_view value) {
    static thread_local Buffer buffer{};
    return format(buffer, textVariable, {name, value, line, file});
}

std::string_view variable(std::string_view name, std::string_view file, unsigned line,
                          unsigned value) {
    static thread_local Buffer buffer{};
    return format(buffer, numberVariable, {name, value, line, file});
}

std::string_view plain(std::string_view file, std::string_view function, unsigned line,
                       MessageType type) {
    static thread_local Buffer buffer{};
    if (type > message) {
        return formatNothing(buffer);
    }
    if (type == message) {
        return format(buffer, plainFormats[type], {file, line, function});
    }
    return format(buffer, plainFormats[type], {function, file, line});
}

std::string_view withParameters(std::string_view file, std::string_view function, unsigned line,
                                std::string_view parameters, MessageType type) {
    static thread_local Buffer buffer{};
    if (type > message) {
        return formatNothing(buffer);
    }
    if (type == message) {
        return format(buffer, parameterFormats[type], {file, line, function, parameters});
    }
    return format(buffer, parameterFormats[type], {function, file, line, parameters});
}

}  // namespace TraceText

// A formatted text ends with the zero that its buffer keeps behind it.
const char* trace(const char* variable, const char* file, unsigned line, const char* value) {
    return TraceText::variable(TraceText::of(variable), TraceText::of(file), line,
                               TraceText::of(value))
        .data();
}

const char* trace(const char* variable, const char* file, unsigned line, unsigned value) {
    return TraceText::variable(TraceText::of(variable), TraceText::of(file), line, value).data();
}

const char* trace(const char* file, const char* function, unsigned line, MessageType type) {
    return TraceText::plain(TraceText::of(file), TraceText::of(function), line, type).data();
}

const char* tracepara(const char* file, const char* function, unsigned line, const char* parameters,
                      MessageType type) {
    return TraceText::withParameters(TraceText::of(file), TraceText::of(function), line,
                                     TraceText::of(parameters), type)
        .data();
}

void markProviderEntry(const std::string& logger, const char* file, const char* function,
                       unsigned line) {
    const TraceSource source{markFile, logger};
    writeLine(ZR_HERE, flowLevel, [] { return separator; });
    writeLine(ZR_HERE, flowLevel, [&] { return TraceText::plain(file, function, line, entering); });
}

void markProviderExit(const std::string& logger, const char* file, const char* function,
                      unsigned line) {
    const TraceSource source{markFile, logger};
    writeLine(ZR_HERE, flowLevel, [&] { return TraceText::plain(file, function, line, exiting); });
    writeLine(ZR_HERE, flowLevel, [] { return separator; });
}

}  // namespace ZR
