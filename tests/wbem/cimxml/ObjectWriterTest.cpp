#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"
#include "cimxml/ObjectReader.h"
#include "cimxml/ObjectWriter.h"
#include "kit/ElementTable.h"
#include "kit/RandomObjects.h"
#include "kit/Sanitizers.h"

namespace cimom::wbem {

using ::testing::IsEmpty;

void expectValid(const std::string& xml) {
    EXPECT_THAT(test::violations(readXml(xml, 64)), IsEmpty()) << xml;
}

ClassRepository repository() {
    ClassRepository classes;
    classes.loadText(R"(
        Qualifier Key : boolean = false, Scope(property, reference), Flavor(DisableOverride, ToSubclass);
        Qualifier Association : boolean = false, Scope(association), Flavor(DisableOverride, ToSubclass);
        Qualifier Description : string = null, Scope(any), Flavor(EnableOverride, ToSubclass, Translatable);
        Qualifier EmbeddedInstance : string = null, Scope(property), Flavor(EnableOverride, ToSubclass);
        Qualifier ValueMap : string[], Scope(property), Flavor(EnableOverride, ToSubclass);
        [Description("Of <all>")] class A { [Key] string Id; uint16 N[3] = {1, 2}; };
        class B : A { [ValueMap{"1", "2"}] uint8 State = 1; [EmbeddedInstance("A")] string Inner; };
        [Association] class L { [Key] A REF Near; [Key] B REF Far; };)",
                     "test.mof");
    return classes;
}

std::string classXml(const char* name, const ClassForm& form) {
    const ClassRepository classes = repository();
    std::string xml;
    writeClass(xml, *classes.find(name), form);
    expectValid(xml);
    return xml;
}

TEST(ObjectWriter, WritesKeysByTheirKind) {
    ObjectPath path = parseObjectPath("root/x:A.s=\"<1>\",n=-5,b=TRUE");
    path.keys.push_back({"none", Value::null(Type::string, false)});
    std::string xml;
    writeInstanceName(xml, path);
    expectValid(xml);
    EXPECT_EQ(xml,
              "<INSTANCENAME CLASSNAME=\"A\">"
              "<KEYBINDING NAME=\"s\"><KEYVALUE VALUETYPE=\"string\">&lt;1&gt;</KEYVALUE>"
              "</KEYBINDING>"
              "<KEYBINDING NAME=\"n\"><KEYVALUE VALUETYPE=\"numeric\">-5</KEYVALUE></KEYBINDING>"
              "<KEYBINDING NAME=\"b\"><KEYVALUE VALUETYPE=\"boolean\">TRUE</KEYVALUE></KEYBINDING>"
              "</INSTANCENAME>");
}

TEST(ObjectWriter, WritesPathsWithTheServersHost) {
    std::string xml;
    writeInstancePath(xml, parseObjectPath("root/x:A.k=1"), "server");
    expectValid(xml);
    EXPECT_EQ(xml,
              "<INSTANCEPATH><NAMESPACEPATH><HOST>server</HOST><LOCALNAMESPACEPATH>"
              "<NAMESPACE NAME=\"root\"/><NAMESPACE NAME=\"x\"/></LOCALNAMESPACEPATH>"
              "</NAMESPACEPATH><INSTANCENAME CLASSNAME=\"A\"><KEYBINDING NAME=\"k\">"
              "<KEYVALUE VALUETYPE=\"numeric\">1</KEYVALUE></KEYBINDING></INSTANCENAME>"
              "</INSTANCEPATH>");
}

TEST(ObjectWriter, WritesPropertiesOfAllKinds) {
    Instance instance;
    instance.path.className = "A";
    instance.properties = {
        {"s", Value::ofString("x")},
        {"null", Value::null(Type::uint8, false)},
        {"a", {Type::uint16, true, Array{Scalar(std::uint64_t{1}), Scalar()}}},
        {"r",
         {Type::reference, false,
          Scalar(std::make_shared<const ObjectPath>(parseObjectPath("root/x:A.k=1")))}},
        {"nullr", Value::null(Type::reference, false)}};
    std::string xml;
    writeInstance(xml, instance, nullptr);
    expectValid(xml);
    EXPECT_EQ(xml,
              "<INSTANCE CLASSNAME=\"A\">"
              "<PROPERTY NAME=\"s\" TYPE=\"string\"><VALUE>x</VALUE></PROPERTY>"
              "<PROPERTY NAME=\"null\" TYPE=\"uint8\"></PROPERTY>"
              "<PROPERTY.ARRAY NAME=\"a\" TYPE=\"uint16\"><VALUE.ARRAY><VALUE>1</VALUE>"
              "<VALUE.NULL/></VALUE.ARRAY></PROPERTY.ARRAY>"
              "<PROPERTY.REFERENCE NAME=\"r\" REFERENCECLASS=\"A\"><VALUE.REFERENCE>"
              "<LOCALINSTANCEPATH><LOCALNAMESPACEPATH><NAMESPACE NAME=\"root\"/>"
              "<NAMESPACE NAME=\"x\"/></LOCALNAMESPACEPATH><INSTANCENAME CLASSNAME=\"A\">"
              "<KEYBINDING NAME=\"k\"><KEYVALUE VALUETYPE=\"numeric\">1</KEYVALUE></KEYBINDING>"
              "</INSTANCENAME></LOCALINSTANCEPATH></VALUE.REFERENCE></PROPERTY.REFERENCE>"
              "<PROPERTY.REFERENCE NAME=\"nullr\"></PROPERTY.REFERENCE></INSTANCE>");
}

TEST(ObjectWriter, WritesWhatTheElementsHaveNoPlaceForAsText) {
    Instance instance;
    instance.path.className = "A";
    const auto path = std::make_shared<const ObjectPath>(parseObjectPath("root/x:A.k=\"v\""));
    instance.properties = {
        {"refs", {Type::reference, true, Array{Scalar(path)}}},
        {"embeddedInText", {Type::string, false, Scalar(std::make_shared<const Instance>())}}};
    std::string xml;
    writeInstance(xml, instance, nullptr);
    expectValid(xml);
    EXPECT_EQ(xml,
              "<INSTANCE CLASSNAME=\"A\"><PROPERTY.ARRAY NAME=\"refs\" TYPE=\"string\">"
              "<VALUE.ARRAY><VALUE>root/x:A.k=\"v\"</VALUE></VALUE.ARRAY></PROPERTY.ARRAY>"
              "<PROPERTY NAME=\"embeddedInText\" TYPE=\"string\" EmbeddedObject=\"instance\">"
              "<VALUE>&lt;INSTANCE CLASSNAME=\"\"&gt;&lt;/INSTANCE&gt;</VALUE></PROPERTY>"
              "</INSTANCE>");
}

TEST(ObjectWriter, TellsClassOriginsOfKnownProperties) {
    const ClassRepository classes = repository();
    Instance instance;
    instance.path.className = "B";
    instance.properties = {{"id", Value::ofString("x")}, {"Other", Value::ofString("y")}};
    std::string xml;
    writeInstance(xml, instance, classes.find("B"));
    expectValid(xml);
    EXPECT_EQ(xml,
              "<INSTANCE CLASSNAME=\"B\"><PROPERTY NAME=\"id\" TYPE=\"string\" CLASSORIGIN=\"A\">"
              "<VALUE>x</VALUE></PROPERTY><PROPERTY NAME=\"Other\" TYPE=\"string\"><VALUE>y"
              "</VALUE></PROPERTY></INSTANCE>");
}

TEST(ObjectWriter, WritesClassesWhole) {
    EXPECT_EQ(classXml("B", {false, true, true, std::nullopt}),
              "<CLASS NAME=\"B\" SUPERCLASS=\"A\">"
              "<QUALIFIER NAME=\"Description\" TYPE=\"string\" TRANSLATABLE=\"true\"><VALUE>Of "
              "&lt;all&gt;</VALUE></QUALIFIER>"
              "<PROPERTY NAME=\"Id\" TYPE=\"string\" CLASSORIGIN=\"A\" PROPAGATED=\"true\">"
              "<QUALIFIER NAME=\"Key\" TYPE=\"boolean\" OVERRIDABLE=\"false\"><VALUE>TRUE</VALUE>"
              "</QUALIFIER></PROPERTY>"
              "<PROPERTY.ARRAY NAME=\"N\" TYPE=\"uint16\" ARRAYSIZE=\"3\" CLASSORIGIN=\"A\" "
              "PROPAGATED=\"true\"><VALUE.ARRAY><VALUE>1</VALUE><VALUE>2</VALUE></VALUE.ARRAY>"
              "</PROPERTY.ARRAY>"
              "<PROPERTY NAME=\"State\" TYPE=\"uint8\" CLASSORIGIN=\"B\" PROPAGATED=\"false\">"
              "<QUALIFIER NAME=\"ValueMap\" TYPE=\"string\"><VALUE.ARRAY><VALUE>1</VALUE>"
              "<VALUE>2</VALUE></VALUE.ARRAY></QUALIFIER><VALUE>1</VALUE></PROPERTY>"
              "<PROPERTY NAME=\"Inner\" TYPE=\"string\" CLASSORIGIN=\"B\" PROPAGATED=\"false\" "
              "EmbeddedObject=\"instance\"><QUALIFIER NAME=\"EmbeddedInstance\" TYPE=\"string\">"
              "<VALUE>A</VALUE></QUALIFIER></PROPERTY></CLASS>");
}

TEST(ObjectWriter, WritesOfAClassWhatIsAskedFor) {
    EXPECT_EQ(classXml("B", {true, false, false, std::nullopt}),
              "<CLASS NAME=\"B\" SUPERCLASS=\"A\"><PROPERTY NAME=\"State\" TYPE=\"uint8\" "
              "PROPAGATED=\"false\"><VALUE>1</VALUE></PROPERTY><PROPERTY NAME=\"Inner\" "
              "TYPE=\"string\" PROPAGATED=\"false\" EmbeddedObject=\"instance\"></PROPERTY>"
              "</CLASS>");
    EXPECT_EQ(classXml("B", {false, false, false, std::vector<std::string>{"ID", "nope"}}),
              "<CLASS NAME=\"B\" SUPERCLASS=\"A\"><PROPERTY NAME=\"Id\" TYPE=\"string\" "
              "PROPAGATED=\"true\"></PROPERTY></CLASS>");
    EXPECT_EQ(classXml("L", {false, false, false, std::nullopt}),
              "<CLASS NAME=\"L\"><PROPERTY.REFERENCE NAME=\"Near\" REFERENCECLASS=\"A\" "
              "PROPAGATED=\"false\"></PROPERTY.REFERENCE><PROPERTY.REFERENCE NAME=\"Far\" "
              "REFERENCECLASS=\"B\" PROPAGATED=\"false\"></PROPERTY.REFERENCE></CLASS>");
}

}  // namespace cimom::wbem

namespace cimom::test {

using ::testing::IsEmpty;

// What the writer writes, the reader reads as the same.

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
