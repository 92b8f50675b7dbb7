#include "cimxml/XmlText.h"

#include <gtest/gtest.h>

namespace cimom::wbem {

std::string text(std::string_view written) {
    std::string out;
    appendText(out, written);
    return out;
}

std::string attribute(std::string_view written) {
    std::string out;
    appendAttributeText(out, written);
    return out;
}

TEST(XmlText, EscapesMarkup) {
    EXPECT_EQ(text("a & b < c > d \" e '"), "a &amp; b &lt; c &gt; d \" e '");
    EXPECT_EQ(attribute("a & b < c > d \" e '"), "a &amp; b &lt; c &gt; d &quot; e '");
}

TEST(XmlText, KeepsLineEndsAsTheyAre) {
    EXPECT_EQ(text("a\r\n\tb"), "a&#13;\n\tb");
    EXPECT_EQ(attribute("a\r\n\tb"), "a&#13;&#10;&#9;b");
}

TEST(XmlText, ReplacesWhatXmlCannotHold) {
    EXPECT_EQ(text(std::string_view("a\0b\x1F", 4)),
              "a\xEF\xBF\xBD"
              "b\xEF\xBF\xBD");
    EXPECT_EQ(text("\xEF\xBF\xBE"), "\xEF\xBF\xBD");        // U+FFFE
    EXPECT_EQ(text("\xED\xA0\x80"), text("\xFF\xFF\xFF"));  // a surrogate, no UTF-8
    EXPECT_EQ(text("x\xC3"), "x\xEF\xBF\xBD");
}

TEST(XmlText, KeepsCharactersOfAllPlanes) {
    const std::string all = "\x7F\xC2\x80ü€\xF0\x9F\x98\x80\xEF\xBF\xBD";
    EXPECT_EQ(text(all), all);
}

TEST(XmlText, WritesAttributes) {
    std::string out = "<A";
    appendAttribute(out, "NAME", "<\"x\">");
    EXPECT_EQ(out, "<A NAME=\"&lt;&quot;x&quot;&gt;\"");
}

}  // namespace cimom::wbem
