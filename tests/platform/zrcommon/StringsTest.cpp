#include <gtest/gtest.h>
#include <sys/utsname.h>
#include <unistd.h>

#include <cerrno>
#include <cstdint>
#include <random>
#include <string>

#include "kit/ChildProcess.h"
#include "kit/HostNameFake.h"
#include "kit/PrivateNamespace.h"
#include "zrcommon/Strings.h"
#include "zrcommon/SystemName.h"

namespace ZR {

namespace {

/// The wide code unit that stands for a byte that is not text.
wchar_t escaped(unsigned byte) {
    return static_cast<wchar_t>(0xDC00U + byte);
}

TEST(Strings, AsciiIsItself) {
    EXPECT_EQ(make_wstring("eth0 %_"), L"eth0 %_");
    EXPECT_EQ(make_string(L"eth0 %_"), "eth0 %_");
    EXPECT_EQ(make_wstring(""), L"");
    EXPECT_EQ(make_string(L""), "");
}

TEST(Strings, CodePointsOfEveryLengthAreConverted) {
    EXPECT_EQ(make_wstring("\xC2\x80\xDF\xBF"), L"\u0080\u07FF");
    EXPECT_EQ(make_wstring("\xE0\xA0\x80\xED\x9F\xBF\xEE\x80\x80\xEF\xBF\xBF"),
              (std::wstring{wchar_t{0x0800}, wchar_t{0xD7FF}, wchar_t{0xE000}, wchar_t{0xFFFF}}));
    EXPECT_EQ(make_wstring("\xF0\x90\x80\x80\xF4\x8F\xBF\xBF"),
              (std::wstring{wchar_t{0x10000}, wchar_t{0x10FFFF}}));
}

TEST(Strings, EveryCodePointComesBack) {
    for (std::uint32_t codePoint = 0; codePoint <= 0x10FFFF; ++codePoint) {
        if (codePoint == 0xD800) {
            codePoint = 0xE000;
        }
        const std::wstring wide(1, static_cast<wchar_t>(codePoint));
        ASSERT_EQ(make_wstring(make_string(wide)), wide) << codePoint;
    }
}

TEST(Strings, EveryByteComesBack) {
    std::string all;
    for (unsigned byte = 0; byte < 256; ++byte) {
        const std::string text(1, static_cast<char>(byte));
        EXPECT_EQ(make_string(make_wstring(text)), text) << byte;
        EXPECT_EQ(make_wstring(text),
                  std::wstring(1, byte < 0x80 ? static_cast<wchar_t>(byte) : escaped(byte)));
        all += text;
    }
    EXPECT_EQ(make_string(make_wstring(all)), all);
}

TEST(Strings, EveryPairOfBytesComesBack) {
    for (unsigned pair = 0; pair < 0x10000; ++pair) {
        const std::string text{static_cast<char>(pair >> 8U), static_cast<char>(pair & 0xFFU)};
        ASSERT_EQ(make_string(make_wstring(text)), text) << pair;
    }
}

TEST(Strings, AnyBytesComeBack) {
    std::mt19937 random(1);  // the same bytes in every run
    // Mostly bytes that begin or continue sequences, so that many are nearly valid.
    constexpr std::string_view bytes =
        "\x80\xBF\xC2\xE0\xED\xA0\x9F\xF0\xF4\x90\x8F\xEF\xFF"
        "a";
    for (int round = 0; round < 20000; ++round) {
        std::string text(1 + random() % 12, '\0');
        for (char& byte : text) {
            byte = bytes[random() % bytes.size()];
        }
        ASSERT_EQ(make_string(make_wstring(text)), text);
    }
}

TEST(Strings, BytesThatAreNoUtf8AreEscapedOneByOne) {
    const auto expectEscaped = [](std::string_view text) {
        std::wstring expected;
        for (const char byte : text) {
            expected.push_back(escaped(static_cast<unsigned char>(byte)));
        }
        EXPECT_EQ(make_wstring(text), expected) << testing::PrintToString(text);
    };
    expectEscaped("\x80");              // a continuation without a beginning
    expectEscaped("\xC3");              // cut off
    expectEscaped("\xE2\x82");          // cut off
    expectEscaped("\xF0\x9F\x98");      // cut off
    expectEscaped("\xC0\x80");          // zero, too long
    expectEscaped("\xC1\xBF");          // too long
    expectEscaped("\xE0\x9F\xBF");      // too long
    expectEscaped("\xF0\x8F\xBF\xBF");  // too long
    expectEscaped("\xED\xA0\x80");      // a surrogate
    expectEscaped("\xED\xB2\x80");      // the very code unit that stands for a byte
    expectEscaped("\xF4\x90\x80\x80");  // above the last code point
    expectEscaped("\xF8\x88\x80\x80\x80");
    expectEscaped("\xFE\xFF");
}

TEST(Strings, TextGoesOnBehindABadByte) {
    EXPECT_EQ(make_wstring("a\xC3"
                           "b\xE2\x82\xAC"),
              (std::wstring{L'a', escaped(0xC3), L'b', L'\u20AC'}));
    EXPECT_EQ(make_wstring("\xE2\xC3\xA4"), (std::wstring{escaped(0xE2), L'\u00E4'}));
}

TEST(Strings, ZeroBytesAreText) {
    EXPECT_EQ(make_wstring(std::string_view("a\0b", 3)), std::wstring(L"a\0b", 3));
    EXPECT_EQ(make_string(std::wstring_view(L"a\0b", 3)), std::string("a\0b", 3));
}

TEST(Strings, WideUnitsThatAreNoTextBecomeTheReplacementCharacter) {
    const std::string replacement = "\xEF\xBF\xBD";
    for (const long unit :
         {0xD800L, 0xDBFFL, 0xDC00L, 0xDC7FL, 0xDD00L, 0xDFFFL, 0x110000L, 0x7FFFFFFFL, -1L}) {
        EXPECT_EQ(make_string(std::wstring(1, static_cast<wchar_t>(unit))), replacement) << unit;
    }
}

TEST(EqualNames, CaseOfAsciiLettersDoesNotMatter) {
    EXPECT_TRUE(equalNames("CIM_IPProtocolEndpoint", "cim_ipPROTOCOLendpoint"));
    EXPECT_TRUE(equalNames("", ""));
    EXPECT_TRUE(equalNames("AZ", "az"));
}

TEST(EqualNames, EverythingElseMatters) {
    EXPECT_FALSE(equalNames("a", ""));
    EXPECT_FALSE(equalNames("", "a"));
    EXPECT_FALSE(equalNames("ab", "a"));
    // The neighbours of the letters, at the distance of the two cases.
    EXPECT_FALSE(equalNames("@", "`"));
    EXPECT_FALSE(equalNames("[", "{"));
    EXPECT_FALSE(equalNames("_", "\x7F"));
    EXPECT_FALSE(equalNames("\xC3\x84", "\xC3\xA4"));
}

TEST(Trim, TakesBlanksTabsAndCarriageReturnsOffBothEnds) {
    EXPECT_EQ(trim(" \t\ra b\t c \r\t "), "a b\t c");
    EXPECT_EQ(trim("a"), "a");
    EXPECT_EQ(trim(" \t\r"), "");
    EXPECT_EQ(trim(""), "");
    EXPECT_EQ(trim("\na\v"), "\na\v");
}

TEST(NextWord, TakesTheFirstWordAndTheBlanksBeforeIt) {
    std::string_view text = " \tone two\nlines \t";
    EXPECT_EQ(nextWord(text), "one");
    EXPECT_EQ(text, " two\nlines \t");
    EXPECT_EQ(nextWord(text), "two\nlines");
    EXPECT_EQ(nextWord(text), "");
    EXPECT_EQ(text, "");
    text = "a\tb c";
    EXPECT_EQ(nextWord(text, " "), "a\tb");
}

}  // namespace

namespace {

TEST(SystemName, IsTheHostName) {
    utsname names{};
    ASSERT_EQ(::uname(&names), 0);
    EXPECT_EQ(getSystemName(), names.nodename);
    EXPECT_EQ(readSystemName(), (SystemName{names.nodename, ""}));
}

TEST(SystemName, FollowsAChangeOfTheHostName) {
    if (!Testing::canEnterNamespaces()) {
        GTEST_SKIP() << "needs a UTS name space of its own";
    }
    const std::string longest(64, 'n');  // Linux allows no longer one
    for (const std::string& name : {std::string("host.example.org"), longest, std::string()}) {
        const auto result = Testing::inChild([&name] {
            Testing::enterNamespaces(CLONE_NEWUTS);
            if (::sethostname(name.data(), name.size()) != 0) {
                return std::string("cannot set it");
            }
            return "<" + getSystemName() + ">";
        });
        EXPECT_EQ(result.output, "<" + name + ">");
    }
}

TEST(SystemName, IsEmptyAndToldWhyWhenTheKernelFails) {
    const Testing::HostNameFails failing;
    EXPECT_EQ(getSystemName(), "");
    EXPECT_EQ(readSystemName(), (SystemName{"", "the system does not tell its name: Bad address"}));
}

TEST(SystemName, AnEmptyNameIsNotTakenForAnEarlierError) {
    if (!Testing::canEnterNamespaces()) {
        GTEST_SKIP() << "needs a UTS name space of its own";
    }
    const auto result = Testing::inChild([] {
        Testing::enterNamespaces(CLONE_NEWUTS);
        if (::sethostname("", 0) != 0) {
            return std::string("cannot set it");
        }
        errno = EPERM;
        const SystemName system = readSystemName();
        return system.name + "|" + system.diagnostic;
    });
    EXPECT_EQ(result.output, "|the system has no name");
}

}  // namespace

}  // namespace ZR
