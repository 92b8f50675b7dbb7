// Both provider libraries in an object manager that forgives nothing, compared with
// what the embedded object manager gives for the same machine.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <fstream>
#include <iterator>
#include <memory>
#include <thread>

#include "HostRequests.h"
#include "cimom/ObjectPathText.h"
#include "cimom/Results.h"
#include "kit/StrictHost.h"
#include "kit/Tree.h"

namespace {

using strict::HostRequest;
using strict::Operation;
using strict::StrictHost;
using strict::Texts;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

constexpr const char* hosted = "QVXZR_HostedDHCPPoint";
const std::string schemaDirectory = ZR_SOURCE_DIR "/schema";
const std::string libraryDirectory = ZR_BINARY_DIR "/lib/cmpi";
const std::vector<std::string> registrationFiles{
    schemaDirectory + "/exact/DHCPClientProvider.registration",
    schemaDirectory + "/exact/DHCPClientNeighbours.registration"};

class ProvidersInAStrictHostTest : public test::TreeTest,
                                   public ::testing::WithParamInterface<strict::NamedTraits> {
  protected:
    struct Expectation {
        HostRequest request;
        Texts response;
    };

    static void setMachine() {
        const auto with = [](test::Json node, const char* address) {
            node["properties"]["IPv4Address"] = address;
            return node;
        };
        setTree(
            {test::host(
                 {with(test::dhcpInterface("eth0", {"192.0.2.1"}), "192.0.2.10"),
                  with(test::dhcpInterface("eth1", {"192.0.2.1", "2001:db8::1"}), "192.0.2.11"),
                  test::dhcpInterface("eth2"), with(test::staticInterface("eth3"), "192.0.2.13")}),
             test::serviceProcessor(
                 {with(test::dhcpInterface("bmc0", {"192.0.2.1"}), "192.0.2.20")})});
        std::ofstream(dataDirectory() + "ifcfg-eth0") << "NAME=office\n";
    }

    static std::unique_ptr<cimom::ObjectManager> manage() {
        return std::make_unique<cimom::ObjectManager>(
            cimom::Configuration{{schemaDirectory},
                                 {registrationFiles[0], registrationFiles[1]},
                                 {libraryDirectory},
                                 ""});
    }

    void SetUp() override {
        setMachine();
        static_cast<void>(strict::violations().take());
    }

    /// What the embedded object manager responds. It has to be gone before the host comes:
    /// a library knows one broker only.
    static std::vector<Expectation> expectations() {
        setMachine();
        std::vector<Expectation> all;
        const auto manager = manage();
        for (HostRequest& request : strict::allRequests(*manager)) {
            Texts response = strict::ask(*manager, request);
            all.push_back({std::move(request), std::move(response)});
        }
        return all;
    }

    static void SetUpTestSuite() { expected_ = expectations(); }

    void TearDown() override { EXPECT_THAT(strict::violations().take(), IsEmpty()); }

    static StrictHost makeHost(const std::string& schema = schemaDirectory) {
        return {schema, registrationFiles, libraryDirectory, GetParam().traits};
    }

    static void expectTheSame(StrictHost& host) {
        for (const Expectation& one : expected_) {
            EXPECT_EQ(strict::ask(host, one.request), one.response) << one.request.name();
        }
    }

    /// Whether the neighbours are asked themselves.
    static bool givesNeighbours(const StrictHost& host, const HostRequest& request) {
        const auto& all = host.registrations();
        return (request.operation == Operation::enumerate || request.operation == Operation::get) &&
               std::any_of(all.begin(), all.end(), [&](const cimom::Registration& each) {
                   return each.provider == "DHCPClientNeighbours" &&
                          host.repository().isA(each.className, request.path.className);
               });
    }

    /// The paths that the requests get.
    std::vector<cimom::ObjectPath> paths() const {
        std::vector<cimom::ObjectPath> all;
        for (const Expectation& one : expected_) {
            if (one.request.operation == Operation::get) {
                all.push_back(one.request.path);
            }
        }
        return all;
    }

    /// Every operation with a path that no well-behaved client sends; what comes of it
    /// is the provider's, as long as it does nothing that is noted.
    static void survives(StrictHost& host, const cimom::ObjectPath& path) {
        host.enumerateNames(path);
        host.enumerate(path);
        host.get(path);
        host.modify({path, {{"ConfigurationName", cimom::Value::ofString("new")}}});
        for (const char* association : {static_cast<const char*>(nullptr), "CIM_Dependency", hosted,
                                        "QVXZR_DHCPElementSettingData", ""}) {
            const StrictHost::Filter filter{association, nullptr, nullptr, nullptr};
            host.associatorNames(path, filter);
            host.associators(path, filter);
            host.referenceNames(path, filter);
            host.references(path, filter);
        }
        for (const std::string& text : strict::violations().take()) {
            // See AReferenceOfAnEndpointThatThereIsNotLacksItsKey.
            EXPECT_THAT(text, HasSubstr("without Dependent is delivered: root/cimv2:" +
                                        std::string(hosted) + "."))
                << cimom::toText(path);
        }
    }

    static void put(cimom::ObjectPath& path, const char* name, const cimom::Value& value) {
        for (cimom::NamedValue& key : path.keys) {
            if (key.name == name) {
                key.value = value;
            }
        }
    }

    static inline std::vector<Expectation> expected_;
};

TEST_P(ProvidersInAStrictHostTest, AnswerEveryRequestAsInTheEmbeddedObjectManager) {
    ASSERT_GT(expected_.size(), 500U);
    StrictHost host = makeHost();
    expectTheSame(host);
}

TEST_P(ProvidersInAStrictHostTest, AnswerTheSameOverTheFullSchemaWithItsDefaults) {
    StrictHost host = makeHost(strict::wholeSchema);
    expectTheSame(host);
}

TEST_P(ProvidersInAStrictHostTest, AnswerTheSameWhateverThePropertyListButForNeighbours) {
    StrictHost host = makeHost();
    const char* none[] = {nullptr};
    const char* some[] = {"Name", "NoSuchProperty", nullptr};
    for (const char** properties : {static_cast<const char**>(none), some}) {
        for (const Expectation& one : expected_) {
            if (!givesNeighbours(host, one.request)) {
                EXPECT_EQ(strict::ask(host, one.request, properties), one.response)
                    << one.request.name();
            }
        }
    }
}

TEST_P(ProvidersInAStrictHostTest, AreUnloadedWhenIdleAndAnswerTheSameWhenLoadedAgain) {
    StrictHost host = makeHost();
    for (int round = 0; round < 3; ++round) {
        for (std::size_t i = 0; i < expected_.size(); i += 7) {
            EXPECT_EQ(strict::ask(host, expected_[i].request), expected_[i].response)
                << expected_[i].request.name();
        }
        EXPECT_TRUE(host.unload()) << "a library stays in the process";
        host.load();
    }
}

TEST_P(ProvidersInAStrictHostTest, AnswerManyThreadsAtOnce) {
    StrictHost host = makeHost();
    std::atomic<int> wrong = 0;
    std::vector<std::thread> threads;
    constexpr std::size_t threadCount = 8;
    for (std::size_t number = 0; number < threadCount; ++number) {
        threads.emplace_back([&, number] {
            // Each asks a third of all, and all ask different things at a time.
            for (std::size_t at = number % 3; at < expected_.size(); at += 3) {
                const Expectation& one = expected_[at];
                if (strict::ask(host, one.request) != one.response) {
                    ++wrong;
                }
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(wrong, 0);
}

TEST_P(ProvidersInAStrictHostTest, ChangeWhatTheyChangeInTheEmbeddedObjectManager) {
    const auto changed = [](const cimom::ObjectPath& path) {
        return cimom::Instance{path, {{"ConfigurationName", cimom::Value::ofString("new")}}};
    };
    std::vector<CMPIrc> codes;
    std::vector<Texts> contents;
    auto manager = manage();
    for (const cimom::ObjectPath& path : paths()) {
        codes.push_back(manager->modifyInstance(changed(path)).status.code);
        contents.push_back(strict::ask(*manager, {Operation::get, path, ""}));
    }
    manager.reset();
    setMachine();
    StrictHost host = makeHost();
    std::size_t at = 0;
    for (const cimom::ObjectPath& path : paths()) {
        EXPECT_EQ(host.modify(changed(path)).code, codes[at]) << cimom::toText(path);
        EXPECT_EQ(strict::ask(host, {Operation::get, path, ""}), contents[at]);
        ++at;
    }
    const cimom::ObjectPath eth0 =
        cimom::parseObjectPath("root/cimv2:QVXZR_DHCPSettingData.InstanceID=\"Computer%eth0\"");
    const StrictHost::Response response = host.get(eth0);
    ASSERT_EQ(response.instances.size(), 1U);
    EXPECT_EQ(*response.instances[0].property("ConfigurationName"), cimom::Value::ofString("new"));
}

TEST_P(ProvidersInAStrictHostTest, AReferenceOfAnEndpointThatThereIsNotLacksItsKey) {
    StrictHost host = makeHost();
    for (const cimom::ObjectPath& path : paths()) {
        if (path.className != "QVXZR_DHCPProtocolEndpoint") {
            continue;
        }
        cimom::ObjectPath nobody = path;
        put(nobody, "Name", cimom::Value::ofString(""));
        EXPECT_EQ(host.referenceNames(nobody, {hosted, nullptr, nullptr, nullptr}).paths.size(),
                  1U);
        EXPECT_THAT(strict::violations().take(),
                    ElementsAre(HasSubstr("A path without Dependent is delivered")));
    }
}

TEST_P(ProvidersInAStrictHostTest, SurviveANumberAsTheNewConfigurationName) {
    StrictHost host = makeHost();
    cimom::Value number;
    number.type = cimom::Type::uint64;
    number.content = cimom::Scalar(std::uint64_t{7});
    for (const cimom::ObjectPath& path : paths()) {
        host.modify({path, {{"ConfigurationName", number}}});
        host.modify(
            {path, {{"ConfigurationName", cimom::Value::null(cimom::Type::string, false)}}});
        host.modify({path, {}});
    }
}

TEST_P(ProvidersInAStrictHostTest, RefuseToCreateDeleteAndQuery) {
    StrictHost host = makeHost();
    for (const cimom::ObjectPath& path : paths()) {
        EXPECT_EQ(host.create({path, {}}).code, CMPI_RC_ERR_NOT_SUPPORTED);
        EXPECT_EQ(host.remove(path).code, CMPI_RC_ERR_NOT_SUPPORTED);
        EXPECT_EQ(host.query(path, "SELECT * FROM CIM_System", "WQL").code,
                  CMPI_RC_ERR_NOT_SUPPORTED);
    }
}

TEST_P(ProvidersInAStrictHostTest, OfferNoOtherKindsOfProviders) {
    StrictHost host = makeHost();
    for (const char* name : {"DHCPClientProvider", "DHCPClientNeighbours"}) {
        for (const std::string kind : {"Method", "Property", "Indication"}) {
            EXPECT_EQ(host.symbol(name, name + ("_Create_" + kind + "MI")), nullptr);
            EXPECT_EQ(host.symbol(name, "_Generic_Create_" + kind + "MI"), nullptr);
        }
        EXPECT_EQ(host.symbol(name, "_Generic_Create_InstanceMI"), nullptr);
    }
}

TEST_P(ProvidersInAStrictHostTest, ReferencesWithoutTheAssociationsOwnNameAreRefused) {
    StrictHost host = makeHost();
    for (const cimom::ObjectPath& path : paths()) {
        for (const char* name : {static_cast<const char*>(nullptr), "CIM_Dependency"}) {
            EXPECT_EQ(host.referenceNames(path, {name, nullptr, nullptr, nullptr}).code,
                      CMPI_RC_ERR_INVALID_CLASS);
            EXPECT_EQ(host.references(path, {name, nullptr, nullptr, nullptr}).code,
                      CMPI_RC_ERR_INVALID_CLASS);
        }
    }
}

TEST_P(ProvidersInAStrictHostTest, SurviveKeysOfOtherTypesAndNullKeys) {
    StrictHost host = makeHost();
    cimom::Value number;
    number.type = cimom::Type::uint64;
    number.content = cimom::Scalar(std::uint64_t{4});
    cimom::Value truth;
    truth.type = cimom::Type::boolean;
    truth.content = cimom::Scalar(true);
    const cimom::Value null = cimom::Value::null(cimom::Type::string, false);
    for (const cimom::ObjectPath& path : paths()) {
        for (const cimom::Value& value : {number, truth, null, cimom::Value::ofString("")}) {
            cimom::ObjectPath all = path;
            for (cimom::NamedValue& key : all.keys) {
                key.value = value;
            }
            survives(host, all);
        }
        for (std::size_t i = 0; i < path.keys.size(); ++i) {
            cimom::ObjectPath one = path;
            one.keys[i].value = i % 2 == 0 ? number : null;
            survives(host, one);
        }
    }
}

TEST_P(ProvidersInAStrictHostTest, SurviveMissingExtraAndOddKeysAndClasses) {
    StrictHost host = makeHost();
    for (const cimom::ObjectPath& path : paths()) {
        for (std::size_t i = 0; i < path.keys.size(); ++i) {
            cimom::ObjectPath fewer = path;
            fewer.keys.erase(fewer.keys.begin() + static_cast<std::ptrdiff_t>(i));
            survives(host, fewer);
        }
        cimom::ObjectPath more = path;
        more.keys.push_back({"Extra", cimom::Value::ofString("key")});
        survives(host, more);
        cimom::ObjectPath bare = path;
        bare.keys.clear();
        survives(host, bare);
        cimom::ObjectPath nowhere = path;
        nowhere.nameSpace.clear();
        host.get(nowhere);
        // What is made from it has no namespace, either.
        for (const std::string& text : strict::violations().take()) {
            EXPECT_THAT(text, HasSubstr("without namespace"));
        }
        cimom::ObjectPath unknown = path;
        unknown.className = "No_Such_Class";
        survives(host, unknown);
    }
}

TEST_P(ProvidersInAStrictHostTest, KeysInLowerCaseNameTheSameInstance) {
    StrictHost host = makeHost();
    for (const Expectation& one : expected_) {
        HostRequest request = one.request;
        for (cimom::NamedValue& key : request.path.keys) {
            std::transform(key.name.begin(), key.name.end(), key.name.begin(), [](char letter) {
                return static_cast<char>(std::tolower(static_cast<unsigned char>(letter)));
            });
        }
        EXPECT_EQ(strict::ask(host, request), one.response) << request.name();
    }
}

/// The traits that these libraries bear: they hand over more than one instance for a
/// name, and leave properties unset that a superclass gives a default.
std::vector<strict::NamedTraits> borneTraits() {
    std::vector<strict::NamedTraits> borne;
    for (const strict::NamedTraits& each : strict::testedTraits()) {
        if (!each.traits.firstInstance && !each.traits.parentsDefaults) {
            borne.push_back(each);
        }
    }
    return borne;
}

INSTANTIATE_TEST_SUITE_P(With, ProvidersInAStrictHostTest, ::testing::ValuesIn(borneTraits()),
                         [](const auto& each) { return each.param.name; });

}  // namespace
