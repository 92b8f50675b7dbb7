// What the writer writes, the reader reads as the same.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimom/ObjectPathText.h"
#include "cimxml/ObjectReader.h"
#include "cimxml/ObjectWriter.h"
#include "kit/ElementTable.h"
#include "kit/RandomObjects.h"
#include "kit/Sanitizers.h"

namespace cimom::test {

using ::testing::IsEmpty;

/// Half of a run's objects; sanitizers make each some ten times as dear.
constexpr int rounds = ZR::Testing::sanitized ? 5000 : 50'000;

wbem::XmlElement parsed(const std::string& xml) {
    const wbem::XmlElement element = wbem::readXml(xml, 64);
    EXPECT_THAT(violations(element), IsEmpty()) << xml;
    return element;
}

TEST(RoundTrip, InstancesOfAnyContentSurvive) {
    RandomObjects random(randomSeed());
    for (int round = 0; round < rounds; ++round) {
        const Instance made = random.instance();
        std::string xml;
        wbem::writeInstance(xml, made, nullptr);
        ASSERT_EQ(wbem::readInstance(parsed(xml)), made) << xml;
    }
}

TEST(RoundTrip, PathsOfAnyContentSurvive) {
    RandomObjects random(randomSeed());
    for (int round = 0; round < rounds; ++round) {
        const ObjectPath made = random.path();
        std::string xml;
        wbem::writeReference(xml, made);
        const ObjectPath back = wbem::readPath(parsed(xml).children.at(0));
        ASSERT_EQ(back, made) << xml;
        ASSERT_EQ(back.host, made.host) << xml;
        ASSERT_EQ(toText(back), toText(made)) << xml;
    }
}

TEST(RoundTrip, InstancesSurviveAnotherLayout) {
    // White space between elements and another quotation mark mean nothing.
    const wbem::XmlElement element = wbem::readXml(
        "<?xml version='1.0'?>\n<!-- a comment --><INSTANCE CLASSNAME='A'>\n  <PROPERTY NAME='s' "
        "TYPE='string'>\n <VALUE><![CDATA[a <b> ]]>&#x26;</VALUE>\n</PROPERTY>\n</INSTANCE>\n",
        64);
    const Instance instance = wbem::readInstance(element);
    ASSERT_EQ(instance.properties.size(), 1U);
    EXPECT_EQ(instance.properties[0].value, Value::ofString("a <b> &"));
}

}  // namespace cimom::test
