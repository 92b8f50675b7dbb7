#include "include/TracePoint.h"

namespace ZR {

void traceVariable(const TracePoint& at, std::string_view name, std::string_view value) {
    writeLine(at, flowLevel,
              [&] { return TraceText::variable(name, at.source.file, at.line, value); });
}

void traceVariable(const TracePoint& at, std::string_view name, unsigned value) {
    writeLine(at, flowLevel,
              [&] { return TraceText::variable(name, at.source.file, at.line, value); });
}

void traceMethod(const TracePoint& at) {
    writeLine(at, flowLevel,
              [&] { return TraceText::plain(at.source.file, at.function, at.line, method); });
}

void traceMessage(const TracePoint& at, const char* text) {
    writeLine(at, failureLevel,
              [&] { return TraceText::plain(at.source.file, text, at.line, message); });
}

TraceScope::TraceScope(const TracePoint& at) : at_(at) {
    writeLine(at_, flowLevel, [this] {
        return TraceText::plain(at_.source.file, at_.function, at_.line, entering);
    });
}

TraceScope::~TraceScope() {
    if (std::uncaught_exceptions() == exceptions_) {
        writeLine(at_, flowLevel, [this] {
            return TraceText::plain(at_.source.file, at_.function, at_.line, exiting);
        });
    }
}

void ParameterScope::trace(MessageType type) const {
    writeLine(at_, parameterLevel, [&] {
        return TraceText::withParameters(at_.source.file, at_.function, at_.line, parameters_.str(),
                                         type);
    });
}

ParameterScope::~ParameterScope() {
    if (std::uncaught_exceptions() == exceptions_) {
        trace(exiting);
    }
}

}  // namespace ZR
