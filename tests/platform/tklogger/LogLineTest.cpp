#include "LogLine.h"

#include <gtest/gtest.h>

#include <chrono>
#include <cstdlib>
#include <ctime>
#include <string>

#include "kit/ChildProcess.h"

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

}  // namespace TKLog
