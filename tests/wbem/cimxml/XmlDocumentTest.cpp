#include "cimxml/XmlDocument.h"

#include <gtest/gtest.h>

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

}  // namespace cimom::wbem
