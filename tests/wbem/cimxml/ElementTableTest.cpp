#include "kit/ElementTable.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

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
