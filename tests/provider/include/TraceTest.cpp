#include "include/Trace.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <random>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "include/TracePoint.h"
#include "kit/LogCapture.h"

namespace ZR {

namespace {

using Testing::LogCapture;
using Testing::LogRecord;

constexpr MessageType unknownType = static_cast<MessageType>(4);
constexpr const char* nullText = nullptr;

TEST(Trace, TextVariableLine) {
    EXPECT_STREQ(trace("l_cFileName", "Lindows/DHCPSettingData", 7, "/etc/ifcfg-eth0"),
                 "VARIABLE: 'l_cFileName' has Value '/etc/ifcfg-eth0' at line 7 in "
                 "Lindows/DHCPSettingData");
}

TEST(Trace, NumberVariableLine) {
    EXPECT_STREQ(trace("classId", "DHCPClientProvider", 120, 85U),
                 "VARIABLE: 'classId' has Value '85' at line 120 in DHCPClientProvider");
}

TEST(Trace, LinesOfAFunction) {
    EXPECT_STREQ(trace("f", "g", 7, entering), "ENTERING: g() in f [Line: 7]");
    EXPECT_STREQ(trace("f", "g", 7, exiting), "EXITING: g() in f [Line: 7]");
    EXPECT_STREQ(trace("f", "g", 7, method), "METHOD: g() was invoked in f [Line: 7]");
}

TEST(Trace, MessageLineHasTheMessageInThePlaceOfTheFunction) {
    EXPECT_STREQ(trace("f", "text", 7, message), "MESSAGE [File: f, Line: 7]: text");
}

TEST(Trace, LinesWithParameters) {
    EXPECT_STREQ(tracepara("f", "g", 7, " a=1 b=2", entering),
                 "ENTERING: g() in f [Line: 7],Parameters List:  a=1 b=2");
    EXPECT_STREQ(tracepara("f", "g", 7, " a=1", exiting),
                 "EXITING: g() in f [Line: 7],Parameters List:  a=1");
    EXPECT_STREQ(tracepara("f", "g", 7, " a=1", method),
                 "METHOD: g() was invoked in f [Line: 7],Parameters List:  a=1");
    EXPECT_STREQ(tracepara("f", "text", 7, " a=1", message),
                 "MESSAGE [File: f, Line: 7]: text,Parameters List:  a=1");
}

TEST(Trace, AnyOtherTypeYieldsTheEmptyText) {
    trace("f", "g", 7, entering);  // the buffer then holds something
    tracepara("f", "g", 7, " a=1", entering);
    EXPECT_STREQ(trace("f", "g", 7, unknownType), "");
    EXPECT_STREQ(tracepara("f", "g", 7, " a=1", unknownType), "");
    EXPECT_STREQ(trace("f", "g", 7, static_cast<MessageType>(0xFFFFFFFFU)), "");
    EXPECT_STREQ(tracepara("f", "g", 7, " a=1", static_cast<MessageType>(0xFFFFFFFFU)), "");
}

TEST(Trace, NumbersAreSignedDecimalsOf32Bits) {
    EXPECT_STREQ(trace("v", "f", 4294967295U, 2147483648U),
                 "VARIABLE: 'v' has Value '-2147483648' at line -1 in f");
    EXPECT_STREQ(trace("v", "f", 0, 0U), "VARIABLE: 'v' has Value '0' at line 0 in f");
    EXPECT_STREQ(trace("v", "f", 1, 2147483647U),
                 "VARIABLE: 'v' has Value '2147483647' at line 1 in f");
}

TEST(Trace, NullTextsAreNamedAsSuch) {
    EXPECT_STREQ(trace(nullText, nullText, 1, nullText),
                 "VARIABLE: '(null)' has Value '(null)' at line 1 in (null)");
    EXPECT_STREQ(trace(nullText, nullText, 1, 2U),
                 "VARIABLE: '(null)' has Value '2' at line 1 in (null)");
    EXPECT_STREQ(trace(nullText, nullText, 1, entering), "ENTERING: (null)() in (null) [Line: 1]");
    EXPECT_STREQ(tracepara(nullText, nullText, 1, nullText, message),
                 "MESSAGE [File: (null), Line: 1]: (null),Parameters List: (null)");
}

TEST(Trace, PercentSignsInTheTextsAreText) {
    EXPECT_STREQ(trace("%s", "%n", 1, "Computer%eth0 %d"),
                 "VARIABLE: '%s' has Value 'Computer%eth0 %d' at line 1 in %n");
}

TEST(Trace, LongTextsEndAfter511Characters) {
    for (const std::size_t length : {470U, 511U, 512U, 513U, 5000U}) {
        const std::string text(length, 'x');
        EXPECT_EQ(trace("v", "f", 1, text.c_str()),
                  ("VARIABLE: 'v' has Value '" + text + "' at line 1 in f").substr(0, 511));
        EXPECT_EQ(trace(text.c_str(), "f", 1, 2U),
                  ("VARIABLE: '" + text + "' has Value '2' at line 1 in f").substr(0, 511));
        EXPECT_EQ(trace("f", text.c_str(), 1, message),
                  ("MESSAGE [File: f, Line: 1]: " + text).substr(0, 511));
        EXPECT_EQ(tracepara("f", "g", 1, text.c_str(), entering),
                  ("ENTERING: g() in f [Line: 1],Parameters List: " + text).substr(0, 511));
    }
}

TEST(Trace, LineOfExactly511CharactersIsWhole) {
    const std::string frame = "MESSAGE [File: f, Line: 1]: ";
    const std::string text(511 - frame.size(), 'x');
    EXPECT_EQ(trace("f", text.c_str(), 1, message), frame + text);
    EXPECT_EQ(trace("f", (text + "y").c_str(), 1, message), frame + text);
}

/// The whole buffer of a helper.
std::string bufferOf(const char* text) {
    return {text, traceBufferSize};
}

std::string padded(std::string_view text) {
    std::string buffer(text);
    buffer.resize(traceBufferSize);
    return buffer;
}

TEST(Trace, BufferIsZeroBehindTheText) {
    const std::string filler(600, 'x');
    trace("v", "f", 1, filler.c_str());
    EXPECT_EQ(bufferOf(trace("v", "f", 1, "1")),
              padded("VARIABLE: 'v' has Value '1' at line 1 in f"));
    trace(filler.c_str(), "f", 1, 1U);
    EXPECT_EQ(bufferOf(trace("v", "f", 1, 1U)),
              padded("VARIABLE: 'v' has Value '1' at line 1 in f"));
    trace("f", filler.c_str(), 1, message);
    EXPECT_EQ(bufferOf(trace("f", "g", 1, unknownType)), padded(""));
    tracepara("f", "g", 1, filler.c_str(), message);
    EXPECT_EQ(bufferOf(tracepara("f", "g", 1, "", unknownType)), padded(""));
}

/// A whole buffer as the C library fills it.
[[gnu::format(printf, 1, 2)]] std::string printed(const char* format, ...) {
    std::string buffer(traceBufferSize, '\0');
    std::va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(buffer.data(), buffer.size(), format, arguments);
    va_end(arguments);
    return buffer;
}

TEST(Trace, BuffersAreAsTheLibraryPrintsThem) {
    std::mt19937 random(20);
    const auto anyText = [&random] {
        constexpr std::string_view alphabet = "abc %sdn'/\\\"\n\x80\xff";
        // Short ones, ones about the size of a block that is copied, and ones that are cut.
        const std::size_t longest = random() % 8 == 0 ? 700 : 70;
        std::string text(random() % longest, '\0');
        for (char& character : text) {
            character = alphabet[random() % alphabet.size()];
        }
        return text;
    };
    for (int round = 0; round < 5'000; ++round) {
        const std::string one = anyText();
        const std::string other = anyText();
        const std::string third = anyText();
        const char* const a = one.c_str();
        const char* const b = other.c_str();
        const char* const c = third.c_str();
        const auto line = static_cast<unsigned>(random() >> (random() % 32));
        const auto number = static_cast<unsigned>(random() >> (random() % 32));
        const int n = static_cast<int>(line);
        ASSERT_EQ(bufferOf(trace(a, b, line, c)),
                  printed("VARIABLE: '%s' has Value '%s' at line %d in %s", a, c, n, b));
        ASSERT_EQ(bufferOf(trace(a, b, line, number)),
                  printed("VARIABLE: '%s' has Value '%d' at line %d in %s", a,
                          static_cast<int>(number), n, b));
        ASSERT_EQ(bufferOf(trace(a, b, line, entering)),
                  printed("ENTERING: %s() in %s [Line: %d]", b, a, n));
        ASSERT_EQ(bufferOf(trace(a, b, line, exiting)),
                  printed("EXITING: %s() in %s [Line: %d]", b, a, n));
        ASSERT_EQ(bufferOf(trace(a, b, line, method)),
                  printed("METHOD: %s() was invoked in %s [Line: %d]", b, a, n));
        ASSERT_EQ(bufferOf(trace(a, b, line, message)),
                  printed("MESSAGE [File: %s, Line: %d]: %s", a, n, b));
        ASSERT_EQ(bufferOf(tracepara(a, b, line, c, entering)),
                  printed("ENTERING: %s() in %s [Line: %d],Parameters List: %s", b, a, n, c));
        ASSERT_EQ(bufferOf(tracepara(a, b, line, c, exiting)),
                  printed("EXITING: %s() in %s [Line: %d],Parameters List: %s", b, a, n, c));
        ASSERT_EQ(
            bufferOf(tracepara(a, b, line, c, method)),
            printed("METHOD: %s() was invoked in %s [Line: %d],Parameters List: %s", b, a, n, c));
        ASSERT_EQ(bufferOf(tracepara(a, b, line, c, message)),
                  printed("MESSAGE [File: %s, Line: %d]: %s,Parameters List: %s", a, n, b, c));
    }
}

/// A point's line stays in the buffer of the helper that makes such lines.
TEST(Trace, PointsUseTheBuffersOfTheHelpers) {
    const LogCapture capture;
    const std::string category = loggerCategory;
    const TraceSource file{"f", category};
    const char* const plain = trace("f", "a much longer text than what follows", 1, message);
    const char* const withParameters = tracepara("f", "a much longer text too", 1, "", message);
    const char* const text = trace("a much longer name", "f", 1, "a much longer value");
    const char* const number = trace("a much longer name", "f", 1, 1U);
    {
        const TraceScope scope({file, "g", 5});
        EXPECT_EQ(bufferOf(plain), padded("ENTERING: g() in f [Line: 5]"));
    }
    EXPECT_EQ(bufferOf(plain), padded("EXITING: g() in f [Line: 5]"));
    traceMethod({file, "g", 5});
    EXPECT_EQ(bufferOf(plain), padded("METHOD: g() was invoked in f [Line: 5]"));
    traceMessage({file, "g", 5}, "m");
    EXPECT_EQ(bufferOf(plain), padded("MESSAGE [File: f, Line: 5]: m"));
    {
        const ParameterScope scope({file, "g", 5}, " a=", 1U);
        EXPECT_EQ(bufferOf(withParameters),
                  padded("ENTERING: g() in f [Line: 5],Parameters List:  a=1"));
    }
    EXPECT_EQ(bufferOf(withParameters),
              padded("EXITING: g() in f [Line: 5],Parameters List:  a=1"));
    traceVariable({file, "g", 5}, "v", "1");
    EXPECT_EQ(bufferOf(text), padded("VARIABLE: 'v' has Value '1' at line 5 in f"));
    traceVariable({file, "g", 5}, "v", 1U);
    EXPECT_EQ(bufferOf(number), padded("VARIABLE: 'v' has Value '1' at line 5 in f"));
}

TEST(Trace, TextIsValidUntilTheNextCallOfTheSameHelper) {
    const char* const text = trace("v", "f", 1, "first");
    const char* const number = trace("v", "f", 1, 1U);
    const char* const plain = trace("f", "g", 1, entering);
    const char* const withParameters = tracepara("f", "g", 1, "first", entering);
    EXPECT_STREQ(text, "VARIABLE: 'v' has Value 'first' at line 1 in f");
    EXPECT_STREQ(number, "VARIABLE: 'v' has Value '1' at line 1 in f");
    EXPECT_STREQ(plain, "ENTERING: g() in f [Line: 1]");
    EXPECT_STREQ(withParameters, "ENTERING: g() in f [Line: 1],Parameters List: first");

    // The next call uses the same buffer, so a text must not be kept.
    EXPECT_EQ(trace("v", "f", 2, "second"), text);
    EXPECT_EQ(trace("v", "f", 2, 2U), number);
    EXPECT_EQ(trace("f", "g", 2, exiting), plain);
    EXPECT_EQ(tracepara("f", "g", 2, "second", exiting), withParameters);
}

TEST(Trace, OtherThreadsDoNotDisturbATextOfThisOne) {
    const char* const text = trace("v", "f", 1, "mine");
    const char* const number = trace("v", "f", 1, 1U);
    const char* const plain = trace("f", "mine", 1, entering);
    const char* const withParameters = tracepara("f", "g", 1, "mine", entering);
    std::vector<std::thread> threads;
    std::vector<unsigned char> right(4);
    for (std::size_t id = 0; id < right.size(); ++id) {
        threads.emplace_back([id, &right] {
            const std::string own = "thread" + std::to_string(id);
            bool allRight = true;
            for (int i = 0; i < 500; ++i) {
                allRight = allRight &&
                           trace("v", "f", 1, own.c_str()) ==
                               "VARIABLE: 'v' has Value '" + own + "' at line 1 in f" &&
                           trace("f", own.c_str(), 1, method) ==
                               "METHOD: " + own + "() was invoked in f [Line: 1]" &&
                           tracepara("f", "g", 1, own.c_str(), exiting) ==
                               "EXITING: g() in f [Line: 1],Parameters List: " + own;
                trace(own.c_str(), "f", 1, 2U);
            }
            right[id] = allRight ? 1 : 0;
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(right, (std::vector<unsigned char>(4, 1)));
    EXPECT_STREQ(text, "VARIABLE: 'v' has Value 'mine' at line 1 in f");
    EXPECT_STREQ(number, "VARIABLE: 'v' has Value '1' at line 1 in f");
    EXPECT_STREQ(plain, "ENTERING: mine() in f [Line: 1]");
    EXPECT_STREQ(withParameters, "ENTERING: g() in f [Line: 1],Parameters List: mine");
}

TEST(Trace, TextMayBeMadeOfAnEarlierOneOfAnotherHelper) {
    EXPECT_STREQ(trace("f", trace("v", "f", 1, 2U), 3, message),
                 "MESSAGE [File: f, Line: 3]: VARIABLE: 'v' has Value '2' at line 1 in f");
}

const std::string category = "Merrow.Test";
const std::string separator(78, '=');
constexpr unsigned callersLine = 17;

void expectMark(const std::vector<LogRecord>& records, const char* mark, const std::string& first,
                const std::string& second) {
    ASSERT_EQ(records.size(), 2U);
    const std::vector<std::string> messages{first, second};
    for (std::size_t i = 0; i < 2; ++i) {
        // The line is the mark's own, wherever that is.
        EXPECT_EQ(records[i], (LogRecord{records[i].time, 4000, category, "include/Trace",
                                         records[i].line, mark, messages[i]}));
        EXPECT_NE(records[i].line, callersLine);
    }
}

TEST(TraceMarks, EntryIsASeparatorAndTheEnteringLine) {
    const LogCapture capture;
    markProviderEntry(category, "DHCPClientProvider", "DHCPClient_GetInstance", callersLine);
    const std::string line = "ENTERING: DHCPClient_GetInstance() in DHCPClientProvider [Line: 17]";
    expectMark(capture.log(), "markProviderEntry", separator, line);
    expectMark(capture.trace(), "markProviderEntry", separator, line);
}

TEST(TraceMarks, ExitIsTheExitingLineAndASeparator) {
    const LogCapture capture;
    markProviderExit(category, "DHCPClientProvider", "DHCPClient_GetInstance", callersLine);
    const std::string line = "EXITING: DHCPClient_GetInstance() in DHCPClientProvider [Line: 17]";
    expectMark(capture.log(), "markProviderExit", line, separator);
    expectMark(capture.trace(), "markProviderExit", line, separator);
}

TEST(TraceMarks, EachRoadHasItsOwnLevel) {
    const LogCapture capture(4001, 4000);
    markProviderEntry(category, "f", "g", 1);
    EXPECT_EQ(capture.log().size(), 0U);
    EXPECT_EQ(capture.trace().size(), 2U);
}

}  // namespace

}  // namespace ZR
