// The operations as a client sees them, on the test providers.
#include "cimom/Results.h"
#include "operations/Operations.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimxml/ObjectReader.h"
#include "kit/WireSupport.h"

namespace cimom::test {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

class WbemOperations : public testing::Test {
  protected:
    std::string failure(const std::string& method, const std::string& parameters,
                        const std::string& nameSpace = "root/test") {
        return errorOf(server.call(method, parameters, nameSpace));
    }

    /// The texts of the paths that an operation returns.
    std::vector<std::string> paths(const std::string& method, const std::string& parameters) {
        std::vector<std::string> texts;
        for (const wbem::XmlElement& element : returned(server.call(method, parameters))) {
            const wbem::XmlElement* path = &element;
            while (path->name == "OBJECTPATH" || path->name == "VALUE.OBJECTWITHPATH" ||
                   path->name == "VALUE.NAMEDINSTANCE") {
                path = &path->children.at(0);
            }
            texts.push_back(toText(wbem::readPath(*path)));
        }
        return texts;
    }

    Instance get(const std::string& className, const std::string& id,
                 const std::string& further = "") {
        const auto found = returned(server.call(
            "GetInstance", parameter("InstanceName", instanceName(className, id)) + further));
        EXPECT_THAT(found, SizeIs(1));
        return found.empty() ? Instance() : wbem::readInstance(found.front());
    }

    std::vector<std::string> classNames(const std::string& parameters) {
        std::vector<std::string> names;
        for (const auto& element : returned(server.call("EnumerateClassNames", parameters))) {
            names.push_back(*element.attribute("NAME"));
        }
        return names;
    }

    static std::vector<std::string> propertiesOf(const Instance& instance) {
        std::vector<std::string> names;
        for (const NamedValue& property : instance.properties) {
            names.push_back(property.name);
        }
        return names;
    }

    /// Reads everything through the manager as the server's peer in this process.
    static Instance direct(const std::string& text) {
        ObjectManager manager(configuration("test.reg"));
        const auto result = manager.getInstance(parseObjectPath("root/test:" + text));
        return result.instances.at(0).value();
    }

    TestServer server;
};

TEST_F(WbemOperations, ValuesOfEveryTypeArriveAsTheProviderMadeThem) {
    const Instance expected = direct("Test_Types.Id=\"types\"");
    const Instance received = get("Test_Types", "types");
    ASSERT_GT(expected.properties.size(), 30U);
    for (const NamedValue& property : expected.properties) {
        const Value* const value = received.property(property.name);
        ASSERT_NE(value, nullptr) << property.name;
        if (property.name == "Embedded") {
            // An embedded instance has a class, and no path.
            const auto& inner = *std::get<std::shared_ptr<const Instance>>(*value->scalar());
            EXPECT_EQ(inner.path.className, "Test_Inner");
            EXPECT_EQ(textOf(inner, "Text"), "inside");
        } else if (property.name == "Char16A") {
            // XML has no character of code 0 (XML 1.0, 2.2).
            const Value replaced{Type::char16, true, Array{u'\u20ac', u'\ufffd', Scalar()}};
            EXPECT_EQ(*value, replaced);
        } else {
            EXPECT_EQ(*value, property.value) << property.name;
        }
    }
}

TEST_F(WbemOperations, EnumerationsGoOverSubclassesAndAnyCaseOfNames) {
    EXPECT_THAT(paths("EnumerateInstanceNames", classParameter("test_RIGHT", "classname")),
                ElementsAre("Test_Right.Id=\"r1\"", "Test_RightSpecial.Id=\"s1\""));
    EXPECT_THAT(paths("enumerateinstances", classParameter("Test_Base")),
                ElementsAre("Test_Types.Id=\"types\"", "Test_Left.Id=\"l1\"", "Test_Left.Id=\"l2\"",
                            "Test_Right.Id=\"r1\"", "Test_RightSpecial.Id=\"s1\""));
    EXPECT_THAT(paths("EnumerateInstanceNames", classParameter("Test_Unserved")), IsEmpty());
}

TEST_F(WbemOperations, WithoutDeepInheritanceOnlyTheClassOwnPropertiesCome) {
    const auto instances =
        returned(server.call("EnumerateInstances", classParameter("Test_Base") +
                                                       valueParameter("DeepInheritance", "FALSE")));
    ASSERT_THAT(instances, SizeIs(5));
    const Instance first = wbem::readInstance(instances[0].children.at(1));
    EXPECT_EQ(first.path.className, "Test_Types");
    EXPECT_THAT(propertiesOf(first), testing::UnorderedElementsAre("Id", "Note"));
}

TEST_F(WbemOperations, PropertyListsLeaveKeysInThePath) {
    const auto instances =
        returned(server.call("EnumerateInstances", classParameter("Test_Left") +
                                                       listParameter("PropertyList", {"note"})));
    ASSERT_THAT(instances, SizeIs(2));
    EXPECT_EQ(toText(wbem::readPath(instances[0].children.at(0))), "Test_Left.Id=\"l1\"");
    EXPECT_THAT(propertiesOf(wbem::readInstance(instances[0].children.at(1))), ElementsAre("Note"));
    EXPECT_THAT(propertiesOf(get("Test_Left", "l1", listParameter("PropertyList", {}))), IsEmpty());
    EXPECT_THAT(propertiesOf(get("Test_Left", "l1", listParameter("PropertyList", {"Nope"}))),
                IsEmpty());
}

TEST_F(WbemOperations, GetInstanceShowsWhatTheProviderLeftOutAsNull) {
    const auto numbered = returned(server.call(
        "GetInstance",
        parameter("InstanceName",
                  "<INSTANCENAME CLASSNAME=\"Test_Numbered\"><KEYBINDING NAME=\"number\">"
                  "<KEYVALUE VALUETYPE=\"numeric\">300</KEYVALUE></KEYBINDING></INSTANCENAME>")));
    ASSERT_THAT(numbered, SizeIs(1));
    EXPECT_TRUE(wbem::readInstance(numbered[0]).property("Text")->isNull());
}

TEST_F(WbemOperations, AKeyWithoutANameIsTheClassOnlyOne) {
    const auto found = returned(server.call(
        "GetInstance",
        parameter("InstanceName",
                  "<INSTANCENAME CLASSNAME=\"Test_Left\"><KEYVALUE>l2</KEYVALUE></INSTANCENAME>")));
    ASSERT_THAT(found, SizeIs(1));
    EXPECT_EQ(textOf(wbem::readInstance(found[0]), "Id"), "l2");
}

TEST_F(WbemOperations, ClassOriginsComeWhenAskedFor) {
    const auto found = returned(
        server.call("GetInstance", parameter("InstanceName", instanceName("Test_Left", "l1")) +
                                       valueParameter("IncludeClassOrigin", "true")));
    ASSERT_THAT(found, SizeIs(1));
    EXPECT_EQ(*found[0].children.at(0).attribute("CLASSORIGIN"), "Test_Base");
}

TEST_F(WbemOperations, ModificationsReachTheProviderAndTheLog) {
    const auto modify = [this](const std::string& properties, const std::string& further = "") {
        return errorOf(server.call(
            "ModifyInstance", parameter("ModifiedInstance",
                                        "<VALUE.NAMEDINSTANCE>" + instanceName("Test_Left", "l1") +
                                            "<INSTANCE CLASSNAME=\"Test_Left\">" + properties +
                                            "</INSTANCE></VALUE.NAMEDINSTANCE>") +
                                  further));
    };
    const std::string note =
        "<PROPERTY NAME=\"Note\" TYPE=\"string\"><VALUE>over the wire</VALUE></PROPERTY>";
    const std::string before = textOf(get("Test_Left", "l1"), "Note");
    EXPECT_EQ(modify(note, listParameter("PropertyList", {"Note"})), "");
    EXPECT_EQ(textOf(get("Test_Left", "l2"), "Note"), "over the wire");
    EXPECT_EQ(modify("<PROPERTY NAME=\"Note\" TYPE=\"uint8\"><VALUE>1</VALUE></PROPERTY>"),
              "13 property Note is of type string");
    EXPECT_EQ(modify("<PROPERTY.ARRAY NAME=\"Note\" TYPE=\"string\"/>"),
              "13 property Note is of type string");
    EXPECT_EQ(modify("<PROPERTY NAME=\"Nope\" TYPE=\"string\"/>"),
              "12 Test_Left has no property \"Nope\"");
    EXPECT_EQ(modify(note, listParameter("PropertyList", {"Nope"})),
              "12 Test_Left has no property \"Nope\"");
    EXPECT_EQ(modify("<PROPERTY NAME=\"Note\" TYPE=\"string\"><VALUE>a&#13;b</VALUE></PROPERTY>"),
              "4 property Note holds a control character");
    const auto log = server.log(wbem::LogKind::modification);
    ASSERT_THAT(log, SizeIs(6));
    EXPECT_EQ(log[0],
              "modify user=none address=127.0.0.1 object=root/test:Test_Left.Id=\"l1\" Note: \"" +
                  before + "\" -> \"over the wire\" status=OK");
    EXPECT_THAT(log[1], testing::EndsWith("status=CIM_ERR_TYPE_MISMATCH (property Note is of type "
                                          "string)"));
}

TEST_F(WbemOperations, AssociationsKeepToEveryFilter) {
    const std::string l1 = parameter("ObjectName", instanceName("Test_Left", "l1"));
    EXPECT_THAT(paths("AssociatorNames", l1), ElementsAre("root/test:Test_Right.Id=\"r1\"",
                                                          "root/test:Test_RightSpecial.Id=\"s1\""));
    EXPECT_THAT(paths("AssociatorNames", l1 + classParameter("test_linka", "AssocClass")),
                ElementsAre("root/test:Test_Right.Id=\"r1\""));
    EXPECT_THAT(paths("Associators", l1 + classParameter("Test_RightSpecial", "ResultClass")),
                ElementsAre("root/test:Test_RightSpecial.Id=\"s1\""));
    EXPECT_THAT(paths("AssociatorNames", l1 + valueParameter("Role", "far")), IsEmpty());
    EXPECT_THAT(paths("AssociatorNames",
                      l1 + valueParameter("Role", "near") + valueParameter("ResultRole", "FAR")),
                SizeIs(2));
    const std::string nearAndFar =
        "Near=\"root/test:Test_Left.Id=\\\"l1\\\"\",Far=\"root/test:Test_Right.Id=\\\"r1\\\"\"";
    EXPECT_THAT(paths("ReferenceNames", l1 + classParameter("Test_LinkA", "ResultClass")),
                ElementsAre("root/test:Test_LinkA." + nearAndFar));
    EXPECT_THAT(paths("References", l1), SizeIs(2));
    EXPECT_THAT(paths("References", l1 + valueParameter("Role", "Far")), IsEmpty());
    const auto listed =
        returned(server.call("Associators", l1 + listParameter("PropertyList", {"Id"})));
    ASSERT_THAT(listed, SizeIs(2));
    EXPECT_THAT(propertiesOf(wbem::readInstance(listed[0].children.at(1))), ElementsAre("Id"));
}

TEST_F(WbemOperations, UnknownClassOfAFilterIsAnInvalidParameter) {
    const std::string refused = "4 no class \"Nope\", by which the associations are to be chosen";
    for (const std::string& object :
         {instanceName("Test_Left", "l1"), std::string("<CLASSNAME NAME=\"Test_Left\"/>")}) {
        const std::string source = parameter("ObjectName", object);
        const std::string result = source + classParameter("Nope", "ResultClass");
        for (const char* const operation :
             {"Associators", "AssociatorNames", "References", "ReferenceNames"}) {
            EXPECT_EQ(failure(operation, result), refused) << operation << object;
        }
        const std::string association = source + classParameter("Nope", "AssocClass");
        EXPECT_EQ(failure("Associators", association), refused) << object;
        EXPECT_EQ(failure("AssociatorNames", association), refused) << object;
    }
}

TEST_F(WbemOperations, HostAndNamespaceStandInTheResultsOfAssociations) {
    const auto found = returned(
        server.call("AssociatorNames", parameter("ObjectName", instanceName("Test_Left", "l2"))));
    ASSERT_FALSE(found.empty());
    const ObjectPath path = wbem::readPath(found[0].children.at(0));
    EXPECT_EQ(path.host, "testhost");
    EXPECT_EQ(path.nameSpace, "root/test");
}

TEST_F(WbemOperations, AssociationsOfAClassAreClasses) {
    const std::string left = parameter("ObjectName", "<CLASSNAME NAME=\"Test_Left\"/>");
    EXPECT_THAT(paths("ReferenceNames", left),
                ElementsAre("root/test:Test_Link", "root/test:Test_LinkA", "root/test:Test_LinkB"));
    EXPECT_THAT(paths("ReferenceNames", left + classParameter("Test_LinkB", "ResultClass")),
                ElementsAre("root/test:Test_LinkB"));
    EXPECT_THAT(paths("AssociatorNames", left), ElementsAre("root/test:Test_Base"));
    EXPECT_THAT(paths("AssociatorNames", left + valueParameter("Role", "nope")), IsEmpty());
    const auto classes = returned(server.call("Associators", left));
    ASSERT_THAT(classes, SizeIs(1));
    EXPECT_EQ(*classes[0].children.at(1).attribute("NAME"), "Test_Base");
    EXPECT_EQ(failure("References", parameter("ObjectName", "<CLASSNAME NAME=\"Nope\"/>")),
              "5 no class \"Nope\"");
}

TEST_F(WbemOperations, ClassesComeByLevelOrAllTheWay) {
    EXPECT_THAT(classNames(classParameter("Test_Base")),
                ElementsAre("Test_Types", "Test_Left", "Test_Right"));
    EXPECT_THAT(classNames(classParameter("Test_Base") + valueParameter("DeepInheritance", "TRUE")),
                ElementsAre("Test_Types", "Test_Left", "Test_Right", "Test_RightSpecial"));
    EXPECT_THAT(classNames(""), testing::Contains("Test_Base"));
    EXPECT_THAT(classNames(""), testing::Not(testing::Contains("Test_Left")));
    EXPECT_THAT(classNames(valueParameter("DeepInheritance", "true")),
                testing::Contains("Test_RightSpecial"));
    EXPECT_THAT(returned(server.call("EnumerateClasses", classParameter("Test_Base"))), SizeIs(3));
}

TEST_F(WbemOperations, AClassComesWithWhatIsAskedFor) {
    const auto getClass = [this](const std::string& parameters) {
        return returned(server.call("GetClass", classParameter("TEST_left") + parameters)).at(0);
    };
    const wbem::XmlElement local = getClass("");
    EXPECT_EQ(*local.attribute("NAME"), "Test_Left");
    EXPECT_EQ(*local.attribute("SUPERCLASS"), "Test_Base");
    // It declares nothing itself, and inherits the qualifier of its class.
    ASSERT_THAT(local.children, SizeIs(1));
    EXPECT_EQ(*local.children[0].attribute("NAME"), "Description");
    const wbem::XmlElement whole = getClass(
        valueParameter("LocalOnly", "FALSE") + valueParameter("IncludeQualifiers", "FALSE") +
        valueParameter("IncludeClassOrigin", "TRUE") + listParameter("PropertyList", {"id"}));
    ASSERT_THAT(whole.children, SizeIs(1));
    EXPECT_EQ(*whole.children[0].attribute("NAME"), "Id");
    EXPECT_EQ(*whole.children[0].attribute("CLASSORIGIN"), "Test_Base");
    EXPECT_THAT(whole.children[0].children, IsEmpty());
}

TEST_F(WbemOperations, EveryFailureHasTheStatusOfTheStandard) {
    const std::string left = classParameter("Test_Left");
    EXPECT_EQ(failure("EnumerateInstances", left, "root/nowhere"),
              "3 no namespace \"root/nowhere\"");
    EXPECT_EQ(failure("GetClass", left, "root/nowhere"), "3 no namespace \"root/nowhere\"");
    EXPECT_EQ(failure("EnumerateClassNames", "", "root/nowhere"),
              "3 no namespace \"root/nowhere\"");
    EXPECT_EQ(failure("EnumerateInstanceNames", classParameter("Nope")), "5 no class \"Nope\"");
    EXPECT_EQ(failure("EnumerateClasses", classParameter("Nope")), "5 no class \"Nope\"");
    EXPECT_EQ(failure("GetClass", classParameter("Nope")), "6 no class \"Nope\"");
    EXPECT_EQ(failure("GetInstance", parameter("InstanceName", instanceName("Test_Left", "no"))),
              "6 CIM_ERR_NOT_FOUND");
    EXPECT_EQ(failure("EnumerateInstances", ""), "4 parameter ClassName is missing");
    EXPECT_EQ(failure("EnumerateInstances", left + left), "4 parameter ClassName is given twice");
    EXPECT_EQ(failure("EnumerateInstances", left + valueParameter("Colour", "blue")),
              "4 there is no parameter Colour");
    EXPECT_EQ(failure("EnumerateInstances", left + valueParameter("DeepInheritance", "maybe")),
              "4 parameter DeepInheritance is not a boolean");
    EXPECT_EQ(failure("EnumerateInstances", valueParameter("ClassName", "Test_Left")),
              "4 parameter ClassName is not CLASSNAME");
    EXPECT_EQ(failure("Associators", parameter("ObjectName", "<VALUE/>")),
              "4 parameter ObjectName is neither INSTANCENAME nor CLASSNAME");
    EXPECT_EQ(failure("GetInstance",
                      parameter("InstanceName",
                                "<INSTANCENAME CLASSNAME=\"Test_Numbered\"><KEYBINDING "
                                "NAME=\"Number\"><KEYVALUE VALUETYPE=\"numeric\">70000</KEYVALUE>"
                                "</KEYBINDING></INSTANCENAME>")),
              "4 key Number is not of type uint16");
    EXPECT_EQ(failure("GetInstance", parameter("InstanceName",
                                               "<INSTANCENAME CLASSNAME=\"Test_Link\"><KEYVALUE>x"
                                               "</KEYVALUE></INSTANCENAME>")),
              "4 a key without a name is for classes with one key only");
    EXPECT_EQ(failure("ModifyInstance",
                      parameter("ModifiedInstance",
                                "<VALUE.NAMEDINSTANCE>" + instanceName("Test_Left", "l1") +
                                    "<INSTANCE CLASSNAME=\"Test_Right\"/></VALUE.NAMEDINSTANCE>")),
              "4 the instance is of class Test_Right, its name of class Test_Left");
}

TEST_F(WbemOperations, WhatIsNotServedSaysSo) {
    for (const char* method : {"CreateClass", "ModifyClass", "DeleteClass", "GetProperty",
                               "SetProperty", "SetQualifier", "DeleteQualifier", "MakeCoffee"}) {
        EXPECT_EQ(failure(method, ""),
                  std::string("7 the operation ") + method + " is not offered");
    }
    const std::string body =
        "<CIM CIMVERSION='2.0' DTDVERSION='2.0'><MESSAGE ID='17' PROTOCOLVERSION='1.0'>"
        "<SIMPLEREQ><METHODCALL NAME='RequestStateChange'><LOCALCLASSPATH/></METHODCALL>"
        "</SIMPLEREQ></MESSAGE></CIM>";
    const HttpResponse response = server.ask(httpRequest("RequestStateChange", body));
    const wbem::XmlElement element = responseOf(response.body);
    EXPECT_EQ(element.name, "METHODRESPONSE");
    EXPECT_EQ(errorOf(element), "7 the operation RequestStateChange is not offered");
}

TEST_F(WbemOperations, ResultsOfManyThreadsArriveWhole) {
    EXPECT_THAT(returned(server.call("EnumerateInstances", classParameter("Test_Threads"))),
                SizeIs(400));
}

TEST(WbemBadProviders, NoneHarmsTheNextRequest) {
    TestServer server({}, "bad.reg");
    const auto outcome = [&server](const char* method, const std::string& className) {
        const wbem::XmlElement response = server.call(method, classParameter(className));
        const std::string error = errorOf(response);
        return error.empty() ? std::to_string(returned(response).size())
                             : error.substr(0, error.find(' '));
    };
    const std::vector<std::pair<std::string, std::string>> expected{
        {"Test_NoLibrary", "1"},    {"Test_Unbound", "1"},         {"Test_NoFactory", "7"},
        {"Test_NullRecord", "1"},   {"Test_RefusedRecord", "2"},   {"Test_NullTable", "1"},
        {"Test_NullSlots", "7"},    {"Test_ThrowingFactory", "1"}, {"Test_Throws", "1"},
        {"Test_ThrowsNumber", "1"}, {"Test_NullResults", "2"},     {"Test_Done", "1"},
        {"Test_PartialError", "2"}, {"Test_OddStatus", "1"},       {"Test_ErrorObject", "1"},
        {"Test_NotHere", "6"}};
    for (int round = 0; round < 2; ++round) {
        for (const auto& [className, wanted] : expected) {
            for (const char* method : {"EnumerateInstances", "EnumerateInstanceNames"}) {
                EXPECT_EQ(outcome(method, className), wanted) << method << ' ' << className;
                EXPECT_EQ(outcome(method, "Test_Done"), "1") << "after " << className;
            }
        }
        // Objects of classes that are not known are written as well as they can be.
        EXPECT_EQ(outcome("EnumerateInstanceNames", "Test_WrongClass"), "2");
    }
}

}  // namespace cimom::test
