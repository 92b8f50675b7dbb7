#include "include/Trace.h"

#include <string_view>

#include "include/TracePoint.h"

namespace ZR {

namespace {

using TraceText::Buffer;

constexpr std::string_view beforeParameters = ",Parameters List: ";

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

/// The literal before the rest of an entering or exiting line.
Buffer& begun(Buffer& buffer, MessageType type, std::string_view rest) {
    if (type == entering) {
        buffer.set("ENTERING: ", rest);
    } else {
        buffer.set("EXITING: ", rest);
    }
    return buffer;
}

constexpr std::string_view separator =
    "==============================================================================";
static_assert(separator.size() == 78);

constexpr const char* markFile = "include/Trace";

void writeSeparator(const TracePoint& at) {
    TKLog::TKMessageBuffer line;
    line << separator;
    writeLog(at, flowLevel, line.str());
    writeTrace(at, flowLevel, separator);
}

}  // namespace

namespace TraceText {

void describe(TKLog::TKMessageBuffer& rest, std::string_view file, std::string_view function,
              const LineNumber& line) {
    rest << function << std::string_view("() in ") << file << std::string_view(" [Line: ")
         << line.digits() << std::string_view("]");
}

void describeWithParameters(TKLog::TKMessageBuffer& rest, std::string_view file,
                            std::string_view function, const LineNumber& line) {
    describe(rest, file, function, line);
    rest << beforeParameters;
}

Buffer& plain(MessageType type, std::string_view rest) {
    return begun(buffersOfThread().plain, type, rest);
}

Buffer& withParameters(MessageType type, std::string_view rest) {
    return begun(buffersOfThread().withParameters, type, rest);
}

Buffer& invoked(std::string_view file, std::string_view function, const LineNumber& line) {
    Buffer& buffer = buffersOfThread().plain;
    buffer.set("METHOD: ", function, "() was invoked in ", file, " [Line: ", line.digits(), "]");
    return buffer;
}

Buffer& failure(std::string_view file, const LineNumber& line, std::string_view text) {
    Buffer& buffer = buffersOfThread().plain;
    buffer.set("MESSAGE [File: ", file, ", Line: ", line.digits(), "]: ", text);
    return buffer;
}

Buffer& variable(std::string_view name, std::string_view file, const LineNumber& line,
                 std::string_view value) {
    Buffer& buffer = buffersOfThread().textVariable;
    buffer.set("VARIABLE: '", name, "' has Value '", value, "' at line ", line.digits(), " in ",
               file);
    return buffer;
}

Buffer& variable(std::string_view name, std::string_view file, const LineNumber& line,
                 unsigned value) {
    Buffer& buffer = buffersOfThread().numberVariable;
    buffer.set("VARIABLE: '", name, "' has Value '", LineNumber(value).digits(), "' at line ",
               line.digits(), " in ", file);
    return buffer;
}

}  // namespace TraceText

// A formatted text ends with the zero that its buffer keeps behind it.
const char* trace(const char* variable, const char* file, unsigned line, const char* value) {
    return TraceText::variable(TraceText::of(variable), TraceText::of(file), line,
                               TraceText::of(value))
        .text()
        .data();
}

const char* trace(const char* variable, const char* file, unsigned line, unsigned value) {
    return TraceText::variable(TraceText::of(variable), TraceText::of(file), line, value)
        .text()
        .data();
}

const char* trace(const char* file, const char* function, unsigned line, MessageType type) {
    const std::string_view where = TraceText::of(file);
    const std::string_view what = TraceText::of(function);
    Buffer& buffer = buffersOfThread().plain;
    TKLog::TKMessageBuffer rest;
    switch (type) {
        case entering:
        case exiting:
            TraceText::describe(rest, where, what, line);
            begun(buffer, type, rest.str());
            break;
        case method:
            TraceText::invoked(where, what, line);
            break;
        case message:
            TraceText::failure(where, line, what);
            break;
        default:
            buffer.set();
            break;
    }
    return buffer.text().data();
}

const char* tracepara(const char* file, const char* function, unsigned line, const char* parameters,
                      MessageType type) {
    const std::string_view where = TraceText::of(file);
    const std::string_view what = TraceText::of(function);
    const std::string_view with = TraceText::of(parameters);
    const LineNumber at = line;
    Buffer& buffer = buffersOfThread().withParameters;
    TKLog::TKMessageBuffer rest;
    switch (type) {
        case entering:
        case exiting:
            TraceText::describeWithParameters(rest, where, what, at);
            rest << with;
            begun(buffer, type, rest.str());
            break;
        case method:
            buffer.set("METHOD: ", what, "() was invoked in ", where, " [Line: ", at.digits(), "]",
                       beforeParameters, with);
            break;
        case message:
            buffer.set("MESSAGE [File: ", where, ", Line: ", at.digits(), "]: ", what,
                       beforeParameters, with);
            break;
        default:
            buffer.set();
            break;
    }
    return buffer.text().data();
}

void markProviderEntry(const std::string& logger, const char* file, const char* function,
                       unsigned line) {
    const TraceSource source{markFile, logger};
    writeSeparator(ZR_HERE);
    TKLog::TKMessageBuffer rest;
    TraceText::describe(rest, TraceText::of(file), TraceText::of(function), line);
    writeLine(ZR_HERE, flowLevel, TraceText::plain(entering, rest.str()));
}

void markProviderExit(const std::string& logger, const char* file, const char* function,
                      unsigned line) {
    const TraceSource source{markFile, logger};
    TKLog::TKMessageBuffer rest;
    TraceText::describe(rest, TraceText::of(file), TraceText::of(function), line);
    writeLine(ZR_HERE, flowLevel, TraceText::plain(exiting, rest.str()));
    writeSeparator(ZR_HERE);
}

}  // namespace ZR
