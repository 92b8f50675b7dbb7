#include <gtest/gtest.h>

#include <chrono>
#include <cstdint>
#include <cstdlib>
#include <ctime>
#include <limits>
#include <sstream>
#include <string>
#include <string_view>

#include "CallCounts.h"
#include "LogLine.h"
#include "kit/ChildProcess.h"
#include "tklogger/TKMessageBuffer.h"

namespace TKLog {

namespace {

using std::chrono::microseconds;
using std::chrono::nanoseconds;
using std::chrono::seconds;
using std::chrono::system_clock;

/// 2026-11-20T08:15:30.123456Z
constexpr system_clock::time_point moment{seconds(1795162530) + microseconds(123456)};

TKLogger::Line line(std::string_view message) {
    return {
        "Lindows/DHCPSettingData", "getInstanceID", 42, "Merrow.DHCPClientProvider", 4000, message};
}

TEST(LogLine, HasItsFieldsInOrderAndSeparatedByBlanks) {
    EXPECT_EQ(formatLine(line("a message"), moment),
              "2026-11-20T08:15:30.123456Z 4000 Merrow.DHCPClientProvider "
              "Lindows/DHCPSettingData:42 getInstanceID a message\n");
}

TEST(LogLine, SyslogGetsTheFieldsBehindTheLevel) {
    EXPECT_EQ(formatSyslog(line("a message")),
              "Merrow.DHCPClientProvider Lindows/DHCPSettingData:42 getInstanceID a message");
}

TEST(LogLine, BlanksOfTheMessageAreKept) {
    EXPECT_EQ(formatSyslog(line("  a  b ")),
              "Merrow.DHCPClientProvider Lindows/DHCPSettingData:42 getInstanceID   a  b ");
}

TEST(LogLine, MessageMayBeEmpty) {
    EXPECT_EQ(formatLine(line(""), moment),
              "2026-11-20T08:15:30.123456Z 4000 Merrow.DHCPClientProvider "
              "Lindows/DHCPSettingData:42 getInstanceID \n");
}

TEST(LogLine, MessageIsOneLineWhateverItHolds) {
    const std::string text = formatSyslog(line(std::string_view("a\nb\r\t\0\x1B\x1F\x7F", 9)));
    EXPECT_EQ(text.substr(text.rfind(' ') + 1), "a\\nb\\x0d\\x09\\x00\\x1b\\x1f\\x7f");
}

TEST(LogLine, EveryControlCharacterIsEscapedAndNothingElse) {
    for (unsigned byte = 0; byte < 256; ++byte) {
        const std::string character(1, static_cast<char>(byte));
        const std::string text = formatSyslog(line("<" + character + ">"));
        const std::string message = text.substr(text.find('<'));
        if (byte == '\n') {
            EXPECT_EQ(message, "<\\n>");
        } else if (byte < 0x20 || byte == 0x7F) {
            EXPECT_EQ(message.size(), 6U) << byte;
            EXPECT_EQ(message.substr(0, 3), "<\\x") << byte;
            EXPECT_EQ(std::stoul(message.substr(3, 2), nullptr, 16), byte);
        } else {
            EXPECT_EQ(message, "<" + character + ">") << byte;
        }
    }
}

TEST(LogLine, BlanksInTheFieldsBeforeTheMessageAreEscaped) {
    EXPECT_EQ(formatSyslog({"my file\n", "operator bool", 7, "a category", 6000, "m"}),
              "a\\x20category my\\x20file\\n:7 operator\\x20bool m");
}

TEST(LogLine, FieldsThatAreMissingAreDashes) {
    EXPECT_EQ(formatLine({nullptr, nullptr, 0, "", 0, "m"}, moment),
              "2026-11-20T08:15:30.123456Z 0 - -:0 - m\n");
    EXPECT_EQ(formatSyslog({"", "", 0, "", 0, "m"}), "- -:0 - m");
}

TEST(LogLine, LevelAndLineArePlainIntegers) {
    EXPECT_EQ(formatLine({"f", "g", 4294967295U, "c", -2147483647 - 1, "m"}, moment),
              "2026-11-20T08:15:30.123456Z -2147483648 c f:4294967295 g m\n");
}

std::string timeOf(system_clock::time_point time) {
    const std::string text = formatLine(line(""), time);
    return text.substr(0, text.find(' '));
}

TEST(LogLine, FractionHasSixDigits) {
    EXPECT_EQ(timeOf(system_clock::time_point(seconds(1795162530))), "2026-11-20T08:15:30.000000Z");
    EXPECT_EQ(timeOf(system_clock::time_point(seconds(1795162530) + microseconds(7))),
              "2026-11-20T08:15:30.000007Z");
}

TEST(LogLine, FractionIsNeverRoundedIntoTheNextSecond) {
    EXPECT_EQ(timeOf(system_clock::time_point(seconds(1795162530) + nanoseconds(999999999))),
              "2026-11-20T08:15:30.999999Z");
}

TEST(LogLine, TimeBeforeTheEpochIsOneToo) {
    EXPECT_EQ(timeOf(system_clock::time_point(-microseconds(1))), "1969-12-31T23:59:59.999999Z");
}

TEST(LogLine, TimeIsUtcInEveryTimeZone) {
    const auto result = ZR::Testing::inChild([] {
        ::setenv("TZ", "XXX-5:30", 1);
        ::tzset();
        return timeOf(moment);
    });
    EXPECT_EQ(result.output, "2026-11-20T08:15:30.123456Z");
}

}  // namespace

namespace {

template <typename... Pieces>
std::string text(const Pieces&... pieces) {
    TKMessageBuffer buffer;
    (buffer << ... << pieces);
    return std::string(buffer.str());
}

TEST(TKMessageBuffer, IsEmptyAtFirst) {
    const TKMessageBuffer buffer;
    EXPECT_EQ(buffer.str(), "");
}

TEST(TKMessageBuffer, JoinsTextsOfEveryKind) {
    EXPECT_EQ(text("a", std::string("b"), std::string_view("c"), ""), "abc");
}

TEST(TKMessageBuffer, NullTextIsWrittenAsNothing) {
    const char* const null = nullptr;
    EXPECT_EQ(text("a", null, "b"), "ab");
    EXPECT_EQ(text(std::string_view()), "");
}

TEST(TKMessageBuffer, ZeroBytesBelongToTheText) {
    EXPECT_EQ(text(std::string_view("a\0b", 3)), std::string("a\0b", 3));
}

TEST(TKMessageBuffer, WritesNumbersOfEveryWidth) {
    EXPECT_EQ(text(0, " ", -1, " ", 4294967295U), "0 -1 4294967295");
    EXPECT_EQ(text(std::numeric_limits<std::int64_t>::min()), "-9223372036854775808");
    EXPECT_EQ(text(std::numeric_limits<std::uint64_t>::max()), "18446744073709551615");
    EXPECT_EQ(text(std::numeric_limits<short>::min()), "-32768");
    EXPECT_EQ(text(static_cast<unsigned short>(65535)), "65535");
}

TEST(TKMessageBuffer, WritesAddressesAsStreamsDo) {
    const int value = 0;
    const auto streamed = [](const void* pointer) {
        std::ostringstream stream;
        stream << pointer;
        return stream.str();
    };
    EXPECT_EQ(text(&value), streamed(&value));
    EXPECT_EQ(text(static_cast<const void*>(&value)), streamed(&value));
    // Of a text, too, when it is a pointer to it that is handed over.
    const std::string name = "eth0";
    EXPECT_EQ(text(" value=", &name), " value=" + streamed(&name));
    const char* list[] = {"Name", nullptr};
    EXPECT_EQ(text(&list[0]), streamed(&list[0]));
    // NOLINTNEXTLINE(performance-no-int-to-ptr): an address with all digits
    EXPECT_EQ(text(reinterpret_cast<int*>(std::numeric_limits<std::uintptr_t>::max())),
              "0xffffffffffffffff");
}

TEST(TKMessageBuffer, NullAddressIsZero) {
    const int* const null = nullptr;
    EXPECT_EQ(text("a=", null), "a=0");
}

TEST(TKMessageBuffer, HoldsAnyLength) {
    for (const std::size_t length : {511U, 512U, 513U, 1024U, 100000U}) {
        const std::string whole(length, 'x');
        EXPECT_EQ(text(whole), whole) << length;
        EXPECT_EQ(text(whole, "y"), whole + "y") << length;
    }
}

TEST(TKMessageBuffer, PiecesGoOnWhereTheInnerBufferEnds) {
    TKMessageBuffer buffer;
    std::string expected;
    for (int i = 0; i < 300; ++i) {
        buffer << "piece " << i << ' ' + std::string(1, 'x');
        expected += "piece " + std::to_string(i) + " x";
        ASSERT_EQ(buffer.str(), expected);
    }
}

TEST(TKMessageBuffer, CanBeWrittenIntoItself) {
    TKMessageBuffer buffer;
    buffer << "ab";
    std::string expected = "ab";
    for (int i = 0; i < 10; ++i) {
        buffer << buffer.str();
        expected += expected;
        ASSERT_EQ(buffer.str(), expected);
    }
}

class TKMessageBufferHeap : public testing::Test {
  protected:
    void SetUp() override {
        if (!Testing::countsAllocations) {
            GTEST_SKIP() << "this build does not count allocations";
        }
    }
};

TEST_F(TKMessageBufferHeap, UsesNoHeapUpTo512Bytes) {
    for (const std::size_t length : {0U, 511U, 512U}) {
        const std::string whole(length, 'x');
        const std::size_t before = Testing::allocationsOfThisThread();
        {
            TKMessageBuffer buffer;
            buffer << std::string_view(whole).substr(0, length / 2)
                   << std::string_view(whole).substr(length / 2) << "";
        }
        EXPECT_EQ(Testing::allocationsOfThisThread() - before, 0U) << length;
    }
}

TEST_F(TKMessageBufferHeap, UsesTheHeapBeyond512Bytes) {
    const std::string whole(513, 'x');
    const std::size_t before = Testing::allocationsOfThisThread();
    {
        TKMessageBuffer buffer;
        buffer << whole;
    }
    EXPECT_GT(Testing::allocationsOfThisThread() - before, 0U);
}

TEST_F(TKMessageBufferHeap, NumbersAndAddressesUseNoHeap) {
    const int value = 0;
    const std::size_t before = Testing::allocationsOfThisThread();
    {
        TKMessageBuffer buffer;
        buffer << " line=" << 17U << " value=" << &value;
    }
    EXPECT_EQ(Testing::allocationsOfThisThread() - before, 0U);
}

}  // namespace

}  // namespace TKLog
