#pragma once

#include <exception>
#include <string>
#include <string_view>

#include "include/Trace.h"
#include "tklogger/TKLogger.h"
#include "tklogger/TKMessageBuffer.h"

/// The places from which the provider traces. A source file names itself once,
///
///     const ZR::TraceSource source{"Lindows/DHCPProtocolEndpoint", loggerDHCPProtocolEndpoint};
///
/// and each of its trace points says ZR_HERE.
namespace ZR {

/// The category of all lines of the provider. Each source file has a logger string
/// of its own that holds it.
inline constexpr const char* loggerCategory = "Merrow.DHCPClientProvider";

/// A source file: its path below the provider's folder, without extension, and its logger.
struct TraceSource {
    std::string_view file;  ///< a literal
    const std::string& logger;
};

struct TracePoint {
    const TraceSource& source;
    std::string_view function;  ///< a literal
    LineNumber line;
};

/// A line's number, made when the program is compiled.
consteval LineNumber constantLine(unsigned line) {
    return {line};
}

/// This function and line of the file whose TraceSource is called `source`.
#define ZR_HERE \
    (::ZR::TracePoint{source, {__func__, sizeof(__func__) - 1}, ::ZR::constantLine(__LINE__)})

/// The trace points of one of several classes whose functions are written once for
/// all. They tell the class's own source file, and of it the line where its row
/// stands; which function it is, the name tells.
struct RowSource {
    TraceSource source;
    std::string_view destructorName;  ///< "~" and the name of the class, a literal
    LineNumber line;

    [[nodiscard]] TracePoint at(std::string_view function) const {
        return {source, function, line};
    }
    /// With the name of the function that says `at(__func__)`.
    template <std::size_t size>
    [[nodiscard]] TracePoint at(const char (&function)[size]) const {
        return at({function, size - 1});
    }
    [[nodiscard]] TracePoint constructor() const { return at(destructorName.substr(1)); }
    [[nodiscard]] TracePoint destructor() const { return at(destructorName); }
};

/// Hands a message to the log channel, or to the trace channel.
inline void writeLog(const TracePoint& at, int level, std::string_view message) {
    TKLog::TKLogger::logLevelMessage(at.source.file.data(), at.function.data(), at.line.number(),
                                     at.source.logger, level, nullptr, 0, 0, message);
}
inline void writeTrace(const TracePoint& at, int level, std::string_view message) {
    TKLog::TKLogger::traceLevelMessage(at.source.file.data(), at.function.data(), at.line.number(),
                                       at.source.logger, level, nullptr, 0, 0, message);
}

/// Hands a line to both channels of the logging service. The text is put into its buffer anew for
/// the second, since the first may have traced on its own: the bytes are the same, and copying
/// them costs a fraction of formatting them.
inline void writeLine(const TracePoint& at, int level, TraceText::Buffer& text) {
    TKLog::TKMessageBuffer line;
    line << text.text();
    writeLog(at, level, line.str());
    text.set(line.str());
    writeTrace(at, level, text.text());
}

/// VARIABLE lines.
void traceVariable(const TracePoint& at, std::string_view name, std::string_view value);
void traceVariable(const TracePoint& at, std::string_view name, unsigned value);
inline void traceVariable(const TracePoint& at, std::string_view name, const char* value) {
    traceVariable(at, name, TraceText::of(value));
}

/// A METHOD line.
void traceMethod(const TracePoint& at);

/// A MESSAGE line, at the level of failures.
void traceMessage(const TracePoint& at, const char* text);

/// Traces the entry to a function, and its exit unless an exception leaves it.
class TraceScope {
  public:
    explicit TraceScope(const TracePoint& at);
    TraceScope(const TraceScope&) = delete;
    TraceScope& operator=(const TraceScope&) = delete;
    ~TraceScope();

  private:
    TracePoint at_;
    int exceptions_ = std::uncaught_exceptions();
    TKLog::TKMessageBuffer rest_;  ///< of both lines
};

/// The same for a function with parameters: pairs of " name=" and a value, the
/// value of a pointer being its address.
class ParameterScope {
  public:
    template <typename... Pieces>
    explicit ParameterScope(const TracePoint& at, const Pieces&... pieces) : at_(at) {
        TraceText::describeWithParameters(rest_, at.source.file, at.function, at.line);
        (rest_ << ... << pieces);
        trace(entering);
    }
    ParameterScope(const ParameterScope&) = delete;
    ParameterScope& operator=(const ParameterScope&) = delete;
    ~ParameterScope();

  private:
    void trace(MessageType type) const;

    TracePoint at_;
    int exceptions_ = std::uncaught_exceptions();
    TKLog::TKMessageBuffer rest_;  ///< of both lines
};

}  // namespace ZR
