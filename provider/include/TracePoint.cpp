#include "include/TracePoint.h"

namespace ZR {

void traceVariable(const TracePoint& at, const char* name, const char* value) {
    writeLine(at, flowLevel, [&] { return trace(name, at.source.file, at.line, value); });
}

void traceVariable(const TracePoint& at, const char* name, const std::string& value) {
    traceVariable(at, name, value.c_str());
}

void traceVariable(const TracePoint& at, const char* name, unsigned value) {
    writeLine(at, flowLevel, [&] { return trace(name, at.source.file, at.line, value); });
}

void traceMethod(const TracePoint& at) {
    writeLine(at, flowLevel, [&] { return trace(at.source.file, at.function, at.line, method); });
}

void traceMessage(const TracePoint& at, const char* text) {
    writeLine(at, failureLevel, [&] { return trace(at.source.file, text, at.line, message); });
}

TraceScope::TraceScope(const TracePoint& at) : at_(at) {
    writeLine(at_, flowLevel,
              [this] { return trace(at_.source.file, at_.function, at_.line, entering); });
}

TraceScope::~TraceScope() {
    if (std::uncaught_exceptions() == exceptions_) {
        writeLine(at_, flowLevel,
                  [this] { return ZR::trace(at_.source.file, at_.function, at_.line, exiting); });
    }
}

void ParameterScope::trace(MessageType type) const {
    writeLine(at_, parameterLevel, [&] {
        return tracepara(at_.source.file, at_.function, at_.line, parameters_.str().data(), type);
    });
}

ParameterScope::~ParameterScope() {
    if (std::uncaught_exceptions() == exceptions_) {
        trace(exiting);
    }
}

}  // namespace ZR
