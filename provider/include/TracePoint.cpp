#include "include/TracePoint.h"

namespace ZR {

void traceVariable(const TracePoint& at, std::string_view name, std::string_view value) {
    writeLine(at, flowLevel, TraceText::variable(name, at.source.file, at.line, value));
}

void traceVariable(const TracePoint& at, std::string_view name, unsigned value) {
    writeLine(at, flowLevel, TraceText::variable(name, at.source.file, at.line, value));
}

void traceMethod(const TracePoint& at) {
    writeLine(at, flowLevel, TraceText::invoked(at.source.file, at.function, at.line));
}

void traceMessage(const TracePoint& at, const char* text) {
    writeLine(at, failureLevel, TraceText::failure(at.source.file, at.line, TraceText::of(text)));
}

TraceScope::TraceScope(const TracePoint& at) : at_(at) {
    TraceText::describe(rest_, at.source.file, at.function, at.line);
    writeLine(at_, flowLevel, TraceText::plain(entering, rest_.str()));
}

TraceScope::~TraceScope() {
    if (std::uncaught_exceptions() == exceptions_) {
        writeLine(at_, flowLevel, TraceText::plain(exiting, rest_.str()));
    }
}

void ParameterScope::trace(MessageType type) const {
    writeLine(at_, parameterLevel, TraceText::withParameters(type, rest_.str()));
}

ParameterScope::~ParameterScope() {
    if (std::uncaught_exceptions() == exceptions_) {
        trace(exiting);
    }
}

}  // namespace ZR
