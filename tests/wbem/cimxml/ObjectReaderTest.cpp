#include <gtest/gtest.h>

#include <memory>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/ObjectPathText.h"
#include "cimxml/Errors.h"
#include "cimxml/ObjectReader.h"
#include "cimxml/ObjectWriter.h"

namespace cimom::wbem {

XmlElement xml(const std::string& text) {
    return readXml(text, 64);
}

/// "CODE: DESCRIPTION" of a CIM error, "not valid: REASON", or "none".
template <typename Read>
std::string failureOf(Read&& read) {
    try {
        static_cast<void>(read());
    } catch (const CimError& error) {
        return std::to_string(error.code) + ": " + error.what();
    } catch (const NotValid& error) {
        return std::string("not valid: ") + error.what();
    }
    return "none";
}

std::string pathFailure(const std::string& text) {
    return failureOf([&] { return readPath(xml(text)); });
}

std::string instanceFailure(const std::string& properties) {
    return failureOf(
        [&] { return readInstance(xml("<INSTANCE CLASSNAME='A'>" + properties + "</INSTANCE>")); });
}

TEST(ObjectReader, ReadsKeysWithAndWithoutTypes) {
    const ObjectPath path = readPath(
        xml("<INSTANCENAME CLASSNAME='A'>"
            "<KEYBINDING NAME='s'><KEYVALUE>5</KEYVALUE></KEYBINDING>"
            "<KEYBINDING NAME='n'><KEYVALUE VALUETYPE='numeric'>5</KEYVALUE></KEYBINDING>"
            "<KEYBINDING NAME='t'><KEYVALUE VALUETYPE='numeric' TYPE='sint8'>5</KEYVALUE>"
            "</KEYBINDING>"
            "<KEYBINDING NAME='b'><KEYVALUE VALUETYPE='boolean'>true</KEYVALUE></KEYBINDING>"
            "</INSTANCENAME>"));
    EXPECT_EQ(*path.key("s"), Value::ofString("5"));
    EXPECT_EQ(*path.key("n"), (Value{Type::uint64, false, Scalar(std::uint64_t{5})}));
    EXPECT_EQ(*path.key("t"), (Value{Type::sint8, false, Scalar(std::int64_t{5})}));
    EXPECT_EQ(*path.key("b"), (Value{Type::boolean, false, Scalar(true)}));
}

TEST(ObjectReader, ReadsABareKeyWithoutName) {
    const ObjectPath path =
        readPath(xml("<INSTANCENAME CLASSNAME='A'><KEYVALUE>5</KEYVALUE></INSTANCENAME>"));
    ASSERT_EQ(path.keys.size(), 1U);
    EXPECT_EQ(path.keys[0].name, "");
}

TEST(ObjectReader, ReadsAllFormsOfPaths) {
    const std::string local =
        "<LOCALNAMESPACEPATH><NAMESPACE NAME='root'/><NAMESPACE NAME='x'/></LOCALNAMESPACEPATH>";
    const std::string full = "<NAMESPACEPATH><HOST>h</HOST>" + local + "</NAMESPACEPATH>";
    const std::string name =
        "<INSTANCENAME CLASSNAME='A'><KEYBINDING NAME='k'><KEYVALUE>v</KEYVALUE></KEYBINDING>"
        "</INSTANCENAME>";
    EXPECT_EQ(toText(readPath(xml(name))), "A.k=\"v\"");
    EXPECT_EQ(toText(readPath(xml("<LOCALINSTANCEPATH>" + local + name + "</LOCALINSTANCEPATH>"))),
              "root/x:A.k=\"v\"");
    const ObjectPath whole = readPath(xml("<INSTANCEPATH>" + full + name + "</INSTANCEPATH>"));
    EXPECT_EQ(whole.host, "h");
    EXPECT_EQ(toText(whole), "root/x:A.k=\"v\"");
    const ObjectPath aClass =
        readPath(xml("<CLASSPATH>" + full + "<CLASSNAME NAME='A'/></CLASSPATH>"));
    EXPECT_EQ(toText(aClass), "root/x:A");
}

TEST(ObjectReader, RefusesWrongStructures) {
    EXPECT_EQ(pathFailure("<INSTANCE CLASSNAME='A'/>"),
              "not valid: element INSTANCE where a path belongs");
    EXPECT_EQ(pathFailure("<INSTANCENAME/>"), "not valid: INSTANCENAME without CLASSNAME");
    EXPECT_EQ(pathFailure("<CLASSNAME NAME=''/>"), "not valid: CLASSNAME without NAME");
    EXPECT_EQ(pathFailure("<INSTANCENAME CLASSNAME='A'>x</INSTANCENAME>"),
              "not valid: text in INSTANCENAME");
    EXPECT_EQ(pathFailure("<INSTANCENAME CLASSNAME='A'><KEYBINDING NAME='k'/></INSTANCENAME>"),
              "not valid: the content of KEYBINDING");
    EXPECT_EQ(pathFailure("<LOCALINSTANCEPATH><LOCALNAMESPACEPATH/><INSTANCENAME CLASSNAME='A'/>"
                          "</LOCALINSTANCEPATH>"),
              "not valid: LOCALNAMESPACEPATH without NAMESPACE");
    EXPECT_EQ(instanceFailure("<METHOD NAME='m'/>"), "not valid: element METHOD in INSTANCE");
    EXPECT_EQ(instanceFailure("<PROPERTY NAME='p'/>"), "not valid: PROPERTY without TYPE");
    EXPECT_EQ(instanceFailure("<PROPERTY NAME='p' TYPE='int'/>"),
              "not valid: TYPE \"int\" of PROPERTY");
    EXPECT_EQ(instanceFailure("<PROPERTY NAME='p' TYPE='string'><VALUE.ARRAY/></PROPERTY>"),
              "not valid: element VALUE.ARRAY where VALUE belongs");
    EXPECT_EQ(
        instanceFailure("<PROPERTY NAME='p' TYPE='string'><VALUE><VALUE/></VALUE></PROPERTY>"),
        "not valid: element VALUE in VALUE");
}

TEST(ObjectReader, RefusesValuesThatTheirTypeDoesNotHave) {
    EXPECT_EQ(instanceFailure("<PROPERTY NAME='p' TYPE='uint8'><VALUE>300</VALUE></PROPERTY>"),
              "4: p: \"300\" is not of type uint8");
    EXPECT_EQ(instanceFailure("<PROPERTY NAME='p' TYPE='boolean'><VALUE></VALUE></PROPERTY>"),
              "4: p: \"\" is not of type boolean");
    EXPECT_EQ(pathFailure("<INSTANCENAME CLASSNAME='A'><KEYBINDING NAME='k'>"
                          "<KEYVALUE VALUETYPE='numeric'>x</KEYVALUE></KEYBINDING></INSTANCENAME>"),
              "4: k: \"x\" is not a number");
}

TEST(ObjectReader, RefusesDoubledNames) {
    const std::string key = "<KEYBINDING NAME='k'><KEYVALUE>1</KEYVALUE></KEYBINDING>";
    EXPECT_EQ(pathFailure("<INSTANCENAME CLASSNAME='A'>" + key + key + "</INSTANCENAME>"),
              "4: key k is given twice");
    EXPECT_EQ(instanceFailure("<PROPERTY NAME='p' TYPE='uint8'/><PROPERTY NAME='P' TYPE='uint8'/>"),
              "4: property P is given twice");
}

TEST(ObjectReader, TellsNullFromEmpty) {
    const Instance instance = readInstance(
        xml("<INSTANCE CLASSNAME='A'><PROPERTY NAME='n' TYPE='string'/>"
            "<PROPERTY NAME='e' TYPE='string'><VALUE/></PROPERTY>"
            "<PROPERTY.ARRAY NAME='na' TYPE='uint8'/>"
            "<PROPERTY.ARRAY NAME='ea' TYPE='uint8'><VALUE.ARRAY/></PROPERTY.ARRAY></INSTANCE>"));
    EXPECT_TRUE(instance.property("n")->isNull());
    EXPECT_EQ(*instance.property("e"), Value::ofString(""));
    EXPECT_EQ(*instance.property("na"), Value::null(Type::uint8, true));
    EXPECT_EQ(*instance.property("ea"), (Value{Type::uint8, true, Array{}}));
}

TEST(ObjectReader, EndsEmbeddingSomewhere) {
    // Each level is the text of the one around it, so that it can hardly go deep.
    std::string inner = "<INSTANCE CLASSNAME=\"A\"></INSTANCE>";
    const auto embed = [](std::string text) {
        for (const auto& [from, to] : {std::pair{"&", "&amp;"}, std::pair{"<", "&lt;"}}) {
            for (std::size_t at = 0; (at = text.find(from, at)) != std::string::npos; ++at) {
                text.replace(at, 1, to);
            }
        }
        return "<INSTANCE CLASSNAME=\"A\"><PROPERTY NAME=\"p\" TYPE=\"string\" "
               "EmbeddedObject=\"instance\"><VALUE>" +
               text + "</VALUE></PROPERTY></INSTANCE>";
    };
    for (int level = 0; level < 4; ++level) {
        inner = embed(inner);
    }
    EXPECT_EQ(failureOf([&] { return readInstance(xml(inner)); }), "none");
    EXPECT_EQ(failureOf([&] { return readInstance(xml(embed(inner))); }),
              "4: p: instances are embedded too deep in each other");
    EXPECT_EQ(instanceFailure("<PROPERTY NAME='p' TYPE='string' EmbeddedObject='instance'>"
                              "<VALUE>plain</VALUE></PROPERTY>"),
              "4: p: embedded instance, line 1: syntax error");
}

TEST(ObjectReader, ReadsListsOfTexts) {
    EXPECT_EQ(readTexts(xml("<VALUE.ARRAY><VALUE>a</VALUE> <VALUE/></VALUE.ARRAY>")),
              (std::vector<std::string>{"a", ""}));
    EXPECT_EQ(failureOf([] { return readTexts(xml("<VALUE.ARRAY><VALUE.NULL/></VALUE.ARRAY>")); }),
              "not valid: element VALUE.NULL where VALUE belongs");
}

void expectSame(const PropertyDeclaration& read, const PropertyDeclaration& written) {
    EXPECT_EQ(read.name, written.name);
    EXPECT_EQ(read.type, written.type);
    EXPECT_EQ(read.isArray, written.isArray);
    EXPECT_EQ(read.arraySize, written.arraySize);
    EXPECT_EQ(read.referenceClass, written.referenceClass);
    EXPECT_EQ(read.defaultValue, written.defaultValue);
    EXPECT_EQ(read.qualifiers, written.qualifiers);
    EXPECT_EQ(read.classOrigin, written.classOrigin);
    EXPECT_EQ(read.propagated, written.propagated);
}

TEST(ClassReader, ReadsEveryClassOfTheSchemaAsItIsWritten) {
    ClassRepository repository;
    repository.loadDirectory(ZR_SOURCE_DIR "/schema");
    ASSERT_GT(repository.classes().size(), 20U);
    for (const ClassDeclaration* const written : repository.classes()) {
        std::string xml;
        writeClass(xml, *written, {false, true, true, std::nullopt});
        const ClassDeclaration read = readClass(readXml(xml, 64));
        EXPECT_EQ(read.name, written->name);
        EXPECT_EQ(read.superclass, written->superclass);
        EXPECT_EQ(read.qualifiers, written->qualifiers) << xml;
        EXPECT_EQ(read.isAssociation(), written->isAssociation());
        ASSERT_EQ(read.properties.size(), written->properties.size());
        for (std::size_t index = 0; index < read.properties.size(); ++index) {
            SCOPED_TRACE(written->name + '.' + written->properties[index].name);
            expectSame(read.properties[index], written->properties[index]);
        }
    }
}

TEST(ClassReader, PassesOverMethodsAndKeepsSizesAndEmbeddedObjects) {
    const ClassDeclaration read =
        readClass(readXml("<CLASS NAME='A'><PROPERTY.ARRAY NAME='l' TYPE='uint8' ARRAYSIZE='3'>"
                          "<VALUE.ARRAY><VALUE>1</VALUE></VALUE.ARRAY></PROPERTY.ARRAY>"
                          "<PROPERTY NAME='e' TYPE='string' EmbeddedObject='instance'/>"
                          "<METHOD NAME='m' TYPE='uint32'/></CLASS>",
                          64));
    ASSERT_EQ(read.properties.size(), 2U);
    EXPECT_EQ(read.properties[0].arraySize, 3U);
    EXPECT_EQ(read.properties[0].defaultValue,
              (Value{Type::uint8, true, Array{Scalar(std::uint64_t{1})}}));
    EXPECT_EQ(read.properties[1].type, Type::string);
    EXPECT_TRUE(read.properties[1].defaultValue.isNull());
}

TEST(ClassReader, RefusesWhatIsNoClass) {
    for (const char* xml :
         {"<INSTANCE CLASSNAME='A'/>", "<CLASS/>", "<CLASS NAME='A'>text</CLASS>",
          "<CLASS NAME='A'><VALUE/></CLASS>", "<CLASS NAME='A'><PROPERTY TYPE='string'/></CLASS>",
          "<CLASS NAME='A'><PROPERTY NAME='p'/></CLASS>",
          "<CLASS NAME='A'><PROPERTY NAME='p' TYPE='string'/><PROPERTY NAME='P' TYPE='string'/>"
          "</CLASS>",
          "<CLASS NAME='A'><QUALIFIER NAME='q'/></CLASS>",
          "<CLASS NAME='A'><PROPERTY.ARRAY NAME='p' TYPE='string' ARRAYSIZE='x'/></CLASS>"}) {
        EXPECT_THROW(static_cast<void>(readClass(readXml(xml, 64))), NotValid) << xml;
    }
    EXPECT_THROW(static_cast<void>(readClass(readXml(
                     "<CLASS NAME='A'><PROPERTY NAME='p' TYPE='boolean'><VALUE>maybe</VALUE>"
                     "</PROPERTY></CLASS>",
                     64))),
                 CimError);
}

NamedValue reference(const std::string& name, const ObjectPath& path) {
    return {name, {Type::reference, false, Scalar(std::make_shared<const ObjectPath>(path))}};
}

TEST(PathLocation, FillsWhatIsNotWritten) {
    ObjectPath path{"", "", "A", {}};
    locate(path, "root/a");
    EXPECT_EQ(path.nameSpace, "root/a");
    locate(path, "root/b");
    EXPECT_EQ(path.nameSpace, "root/a");
}

TEST(PathLocation, AReferenceIsOfTheNamespaceAroundIt) {
    const ObjectPath inner{"", "", "C", {}};
    const ObjectPath middle{"", "root/b", "B", {reference("R", inner)}};
    ObjectPath path{"", "", "A", {reference("R", middle), reference("S", inner)}};
    locate(path, "root/a");
    const ObjectPath innerOfB{"", "root/b", "C", {}};
    const ObjectPath innerOfA{"", "root/a", "C", {}};
    EXPECT_EQ(path, (ObjectPath{"",
                                "root/a",
                                "A",
                                {reference("R", {"", "root/b", "B", {reference("R", innerOfB)}}),
                                 reference("S", innerOfA)}}));
}

TEST(PathLocation, PropertiesOfInstancesAreLocatedToo) {
    Instance instance{{"", "", "A", {}},
                      {reference("R", {"", "", "B", {}}), {"T", Value::ofString("x")}}};
    locate(instance, "root/a");
    EXPECT_EQ(instance,
              (Instance{{"", "root/a", "A", {}},
                        {reference("R", {"", "root/a", "B", {}}), {"T", Value::ofString("x")}}}));
}

}  // namespace cimom::wbem
