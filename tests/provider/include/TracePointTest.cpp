#include "include/TracePoint.h"

#include <gtest/gtest.h>

#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "kit/LogCapture.h"

namespace ZR {

namespace {

using Testing::LogCapture;
using Testing::LogRecord;
using Messages = std::vector<std::string>;

const std::string logger = loggerCategory;
const TraceSource source{"Some/File", logger};

std::string addressOf(const void* pointer) {
    std::ostringstream stream;
    stream << pointer;
    return stream.str();
}

/// "in Some/File [Line: N]" with the line of a record.
std::string place(const LogRecord& record) {
    return " in Some/File [Line: " + std::to_string(record.line) + "]";
}

/// Both channels got the same; returns what.
std::vector<LogRecord> sameOnBothRoads(const LogCapture& capture) {
    std::vector<LogRecord> logged = capture.log();
    std::vector<LogRecord> traced = capture.trace();
    for (std::vector<LogRecord>* records : {&logged, &traced}) {
        for (LogRecord& record : *records) {
            record.time.clear();
        }
    }
    EXPECT_EQ(logged, traced);
    return logged;
}

TEST(TracePoint, CategoryIsTheProviders) {
    EXPECT_STREQ(loggerCategory, "Merrow.DHCPClientProvider");
}

void atOnePoint() {
    traceMethod(ZR_HERE);
}

TEST(TracePoint, LineCarriesThePlaceOfItsPoint) {
    const LogCapture capture;
    atOnePoint();
    const auto records = sameOnBothRoads(capture);
    ASSERT_EQ(records.size(), 1U);
    EXPECT_EQ(records[0],
              (LogRecord{"", 4000, "Merrow.DHCPClientProvider", "Some/File", records[0].line,
                         "atOnePoint", "METHOD: atOnePoint() was invoked" + place(records[0])}));
}

TEST(TracePoint, VariablesOfEveryKind) {
    const LogCapture capture;
    const TracePoint at{source, "g", 5};
    traceVariable(at, "a", "text");
    traceVariable(at, "b", std::string("string"));
    traceVariable(at, "c", 85U);
    traceVariable(at, "d", static_cast<const char*>(nullptr));
    const auto records = sameOnBothRoads(capture);
    ASSERT_EQ(records.size(), 4U);
    for (const LogRecord& record : records) {
        EXPECT_EQ(record.level, 4000);
        EXPECT_EQ(record.function, "g");
        EXPECT_EQ(record.line, 5U);
    }
    EXPECT_EQ(capture.logMessages(),
              (Messages{"VARIABLE: 'a' has Value 'text' at line 5 in Some/File",
                        "VARIABLE: 'b' has Value 'string' at line 5 in Some/File",
                        "VARIABLE: 'c' has Value '85' at line 5 in Some/File",
                        "VARIABLE: 'd' has Value '(null)' at line 5 in Some/File"}));
}

TEST(TracePoint, MessageIsAFailure) {
    const LogCapture capture;
    traceMessage({source, "g", 5}, "gethostname Failed");
    EXPECT_EQ(sameOnBothRoads(capture),
              (std::vector<LogRecord>{{"", 6000, "Merrow.DHCPClientProvider", "Some/File", 5, "g",
                                       "MESSAGE [File: Some/File, Line: 5]: gethostname Failed"}}));
}

TEST(TracePoint, LineThatNoRoadKeepsIsNotWritten) {
    const LogCapture capture(6000, 6000);
    traceMethod({source, "g", 5});
    { const TraceScope scope({source, "g", 5}); }
    EXPECT_EQ(capture.logMessages(), Messages{});
    EXPECT_EQ(capture.traceMessages(), Messages{});
}

TEST(TracePoint, LevelsOfTheKinds) {
    EXPECT_EQ(parameterLevel, 3000);
    EXPECT_EQ(flowLevel, 4000);
    EXPECT_EQ(failureLevel, 6000);
}

void withScope() {
    const TraceScope scope(ZR_HERE);
    traceVariable(ZR_HERE, "inside", 1U);
}

TEST(TraceScope, FramesWhatHappensInside) {
    const LogCapture capture;
    withScope();
    const auto records = sameOnBothRoads(capture);
    ASSERT_EQ(records.size(), 3U);
    EXPECT_EQ(records[0], (LogRecord{"", 4000, logger, "Some/File", records[0].line, "withScope",
                                     "ENTERING: withScope()" + place(records[0])}));
    EXPECT_EQ(records[1].line, records[0].line + 1);
    EXPECT_EQ(records[2], (LogRecord{"", 4000, logger, "Some/File", records[0].line, "withScope",
                                     "EXITING: withScope()" + place(records[0])}));
}

void leftByAnException() {
    const TraceScope scope(ZR_HERE);
    throw std::runtime_error("out");
}

TEST(TraceScope, WritesNoExitWhenAnExceptionLeaves) {
    const LogCapture capture;
    EXPECT_THROW(leftByAnException(), std::runtime_error);
    const auto records = sameOnBothRoads(capture);
    ASSERT_EQ(records.size(), 1U);
    EXPECT_EQ(records[0].message, "ENTERING: leftByAnException()" + place(records[0]));
}

void catchesItsException() {
    const TraceScope scope(ZR_HERE);
    try {
        leftByAnException();
    } catch (const std::exception&) {
        traceVariable(ZR_HERE, "caught", 1U);
    }
}

TEST(TraceScope, WritesItsExitWhenTheExceptionWasCaughtInside) {
    const LogCapture capture;
    catchesItsException();
    const auto messages = capture.logMessages();
    ASSERT_EQ(messages.size(), 4U);
    EXPECT_EQ(messages[3].substr(0, 31), "EXITING: catchesItsException() ");
}

/// Has a scope of its own in its destructor.
struct Cleaner {
    Cleaner() = default;
    Cleaner(const Cleaner&) = delete;
    Cleaner& operator=(const Cleaner&) = delete;
    ~Cleaner() { const TraceScope scope(ZR_HERE); }
};

void cleansUp() {
    const Cleaner cleaner;
    throw std::runtime_error("out");
}

TEST(TraceScope, DestructorThatRunsBecauseOfAnExceptionHasItsExit) {
    const LogCapture capture;
    EXPECT_THROW(cleansUp(), std::runtime_error);
    const auto records = sameOnBothRoads(capture);
    ASSERT_EQ(records.size(), 2U);
    EXPECT_EQ(records[0].message, "ENTERING: ~Cleaner()" + place(records[0]));
    EXPECT_EQ(records[1].message, "EXITING: ~Cleaner()" + place(records[1]));
    EXPECT_EQ(records[1].function, "~Cleaner");
}

struct Operators {
    Operators() { traceMethod(ZR_HERE); }
    explicit operator bool() const {
        traceMethod(ZR_HERE);
        return true;
    }
    void operator++() { traceMethod(ZR_HERE); }
};

TEST(TracePoint, NamesOfFunctionsThatHaveNone) {
    const LogCapture capture;
    Operators operators;
    static_cast<void>(static_cast<bool>(operators));
    ++operators;
    const auto records = sameOnBothRoads(capture);
    ASSERT_EQ(records.size(), 3U);
    EXPECT_EQ(records[0].function, "Operators");
    EXPECT_EQ(records[1].function, "operator\\x20bool");
    EXPECT_EQ(records[1].message, "METHOD: operator bool() was invoked" + place(records[1]));
    EXPECT_EQ(records[2].function, "operator++");
}

enum Kind : unsigned int { someKind = 1 };

void withParameters(Kind kind, const std::string& reference, const std::string* output) {
    const ParameterScope scope(ZR_HERE, " kind=", &kind, " reference=", reference,
                               " output=", output, " number=", 7U);
    traceVariable(ZR_HERE, "address", addressOf(&kind));
}

TEST(ParameterScope, WritesValuesAndThePointersAddresses) {
    const LogCapture capture;
    const std::string output = "its text is not written";
    withParameters(someKind, "eth0", &output);
    const auto records = sameOnBothRoads(capture);
    ASSERT_EQ(records.size(), 3U);
    const std::string variable = records[1].message;
    const std::size_t begin = variable.find("0x");
    const std::string address = variable.substr(begin, variable.find('\'', begin) - begin);
    const std::string list = ",Parameters List:  kind=" + address +
                             " reference=eth0 output=" + addressOf(&output) + " number=7";
    EXPECT_EQ(records[0],
              (LogRecord{"", 3000, logger, "Some/File", records[0].line, "withParameters",
                         "ENTERING: withParameters()" + place(records[0]) + list}));
    EXPECT_EQ(records[2],
              (LogRecord{"", 3000, logger, "Some/File", records[0].line, "withParameters",
                         "EXITING: withParameters()" + place(records[0]) + list}));
}

TEST(ParameterScope, NullPointersAreZero) {
    const LogCapture capture;
    withParameters(someKind, "", nullptr);
    const auto messages = capture.logMessages();
    ASSERT_EQ(messages.size(), 3U);
    EXPECT_NE(messages[0].find(" reference= output=0 number=7"), std::string::npos) << messages[0];
}

void leftWithParameters() {
    const ParameterScope scope(ZR_HERE, " a=", 1U);
    throw std::runtime_error("out");
}

TEST(ParameterScope, WritesNoExitWhenAnExceptionLeaves) {
    const LogCapture capture;
    EXPECT_THROW(leftWithParameters(), std::runtime_error);
    const auto records = sameOnBothRoads(capture);
    ASSERT_EQ(records.size(), 1U);
    EXPECT_EQ(records[0].message,
              "ENTERING: leftWithParameters()" + place(records[0]) + ",Parameters List:  a=1");
}

TEST(ParameterScope, LongParametersAreCutWithTheLine) {
    const LogCapture capture;
    { const ParameterScope scope({source, "g", 5}, " a=", std::string(2000, 'x')); }
    const std::string begin = "G: g() in Some/File [Line: 5],Parameters List:  a=";
    const auto messages = capture.logMessages();
    ASSERT_EQ(messages.size(), 2U);
    EXPECT_EQ(messages[0],
              ("ENTERIN" + begin + std::string(2000, 'x')).substr(0, traceBufferSize - 1));
    EXPECT_EQ(messages[1],
              ("EXITIN" + begin + std::string(2000, 'x')).substr(0, traceBufferSize - 1));
}

TEST(ParameterScope, IsDetailAndNotFlow) {
    const LogCapture capture(4000, 3000);
    { const ParameterScope scope({source, "g", 5}, " a=", 1U); }
    EXPECT_EQ(capture.logMessages(), Messages{});
    EXPECT_EQ(capture.traceMessages().size(), 2U);
}

}  // namespace

}  // namespace ZR
