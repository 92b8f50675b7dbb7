#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimxml/XmlDocument.h"
#include "cimxml/XmlText.h"
#include "kit/ElementTable.h"

namespace cimom::wbem {

std::string nested(std::size_t depth) {
    std::string text;
    for (std::size_t level = 0; level < depth; ++level) {
        text += "<a>";
    }
    for (std::size_t level = 0; level < depth; ++level) {
        text += "</a>";
    }
    return text;
}

std::string reasonOf(const std::string& text) {
    try {
        static_cast<void>(readXml(text, 8));
    } catch (const XmlError& error) {
        return error.what();
    }
    return "none";
}

TEST(XmlDocument, ReadsElementsAttributesAndText) {
    const XmlElement expected{
        "a", {{"x", "1 < 2"}, {"y", ""}}, {{"b", {}, {}, "in"}, {"c", {}, {}, ""}}, "one two"};
    EXPECT_EQ(readXml("\xEF\xBB\xBF<?xml version='1.0' encoding='utf-8'?><!--c--><a x='1 &lt; 2' "
                      "y=''>one <b>in</b>t<?p i?>wo<c/></a>",
                      8),
              expected);
}

TEST(XmlDocument, KeepsManySiblingsApart) {
    std::string text = "<a>";
    for (int count = 0; count < 1000; ++count) {
        text += "<b><c>" + std::to_string(count) + "</c></b>";
    }
    const XmlElement element = readXml(text + "</a>", 3);
    ASSERT_EQ(element.children.size(), 1000U);
    EXPECT_EQ(element.children[999].children.at(0).text, "999");
}

TEST(XmlDocument, RefusesElementsThatAreTooManyForItsLength) {
    constexpr std::size_t length = 1U << 20U;
    const auto reason = [](const std::string& element) {
        std::string text = "<a>";
        while (text.size() + element.size() + 4 <= length) {
            text += element;
        }
        text += "</a>";
        try {
            return std::to_string(readXml(text, 8, usualMemory(text.size())).children.size());
        } catch (const XmlError& error) {
            return std::string(error.what());
        }
    };
    EXPECT_EQ(reason("<A/>"), "line 1: the elements are too many for their length");
    EXPECT_EQ(reason("<A b='' c=''/>"), "line 1: the elements are too many for their length");
    EXPECT_EQ(reason("<A><B><C>x</C></B></A>"),
              "line 1: the elements are too many for their length");
    // The shortest that CIM-XML has in numbers.
    EXPECT_EQ(reason("<VALUE>1</VALUE>"), "65535");
    EXPECT_EQ(reason("<V>" + std::string(100'000, 'x') + "</V>"), "10");
    // Without a bound, they are read.
    EXPECT_EQ(readXml("<a><b/><b/></a>", 8).children.size(), 2U);
}

TEST(XmlDocument, RefusesWhatIsNotWellFormed) {
    EXPECT_EQ(reasonOf(""), "line 1: no element found");
    EXPECT_EQ(reasonOf("<a>\n</b>"), "line 2: mismatched tag");
    EXPECT_EQ(reasonOf("<a/><b/>"), "line 1: junk after document element");
    EXPECT_EQ(reasonOf("<a>&nbsp;</a>"), "line 1: undefined entity");
    EXPECT_EQ(reasonOf("<a x='1' x='2'/>"), "line 1: duplicate attribute");
    EXPECT_EQ(reasonOf("<a>\xC3</a>"), "line 1: not well-formed (invalid token)");
    EXPECT_EQ(reasonOf(std::string("<a>\0</a>", 8)), "line 1: not well-formed (invalid token)");
}

TEST(XmlDocument, RefusesDocumentTypesAndSoEntities) {
    EXPECT_EQ(reasonOf("<!DOCTYPE a [<!ENTITY b 'bb'>]><a>&b;</a>"),
              "line 1: a document type declaration is not accepted");
    EXPECT_EQ(reasonOf("<!DOCTYPE a SYSTEM 'file:///etc/passwd'><a/>"),
              "line 1: a document type declaration is not accepted");
}

TEST(XmlDocument, NestsAsDeepAsAllowedAndNoDeeper) {
    EXPECT_EQ(reasonOf(nested(8)), "none");
    EXPECT_EQ(reasonOf(nested(9)), "line 1: elements are nested too deep");
    EXPECT_EQ(reasonOf(nested(100000)), "line 1: elements are nested too deep");
}

TEST(XmlDocument, IsUtf8WhateverItSays) {
    EXPECT_EQ(readXml("<?xml version='1.0' encoding='ISO-8859-1'?><a>\xC3\xBC</a>", 1).text,
              "\xC3\xBC");
}

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

namespace cimom::test {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

// The table judges every response in the other tests: it must be able to refuse.

std::vector<std::string> judge(const std::string& xml) {
    return violations(wbem::readXml(xml, 64));
}

TEST(ElementTable, AcceptsWhatItShould) {
    EXPECT_THAT(judge("<INSTANCE CLASSNAME='A'><PROPERTY NAME='n' TYPE='string'><VALUE>x</VALUE>"
                      "</PROPERTY><PROPERTY.REFERENCE NAME='r'/></INSTANCE>"),
                IsEmpty());
    EXPECT_THAT(judge("<INSTANCENAME CLASSNAME='A'><KEYVALUE>1</KEYVALUE></INSTANCENAME>"),
                IsEmpty());
}

TEST(ElementTable, RefusesUnknownElements) {
    EXPECT_THAT(judge("<PROPERTY.OBJECT/>"), ElementsAre("element PROPERTY.OBJECT is unknown"));
}

TEST(ElementTable, RefusesMissingUnknownAndWrongAttributes) {
    EXPECT_THAT(judge("<CLASSNAME/>"), ElementsAre("CLASSNAME has no NAME"));
    EXPECT_THAT(judge("<CLASSNAME NAME='a' TYPE='b'/>"),
                ElementsAre("CLASSNAME has an attribute TYPE"));
    EXPECT_THAT(judge("<PROPERTY NAME='a' TYPE='reference'/>"),
                ElementsAre("PROPERTY has TYPE=\"reference\""));
}

TEST(ElementTable, RefusesChildrenInAnotherOrderOrNumber) {
    EXPECT_THAT(judge("<NAMESPACEPATH><LOCALNAMESPACEPATH><NAMESPACE NAME='a'/>"
                      "</LOCALNAMESPACEPATH><HOST>h</HOST></NAMESPACEPATH>"),
                ElementsAre("NAMESPACEPATH does not hold HOST LOCALNAMESPACEPATH"));
    EXPECT_THAT(judge("<LOCALNAMESPACEPATH/>"),
                ElementsAre("LOCALNAMESPACEPATH does not hold NAMESPACE+"));
    EXPECT_THAT(judge("<PROPERTY NAME='a' TYPE='string'><VALUE/><VALUE/></PROPERTY>"),
                ElementsAre("PROPERTY does not hold QUALIFIER* VALUE?"));
}

TEST(ElementTable, RefusesTextBetweenElements) {
    EXPECT_THAT(judge("<VALUE.ARRAY>x</VALUE.ARRAY>"), ElementsAre("VALUE.ARRAY holds text"));
}

}  // namespace cimom::test
