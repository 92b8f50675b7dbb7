#include "include/Trace.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <concepts>
#include <cstring>
#include <string_view>
#include <utility>

#include "include/TracePoint.h"

namespace ZR {

namespace {

/// A line format, taken apart at its conversions when the program is compiled: a
/// literal stands before each argument, and the last one behind them all.
struct Format {
    std::array<std::string_view, 5> literals;
    std::size_t arguments = 0;
    std::size_t literalSize = 0;

    consteval explicit Format(std::string_view text) {
        for (std::size_t at = text.find('%'); at != std::string_view::npos; at = text.find('%')) {
            literals[arguments++] = text.substr(0, at);
            literalSize += at;
            text.remove_prefix(at + 2);
        }
        literals[arguments] = text;
        literalSize += text.size();
    }
};

constexpr Format enteringPlain("ENTERING: %s() in %s [Line: %d]");
constexpr Format exitingPlain("EXITING: %s() in %s [Line: %d]");
constexpr Format methodPlain("METHOD: %s() was invoked in %s [Line: %d]");
constexpr Format messagePlain("MESSAGE [File: %s, Line: %d]: %s");

constexpr Format enteringParameters("ENTERING: %s() in %s [Line: %d],Parameters List: %s");
constexpr Format exitingParameters("EXITING: %s() in %s [Line: %d],Parameters List: %s");
constexpr Format methodParameters("METHOD: %s() was invoked in %s [Line: %d],Parameters List: %s");
constexpr Format messageParameters("MESSAGE [File: %s, Line: %d]: %s,Parameters List: %s");

constexpr Format textVariable("VARIABLE: '%s' has Value '%s' at line %d in %s");
constexpr Format numberVariable("VARIABLE: '%s' has Value '%d' at line %d in %s");

/// The argument of one conversion: %s takes a text, %d a number.
struct Argument {
    // The digits are written as needed.
    // NOLINTBEGIN(cppcoreguidelines-pro-type-member-init)
    explicit Argument(std::string_view argument) : text(argument) {}
    explicit Argument(unsigned argument) {
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

/// Those of one thread.
struct Buffers {
    Buffer textVariable;
    Buffer numberVariable;
    Buffer plain;
    Buffer withParameters;
};

/// In a shared library the address of a thread's variable takes a call, and the compiler makes
/// that call for every piece of a line where it can see through to it.
#ifdef __clang__
[[gnu::noinline]]
#else
[[gnu::noipa]]
#endif
Buffers&
buffersOfThread() {
    static thread_local Buffers buffers{};
    return buffers;
}

/// Formats a text that fits. Literals have sizes known to the compiler here, which
/// turns the copying of each into a few moves.
template <const Format& format, std::size_t... index, typename... Arguments>
void formatWhole(char* out, std::index_sequence<index...> /*all*/, const Arguments&... arguments) {
    const auto putLiteral = [&out]<std::size_t at>() {
        constexpr std::string_view literal = format.literals[at];
        std::memcpy(out, literal.data(), literal.size());
        out += literal.size();
    };
    const auto putArgument = [&out](const Argument& argument) {
        copyShort(out, argument.text.data(), argument.text.size());
        out += argument.text.size();
    };
    ((putLiteral.template operator()<index>(), putArgument(arguments)), ...);
    putLiteral.template operator()<sizeof...(index)>();
}

/// Formats what of the text fits into the buffer; returns the size.
template <std::size_t count>
std::size_t formatCut(Buffer& buffer, const Format& format,
                      const std::array<std::string_view, count>& arguments) {
    std::size_t size = 0;
    const auto put = [&size, &buffer](std::string_view piece) {
        size += piece.copy(buffer.text.data() + size, buffer.text.size() - 1 - size);
    };
    for (std::size_t i = 0; i < count; ++i) {
        put(format.literals[i]);
        put(arguments[i]);
    }
    put(format.literals[count]);
    return size;
}

/// Formats into the buffer, up to its last byte, which stays zero.
template <const Format& format, std::same_as<Argument>... Arguments>
std::string_view formatAll(Buffer& buffer, const Arguments&... arguments) {
    static_assert(sizeof...(arguments) == format.arguments);
    const std::size_t size = format.literalSize + (arguments.text.size() + ...);
    if (size >= buffer.text.size()) {
        return buffer.keep(formatCut<sizeof...(arguments)>(buffer, format, {arguments.text...}));
    }
    formatWhole<format>(buffer.text.data(), std::index_sequence_for<Arguments...>(), arguments...);
    return buffer.keep(size);
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
    return formatAll<textVariable>(buffersOfThread().textVariable, Argument(name), Argument(value),
                                   Argument(line), Argument(file));
}

std::string_view variable(std::string_view name, std::string_view file, unsigned line,
                          unsigned value) {
    return formatAll<numberVariable>(buffersOfThread().numberVariable, Argument(name),
                                     Argument(value), Argument(line), Argument(file));
}

std::string_view plain(std::string_view file, std::string_view function, unsigned line,
                       MessageType type) {
    Buffer& buffer = buffersOfThread().plain;
    const Argument where(file);
    const Argument what(function);
    const Argument at(line);
    switch (type) {
        case entering:
            return formatAll<enteringPlain>(buffer, what, where, at);
        case exiting:
            return formatAll<exitingPlain>(buffer, what, where, at);
        case method:
            return formatAll<methodPlain>(buffer, what, where, at);
        case message:
            return formatAll<messagePlain>(buffer, where, at, what);
        default:
            return formatNothing(buffer);
    }
}

std::string_view withParameters(std::string_view file, std::string_view function, unsigned line,
                                std::string_view parameters, MessageType type) {
    Buffer& buffer = buffersOfThread().withParameters;
    const Argument where(file);
    const Argument what(function);
    const Argument at(line);
    const Argument with(parameters);
    switch (type) {
        case entering:
            return formatAll<enteringParameters>(buffer, what, where, at, with);
        case exiting:
            return formatAll<exitingParameters>(buffer, what, where, at, with);
        case method:
            return formatAll<methodParameters>(buffer, what, where, at, with);
        case message:
            return formatAll<messageParameters>(buffer, where, at, what, with);
        default:
            return formatNothing(buffer);
    }
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
