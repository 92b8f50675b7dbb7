#include "kit/TestManager.h"

#include "cimom/Query.h"
#include "cimom/Results.h"

namespace cimom::test {
namespace {

using testing::ElementsAre;
using InstanceRequests = TestManager;

TEST_F(InstanceRequests, EnumerationOfAServedClassIsOneCall) {
    const PathsResult result = manager.enumerateInstanceNames(path("test_LEFT"));
    EXPECT_EQ(result.status, Status{});
    EXPECT_THAT(names(result.paths), ElementsAre("Test_Left.Id=\"l1\"", "Test_Left.Id=\"l2\""));
    EXPECT_EQ(result.returnDoneCalls, 1U);
    EXPECT_EQ(takeLog(), "enumerateInstanceNames Test_Left\n");
}

TEST_F(InstanceRequests, EnumerationOfAParentAsksEachServedSubclassOnce) {
    const InstancesResult result = manager.enumerateInstances(path("Test_Base"));
    EXPECT_EQ(result.status, Status{});
    EXPECT_THAT(names(result.instances),
                ElementsAre("Test_Types.Id=\"types\"", "Test_Left.Id=\"l1\"", "Test_Left.Id=\"l2\"",
                            "Test_Right.Id=\"r1\"", "Test_RightSpecial.Id=\"s1\""));
    EXPECT_EQ(result.returnDoneCalls, 4U);
    EXPECT_EQ(takeLog(),
              "enumerateInstances Test_Types\nenumerateInstances Test_Left\n"
              "enumerateInstances Test_Right\nenumerateInstances Test_RightSpecial\n");
}

TEST_F(InstanceRequests, KeysOfTheRequestReachTheProvider) {
    manager.enumerateInstanceNames(path("Test_Base.Id=\"x\",Number=5"));
    EXPECT_THAT(takeLog(), testing::StartsWith("enumerateInstanceNames Test_Types.Id:" +
                                               std::to_string(CMPI_string) +
                                               ".Number:" + std::to_string(CMPI_uint64)));
}

TEST_F(InstanceRequests, NumericKeyReachesTheProviderInItsDeclaredType) {
    manager.getInstance(path("Test_Numbered.Number=2"));
    EXPECT_EQ(takeLog(), "getInstance Test_Numbered.Number:" + std::to_string(CMPI_uint16) + "\n");
}

TEST_F(InstanceRequests, UnknownNamespaceAndClassAreTold) {
    EXPECT_EQ(manager.enumerateInstances(parseObjectPath("root/nowhere:Test_Left")).status,
              (Status{CMPI_RC_ERR_INVALID_NAMESPACE, "no namespace \"root/nowhere\""}));
    EXPECT_EQ(manager.enumerateInstances(parseObjectPath("Test_Left")).status,
              (Status{CMPI_RC_ERR_INVALID_NAMESPACE, "the path has no namespace"}));
    EXPECT_EQ(manager.enumerateInstanceNames(path("Nobody_Knows")).status,
              (Status{CMPI_RC_ERR_INVALID_CLASS, "no class \"Nobody_Knows\""}));
    EXPECT_EQ(manager.getInstance(path("Nobody_Knows.Id=\"1\"")).status.code,
              CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(manager.modifyInstance({path("Nobody_Knows.Id=\"1\""), {}}).status.code,
              CMPI_RC_ERR_INVALID_CLASS);
}

TEST_F(InstanceRequests, KnownClassWithoutProviderHasNoInstances) {
    const PathsResult paths = manager.enumerateInstanceNames(path("Test_Unserved"));
    EXPECT_EQ(paths.status, Status{});
    EXPECT_TRUE(paths.paths.empty());
    EXPECT_EQ(manager.getInstance(path("Test_Unserved.Id=\"1\"")).status.code,
              CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(manager.modifyInstance({path("Test_Unserved.Id=\"1\""), {}}).status.code,
              CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(InstanceRequests, ClassIsServedInItsNamespacesOnly) {
    EXPECT_EQ(
        manager.enumerateInstances(parseObjectPath("root/other:Test_Numbered")).instances.size(),
        3U);
    EXPECT_TRUE(
        manager.enumerateInstances(parseObjectPath("root/other:Test_Left")).instances.empty());
}

TEST_F(InstanceRequests, ResultsHaveHostAndNamespace) {
    const PathsResult result = manager.enumerateInstanceNames(path("Test_Numbered"));
    ASSERT_EQ(result.paths.size(), 3U);
    EXPECT_EQ(result.paths[0]->host, "testhost");
    EXPECT_EQ(result.paths[0]->nameSpace, "root/test");
}

TEST_F(InstanceRequests, GetPicksTheInstanceThatAgreesWithEveryKey) {
    const InstancesResult result = manager.getInstance(path("Test_Left.Id=\"l2\""));
    EXPECT_EQ(result.status, Status{});
    EXPECT_THAT(names(result.instances), ElementsAre("Test_Left.Id=\"l2\""));
    EXPECT_EQ(result.returnDoneCalls, 0U);
    EXPECT_THAT(names(manager.getInstance(path("Test_Numbered.Number=300")).instances),
                ElementsAre("Test_Numbered.Number=300"));
}

TEST_F(InstanceRequests, GetOfWhatIsNotThereIsNotFound) {
    const InstancesResult result = manager.getInstance(path("Test_Left.Id=\"L1\""));
    EXPECT_EQ(result.status.code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_TRUE(result.instances.empty());
    EXPECT_EQ(manager.getInstance(path("Test_Left.Id=\"l1\",More=1")).status.code,
              CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(InstanceRequests, GetByAParentsPathFindsTheSubclassInstance) {
    EXPECT_THAT(names(manager.getInstance(path("Test_Right.Id=\"s1\"")).instances),
                ElementsAre("Test_RightSpecial.Id=\"s1\""));
    EXPECT_THAT(names(manager.getInstance(path("Test_Base.Id=\"r1\"")).instances),
                ElementsAre("Test_Right.Id=\"r1\""));
}

TEST_F(InstanceRequests, GetOfAnAssociationTakesReferenceKeysAsText) {
    const std::string link = R"(Test_LinkA.Near="root/test:Test_Right.Id=\"r1\"",)"
                             R"(Far="Test_Left.Id=\"l2\"")";
    const InstancesResult result = manager.getInstance(path(link));
    EXPECT_EQ(result.status, Status{});
    ASSERT_EQ(result.instances.size(), 1U);
    EXPECT_NE(result.instances[0]->property("Weight"), nullptr);
}

TEST_F(InstanceRequests, PropertyListLimitsPropertiesButNotKeys) {
    const InstanceRequest request{std::vector<std::string>{"note", "Nonsense"}, ""};
    const InstancesResult all = manager.enumerateInstances(path("Test_Left"), request);
    ASSERT_EQ(all.instances.size(), 2U);
    for (const auto& instance : all.instances) {
        ASSERT_EQ(instance->properties.size(), 1U);
        EXPECT_EQ(instance->properties[0].name, "Note");
        EXPECT_NE(instance->path.key("Id"), nullptr);
    }
    EXPECT_EQ(takeLog(), "enumerateInstances Test_Left list\n");
    const InstanceRequest nothing{std::vector<std::string>{}, ""};
    EXPECT_TRUE(manager.getInstance(path("Test_Left.Id=\"l1\""), nothing)
                    .instances.at(0)
                    ->properties.empty());
}

TEST_F(InstanceRequests, ValuesOfEveryTypeArrive) {
    const InstancesResult result = manager.getInstance(path("Test_Types.Id=\"types\""));
    ASSERT_EQ(result.instances.size(), 1U);
    const Instance& instance = *result.instances[0];
    const auto expect = [&instance](const std::string& name, Type type, const Scalar& scalar,
                                    const Scalar& second) {
        ASSERT_NE(instance.property(name), nullptr) << name;
        EXPECT_EQ(*instance.property(name), (Value{type, false, scalar})) << name;
        ASSERT_NE(instance.property(name + "A"), nullptr) << name;
        EXPECT_EQ(*instance.property(name + "A"), (Value{type, true, Array{scalar, second, {}}}))
            << name;
    };
    expect("Boolean", Type::boolean, true, false);
    expect("Char16", Type::char16, u'\u20ac', u'\0');
    expect("Uint8", Type::uint8, std::uint64_t{255}, std::uint64_t{0});
    expect("Uint16", Type::uint16, std::uint64_t{65535}, std::uint64_t{0});
    expect("Uint32", Type::uint32, std::uint64_t{4294967295}, std::uint64_t{0});
    expect("Uint64", Type::uint64, std::uint64_t{18446744073709551615U}, std::uint64_t{0});
    expect("Sint8", Type::sint8, std::int64_t{-128}, std::int64_t{0});
    expect("Sint16", Type::sint16, std::int64_t{-32768}, std::int64_t{0});
    expect("Sint32", Type::sint32, std::int64_t{-2147483648}, std::int64_t{0});
    expect("Sint64", Type::sint64, std::numeric_limits<std::int64_t>::min(), std::int64_t{0});
    expect("Real32", Type::real32, 0.5, 0.0);
    expect("Real64", Type::real64, -1.25e300, 0.0);
    expect("DateTime", Type::datetime, std::string("20240131093000.12****+060"),
           std::string("20240131093000.12****+060"));
    EXPECT_EQ(textOf(instance, "String"), "Grüße");
    EXPECT_EQ(*instance.property("StringA"),
              (Value{Type::string, true, Array{std::string("one"), std::string(), {}}}));
    EXPECT_EQ(textOf(instance, "Interval"), "00000000000001.000000:000");
    const Value& embedded = *instance.property("Embedded");
    EXPECT_EQ(embedded.type, Type::instance);
    EXPECT_EQ(textOf(*std::get<std::shared_ptr<const Instance>>(scalarOf(&embedded)), "Text"),
              "inside");
}

TEST_F(InstanceRequests, ModifyPassesTheInstanceAsReceived) {
    const Instance changed{
        path("test_left.Id=\"l1\""),
        {{"Note", Value::ofString("by a client")}, {"Strange", Value::null(Type::uint8, true)}}};
    const InstancesResult result =
        manager.modifyInstance(changed, {std::vector<std::string>{"Note", "Other"}, ""});
    EXPECT_EQ(result.status, Status{});
    EXPECT_EQ(result.returnDoneCalls, 1U);
    EXPECT_EQ(takeLog(), "modifyInstance Test_Left 2 Note Other\n");
    EXPECT_EQ(textOf(*manager.getInstance(path("Test_Left.Id=\"l1\"")).instances.at(0), "Note"),
              "by a client");
}

TEST_F(InstanceRequests, ModifyOfAParentsPathReachesTheClassThatHasTheInstance) {
    const Instance changed{path("Test_Base.Id=\"s1\""), {{"Note", Value::ofString("x")}}};
    EXPECT_EQ(manager.modifyInstance(changed).status, Status{});
    EXPECT_THAT(takeLog(), testing::EndsWith(
                               "getInstance Test_RightSpecial.Id:" + std::to_string(CMPI_string) +
                               "\nmodifyInstance Test_RightSpecial 1\n"));
}

TEST_F(InstanceRequests, ModifyWithAControlCharacterNeverReachesTheProvider) {
    manager.enumerateInstanceNames(path("Test_Left"));
    takeLog();
    const Instance changed{path("Test_Left.Id=\"l1\""), {{"Note", Value::ofString("a\nb")}}};
    EXPECT_EQ(manager.modifyInstance(changed).status.code, CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(takeLog(), "");
}

TEST_F(InstanceRequests, ModifyWithAnImpossibleValueIsRefused) {
    const Instance changed{path("Test_Left.Id=\"l1\""),
                           {{"Size", {Type::uint8, false, Scalar(std::uint64_t{256})}}}};
    EXPECT_EQ(manager.modifyInstance(changed).status,
              (Status{CMPI_RC_ERR_INVALID_PARAMETER, "Size: 256 is not of type uint8"}));
}

Instance newLeft(const std::string& id) {
    return {{"", "/ROOT/test/", "test_left", {{"Id", Value::ofString("not looked at")}}},
            {{"Id", Value::ofString(id)}, {"Note", Value::ofString("new")}}};
}

TEST_F(InstanceRequests, CreationGoesToTheProviderOfTheClass) {
    const std::string call = "createInstance Test_Left.Id:" + std::to_string(CMPI_string);
    const PathsResult made = manager.createInstance(newLeft("l3"));
    EXPECT_EQ(made.status, Status{});
    EXPECT_THAT(names(made.paths), ElementsAre("Test_Left.Id=\"l3\""));
    EXPECT_EQ(made.paths.front()->nameSpace, "root/test");
    EXPECT_EQ(made.paths.front()->host, "testhost");
    EXPECT_EQ(takeLog(), call + " new\n");

    EXPECT_THAT(names(manager.createInstance(newLeft("silent")).paths),
                ElementsAre("Test_Left.Id=\"silent\""));
    const PathsResult refused = manager.createInstance(newLeft("twice"));
    EXPECT_EQ(refused.status.code, CMPI_RC_ERR_ALREADY_EXISTS);
    EXPECT_TRUE(refused.paths.empty());
}

TEST_F(InstanceRequests, CreationNeedsWhoServesTheClassItself) {
    const auto status = [this](const std::string& className) {
        return manager.createInstance({{"", "root/test", className, {}}, {}}).status.code;
    };
    EXPECT_EQ(status("Test_Base"), CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(status("Test_Unserved"), CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(status("Test_Asks"), CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(status("Nobody_Knows"), CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(manager.createInstance({{"", "root/no", "Nobody_Knows", {}}, {}}).status.code,
              CMPI_RC_ERR_INVALID_NAMESPACE);
    Instance bad = newLeft("l\x01");
    EXPECT_EQ(manager.createInstance(bad).status.code, CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(takeLog().find("createInstance"), std::string::npos);
}

TEST_F(InstanceRequests, DeletionGoesToTheClassThatHasTheInstance) {
    const std::string id = ".Id:" + std::to_string(CMPI_string);
    EXPECT_EQ(manager.deleteInstance(path("TEST_left.Id=\"l1\"")), Status{});
    EXPECT_EQ(takeLog(), "deleteInstance Test_Left" + id + "\n");
    EXPECT_EQ(manager.deleteInstance(path("Test_Base.Id=\"s1\"")), Status{});
    EXPECT_THAT(takeLog(), testing::EndsWith("deleteInstance Test_RightSpecial" + id + "\n"));
    EXPECT_EQ(manager.deleteInstance(path("Test_Left.Id=\"none\"")).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(manager.deleteInstance(path("Test_Base.Id=\"none\"")).code, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(manager.deleteInstance(path("Test_Asks.Id=\"1\"")).code, CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST_F(InstanceRequests, QueriesSelectAmongTheInstancesOfTheClassAndItsSubclasses) {
    const auto selected = [this](const std::string& text) {
        CollectedObjects<Instance> found;
        const RequestEnd end = manager.execQuery("Root/Test", Query::parse("WQL", text), {}, found);
        EXPECT_EQ(end.status, Status{});
        return std::move(found.objects);
    };
    EXPECT_THAT(
        names(selected("SELECT * FROM Test_Base WHERE Id LIKE '%1'")),
        ElementsAre("Test_Left.Id=\"l1\"", "Test_Right.Id=\"r1\"", "Test_RightSpecial.Id=\"s1\""));
    EXPECT_THAT(names(selected("SELECT * FROM Test_Base WHERE Test_Base ISA Test_Right")),
                ElementsAre("Test_Right.Id=\"r1\"", "Test_RightSpecial.Id=\"s1\""));
    const auto narrow = selected("SELECT Note FROM Test_Left WHERE Id = 'l1'");
    ASSERT_EQ(narrow.size(), 1U);
    ASSERT_EQ(narrow.front()->properties.size(), 1U);
    EXPECT_EQ(narrow.front()->properties.front().name, "Note");
}

TEST_F(InstanceRequests, QueriesOfWhatThereIsNotAreRefused) {
    const auto status = [this](const std::string& nameSpace, const std::string& text) {
        CollectedObjects<Instance> found;
        const RequestEnd end = manager.execQuery(nameSpace, Query::parse("WQL", text), {}, found);
        EXPECT_TRUE(found.objects.empty());
        return end.status.code;
    };
    EXPECT_EQ(status("root/no", "SELECT * FROM Nobody_Knows"), CMPI_RC_ERR_INVALID_NAMESPACE);
    EXPECT_EQ(status("root/test", "SELECT * FROM Nobody_Knows"), CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(status("root/test", "SELECT Colour FROM Test_Left"), CMPI_RC_ERR_INVALID_QUERY);
}

}  // namespace
}  // namespace cimom::test
