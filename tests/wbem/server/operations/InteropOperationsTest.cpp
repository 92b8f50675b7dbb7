// Discovery, queries, qualifier types, and instances that come and go, as a client sees them.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimom/Interop.h"
#include "cimxml/ObjectReader.h"
#include "kit/Files.h"
#include "kit/WireSupport.h"

namespace cimom::test {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::SizeIs;

std::string query(const std::string& language, const std::string& text) {
    return valueParameter("QueryLanguage", language) + valueParameter("Query", text);
}
std::string filter(const std::string& language, const std::string& text) {
    return valueParameter("FilterQueryLanguage", language) + valueParameter("FilterQuery", text);
}
std::string newInstance(const std::string& className, const std::string& properties) {
    return parameter("NewInstance",
                     "<INSTANCE CLASSNAME=\"" + className + "\">" + properties + "</INSTANCE>");
}
std::string property(const std::string& name, const std::string& value) {
    return "<PROPERTY NAME=\"" + name + "\" TYPE=\"string\"><VALUE>" + value +
           "</VALUE></PROPERTY>";
}

class WbemInterop : public testing::Test {
  protected:
    TestServer server{{},
                      {{std::filesystem::path(ZR_SOURCE_DIR) / "schema"}, {}, {}, "testhost"},
                      [](ObjectManager& manager) {
                          serveInterop(
                              manager,
                              {"server", "1.2.3", {{"CIM-XML", "by HTTP", 2, "1.0", {2}, {2}}}});
                      }};
};

TEST_F(WbemInterop, ClientsFindTheNamespaceByEitherName) {
    for (const std::string nameSpace : {"interop", "root/interop", "Root/Interop"}) {
        EXPECT_THAT(returned(server.call("EnumerateInstanceNames", classParameter("CIM_Namespace"),
                                         nameSpace)),
                    SizeIs(2));
        EXPECT_THAT(
            returned(server.call("GetClass", classParameter("CIM_RegisteredProfile"), nameSpace)),
            SizeIs(1));
        EXPECT_THAT(returned(server.call("EnumerateClasses", "", nameSpace)),
                    testing::Not(SizeIs(0)));
        EXPECT_THAT(returned(server.call(
                        "GetQualifier", valueParameter("QualifierName", "Association"), nameSpace)),
                    SizeIs(1));
    }
}

TEST_F(WbemInterop, AnUnknownNamespaceIsToldBeforeAnythingElse) {
    for (const std::string method :
         {"EnumerateInstanceNames", "EnumerateInstances", "GetInstance", "ModifyInstance",
          "CreateInstance", "DeleteInstance", "Associators", "ReferenceNames", "GetClass",
          "EnumerateClasses", "GetQualifier", "EnumerateQualifiers", "ExecQuery",
          "OpenEnumerateInstances", "OpenQueryInstances", "PullInstances"}) {
        EXPECT_EQ(errorOf(server.call(method, valueParameter("Nonsense", "1"), "root/none")),
                  "3 no namespace \"root/none\"")
            << method;
    }
}

TEST_F(WbemInterop, EnumeratedInstancesAreEqualToThoseThatAreGot) {
    for (const std::string className : {"CIM_ObjectManager", "CIM_Namespace"}) {
        for (const auto& named :
             returned(server.call("EnumerateInstances", classParameter(className), "interop"))) {
            const wbem::XmlElement& name = named.children.at(0);
            std::string keys;
            for (const auto& key : name.children) {
                keys += "<KEYBINDING NAME=\"" + *key.attribute("NAME") + "\"><KEYVALUE>" +
                        key.children.at(0).text + "</KEYVALUE></KEYBINDING>";
            }
            const auto got = returned(
                server.call("GetInstance",
                            parameter("InstanceName", "<INSTANCENAME CLASSNAME=\"" + className +
                                                          "\">" + keys + "</INSTANCENAME>"),
                            "interop"));
            ASSERT_THAT(got, SizeIs(1));
            EXPECT_EQ(wbem::readInstance(got.front()), wbem::readInstance(named.children.at(1)));
        }
    }
}

TEST_F(WbemInterop, QualifierTypesAreWhole) {
    const auto all = returned(server.call("EnumerateQualifiers", "", "interop"));
    ASSERT_GT(all.size(), 20U);
    const auto key =
        returned(server.call("GetQualifier", valueParameter("QualifierName", "kEY"), "interop"));
    ASSERT_THAT(key, SizeIs(1));
    EXPECT_EQ(*key.front().attribute("NAME"), "Key");
    EXPECT_EQ(*key.front().attribute("OVERRIDABLE"), "false");
    const wbem::XmlElement& scope = key.front().children.at(0);
    EXPECT_NE(scope.attribute("PROPERTY"), nullptr);
    EXPECT_EQ(scope.attribute("CLASS"), nullptr);
    EXPECT_EQ(key.front().children.at(1).text, "FALSE");
    EXPECT_EQ(
        errorOf(server.call("GetQualifier", valueParameter("QualifierName", "No"), "interop")),
        "6 no qualifier \"No\"");
    EXPECT_EQ(errorOf(server.call("GetQualifier", "", "interop")),
              "4 parameter QualifierName is missing");
}

/// Of providers there, too: clients compare registered profiles.
TEST(WbemInteropOfProviders, EnumerationsShowWhatGetInstanceShows) {
    const ZR::Testing::TemporaryDirectory directory;
    directory.write("/numbered.reg",
                    "[Test_Numbered]\nprovider: Test\nlocation: TestProvider\ntype: instance\n"
                    "namespace: root/interop root/test\n");
    Configuration numbered = configuration("test.reg");
    numbered.registrationFiles = {directory.path("/numbered.reg")};
    TestServer server({}, numbered);
    const auto propertiesIn = [&server](const std::string& nameSpace) {
        const auto all =
            returned(server.call("EnumerateInstances", classParameter("Test_Numbered"), nameSpace));
        return wbem::readInstance(all.at(0).children.at(1)).properties;
    };
    const auto shown = propertiesIn("interop");
    ASSERT_THAT(shown, SizeIs(2));
    EXPECT_TRUE(findValue(shown, "Text")->isNull());
    EXPECT_THAT(propertiesIn("root/test"), SizeIs(0));
}

class WbemQueries : public testing::Test {
  protected:
    TestServer server;
};

TEST_F(WbemQueries, ReturnObjectsWithTheirPaths) {
    const auto found = returned(server.call(
        "ExecQuery", query("WQL", "SELECT Note FROM Test_Base WHERE Id = 'l1' OR Id LIKE 's%'")));
    ASSERT_THAT(found, SizeIs(2));
    EXPECT_EQ(found[0].name, "VALUE.OBJECTWITHPATH");
    const ObjectPath path = wbem::readPath(found[0].children.at(0));
    EXPECT_EQ(toText(path), "root/test:Test_Left.Id=\"l1\"");
    EXPECT_EQ(path.host, "testhost");
    EXPECT_THAT(wbem::readInstance(found[0].children.at(1)).properties, SizeIs(1));
    EXPECT_THAT(returned(server.call("ExecQuery", query("DMTF:CQL",
                                                        "SELECT * FROM Test_Left "
                                                        "WHERE Id LIKE 'l1|r1'"))),
                SizeIs(1));
}

TEST_F(WbemQueries, AreRefusedWithTheirOwnStatuses) {
    const auto failure = [this](const std::string& parameters) {
        return errorOf(server.call("ExecQuery", parameters));
    };
    EXPECT_THAT(failure(query("SQL", "SELECT * FROM Test_Left")), testing::StartsWith("14 "));
    EXPECT_THAT(failure(query("WQL", "SELECT * FROM")), testing::StartsWith("15 "));
    EXPECT_EQ(failure(query("WQL", "SELECT * FROM Nobody_Knows")), "5 no class \"Nobody_Knows\"");
    EXPECT_EQ(failure(query("WQL", "SELECT Colour FROM Test_Left")),
              "15 Test_Left has no property \"Colour\"");
    EXPECT_EQ(failure(valueParameter("QueryLanguage", "WQL")), "4 parameter Query is missing");
    EXPECT_EQ(failure(query("WQL", "SELECT * FROM Test_Left") + valueParameter("More", "1")),
              "4 there is no parameter More");
}

TEST_F(WbemQueries, ArePulledInPortions) {
    const auto opened =
        server.call("OpenQueryInstances", filter("WQL", "SELECT Id FROM Test_Base") +
                                              valueParameter("ReturnQueryResultClass", "TRUE") +
                                              valueParameter("MaxObjectCount", "2"));
    const auto first = returned(opened);
    ASSERT_THAT(first, SizeIs(2));
    EXPECT_EQ(first.front().name, "INSTANCE");
    EXPECT_EQ(output(opened, "EndOfSequence"), "FALSE");
    const wbem::XmlElement& resultClass = opened.children.at(1).children.at(0);
    EXPECT_EQ(resultClass.name, "CLASS");
    EXPECT_THAT(resultClass.children,
                testing::Contains(testing::Field(&wbem::XmlElement::name, "PROPERTY")));
    const auto pulled =
        server.call("PullInstances",
                    valueParameter("EnumerationContext", output(opened, "EnumerationContext")) +
                        valueParameter("MaxObjectCount", "10"));
    EXPECT_THAT(returned(pulled), SizeIs(3));
    EXPECT_EQ(output(pulled, "EndOfSequence"), "TRUE");
}

TEST_F(WbemQueries, ThatArePulledAreRefusedLikeOthers) {
    const auto failure = [this](const std::string& parameters) {
        return errorOf(server.call("OpenQueryInstances", parameters));
    };
    EXPECT_THAT(failure(filter("SQL", "SELECT * FROM Test_Left")), testing::StartsWith("14 "));
    EXPECT_THAT(failure(filter("WQL", "SELECT")), testing::StartsWith("15 "));
    EXPECT_THAT(failure(filter("WQL", "SELECT * FROM Test_Left") +
                        valueParameter("ContinueOnError", "TRUE")),
                testing::StartsWith("26"));
    EXPECT_THAT(
        failure(filter("WQL", "SELECT * FROM Test_Left") + valueParameter("OperationTimeout", "0")),
        testing::StartsWith("22"));
}

TEST_F(WbemQueries, CostNoMoreThanOtherResults) {
    wbem::ServerSettings settings;
    settings.limits.result = 1024;
    settings.limits.sessions.sessions = 1;
    TestServer small(settings);
    EXPECT_THAT(errorOf(small.call("ExecQuery", query("WQL", "SELECT * FROM Test_Types"))),
                testing::StartsWith("27"));
    const std::string two =
        filter("WQL", "SELECT Id FROM Test_Left") + valueParameter("MaxObjectCount", "1");
    EXPECT_EQ(errorOf(small.call("OpenQueryInstances", two)), "");
    EXPECT_THAT(errorOf(small.call("OpenQueryInstances", two)), testing::StartsWith("27"));
}

class WbemChanges : public testing::Test {
  protected:
    TestServer server;
};

TEST_F(WbemChanges, InstancesAreCreatedAndLogged) {
    const auto made = returned(server.call(
        "CreateInstance", newInstance("Test_Left", property("Id", "l3") + property("Note", "n"))));
    ASSERT_THAT(made, SizeIs(1));
    returned(server.call("CreateInstance", newInstance("Test_Left", property("Id", "l1"))));
    EXPECT_EQ(made.front().name, "INSTANCENAME");
    EXPECT_EQ(toText(wbem::readPath(made.front())), "Test_Left.Id=\"l3\"");
    EXPECT_THAT(
        server.log(wbem::LogKind::modification),
        ElementsAre(
            // The provider says that it has made it, and has not.
            R"(create user=none address=127.0.0.1 object=root/test:Test_Left.Id="l3" Id: "l3" Note: "n" status=ACCEPTED (the instance cannot be read))",
            R"(create user=none address=127.0.0.1 object=root/test:Test_Left.Id="l1" Id: "l1" status=OK)"));
}

TEST_F(WbemChanges, TheLogTellsWhetherAValueWasKept) {
    const auto modify = [this](const std::string& className, const std::string& properties) {
        server.call(
            "ModifyInstance",
            parameter("ModifiedInstance", "<VALUE.NAMEDINSTANCE>" + instanceName(className, "l1") +
                                              "<INSTANCE CLASSNAME=\"" + className + "\">" +
                                              properties + "</INSTANCE></VALUE.NAMEDINSTANCE>"));
    };
    const auto note = [](const std::string& value) {
        return "<PROPERTY NAME=\"Note\" TYPE=\"string\"><VALUE>" + value + "</VALUE></PROPERTY>";
    };
    modify("Test_Left", note("kept"));
    // The provider keeps what is in Note, and nothing else.
    modify("Test_Left", note("kept") +
                            "<PROPERTY NAME=\"Id\" TYPE=\"string\"><VALUE>l7</VALUE>"
                            "</PROPERTY>");
    const auto lines = server.log(wbem::LogKind::modification);
    ASSERT_THAT(lines, SizeIs(2));
    EXPECT_THAT(lines[0], testing::EndsWith("-> \"kept\" status=OK"));
    EXPECT_THAT(lines[1], testing::EndsWith("Id: \"l1\" -> \"l7\" status=ACCEPTED (Id is \"l1\")"));
}

TEST_F(WbemChanges, InstancesAreDeletedAndLogged) {
    const wbem::XmlElement done =
        server.call("DeleteInstance", parameter("InstanceName", instanceName("Test_Left", "l1")));
    EXPECT_THAT(done.children, SizeIs(0));
    server.call("DeleteInstance", parameter("InstanceName", instanceName("Test_Left", "gone")));
    EXPECT_EQ(errorOf(server.call("DeleteInstance",
                                  parameter("InstanceName", instanceName("Test_Left", "none")))),
              "6 CIM_ERR_NOT_FOUND");
    EXPECT_THAT(
        server.log(wbem::LogKind::modification),
        ElementsAre(HasSubstr(R"(Test_Left.Id="l1" status=ACCEPTED (the instance can still )"
                              "be read)"),
                    HasSubstr(R"(object=root/test:Test_Left.Id="gone" status=OK)"),
                    HasSubstr("status=CIM_ERR_NOT_FOUND")));
}

TEST_F(WbemChanges, WhateverIsWrongWithANewInstanceHasOneStatus) {
    const auto failure = [this](const std::string& parameters) {
        return errorOf(server.call("CreateInstance", parameters));
    };
    EXPECT_EQ(failure(newInstance("Test_Left", property("Colour", "red"))),
              "4 Test_Left has no property \"Colour\"");
    EXPECT_EQ(failure(newInstance("Test_Types", property("Uint8", "1"))),
              "4 property Uint8 is of type uint8");
    EXPECT_EQ(failure(newInstance("Nobody_Knows", "")), "5 no class \"Nobody_Knows\"");
    EXPECT_EQ(failure(newInstance("Test_Base", "")), "7 nothing makes instances of Test_Base");
    EXPECT_EQ(failure(newInstance("Test_Left", property("Id", "twice"))),
              "11 CIM_ERR_ALREADY_EXISTS");
    EXPECT_EQ(failure(""), "4 parameter NewInstance is missing");
    EXPECT_THAT(server.log(wbem::LogKind::modification), SizeIs(5));
}

TEST_F(WbemChanges, NeedTheRightToModify) {
    wbem::ServerSettings settings;
    settings.readOnly = true;
    TestServer fixed(settings);
    const std::string refused = "2 this needs the right to modify";
    EXPECT_EQ(errorOf(fixed.call("CreateInstance", newInstance("Test_Left", property("Id", "l3")))),
              refused);
    EXPECT_EQ(errorOf(fixed.call("DeleteInstance",
                                 parameter("InstanceName", instanceName("Test_Left", "l1")))),
              refused);
    EXPECT_THAT(fixed.log(wbem::LogKind::modification),
                ElementsAre(HasSubstr("create user=none"), HasSubstr("delete user=none")));
}

}  // namespace
}  // namespace cimom::test
