// What the strict host notices, and what it forgives.
#include "kit/StrictHost.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace {

using strict::ResultObject;
using strict::StrictHost;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

constexpr const char* capabilities = "QVXZR_DHCPCapabilities";

class StrictHostTest : public ::testing::Test {
  protected:
    /// Runs `call` as a provider would, and gives what was noted.
    std::vector<std::string> noted(ResultObject::Kind kind, const StrictHost::Call& call) {
        host_.request(kind, {"", "root/cimv2", capabilities, {}}, call);
        return strict::violations().take();
    }

    CMPIValue text(const char* characters) const {
        CMPIValue value{};
        value.string = broker_->eft->newString(broker_, characters, nullptr);
        return value;
    }

    static constexpr CMPIStatus ok{CMPI_RC_OK, nullptr};

    /// Without registrations, and so without providers.
    static StrictHost makeHost(const strict::Traits& traits = {},
                               const std::string& schema = ZR_SOURCE_DIR "/schema") {
        return {schema, {}, ZR_BINARY_DIR "/lib/cmpi", traits};
    }

    StrictHost host_ = makeHost();
    const CMPIBroker* broker_ = host_.broker();
};

TEST_F(StrictHostTest, ANullDeliveredIsNoted) {
    EXPECT_THAT(noted(ResultObject::Kind::paths,
                      [](auto*, auto* result, auto*) {
                          result->ft->returnObjectPath(result, nullptr);
                          return ok;
                      }),
                ElementsAre("returnObjectPath was given no object"));
    EXPECT_THAT(noted(ResultObject::Kind::instances,
                      [](auto*, auto* result, auto*) {
                          result->ft->returnInstance(result, nullptr);
                          return ok;
                      }),
                ElementsAre("returnInstance was given no object"));
}

TEST_F(StrictHostTest, ASecondCloseAndADeliveryAfterACloseAreNoted) {
    EXPECT_THAT(noted(ResultObject::Kind::nothing,
                      [](auto*, auto* result, auto*) {
                          result->ft->returnDone(result);
                          result->ft->returnDone(result);
                          return ok;
                      }),
                ElementsAre("returnDone came after returnDone"));
}

TEST_F(StrictHostTest, AValueOfAnotherTypeThanDeclaredIsNoted) {
    EXPECT_THAT(
        noted(ResultObject::Kind::nothing,
              [&](auto*, auto*, auto* path) {
                  CMPIInstance* instance = broker_->eft->newInstance(broker_, path, nullptr);
                  CMPIValue number{};
                  number.uint32 = 7;
                  instance->ft->setProperty(instance, "MaxElementNameLen", &number, CMPI_uint32);
                  return ok;
              }),
        ElementsAre(HasSubstr("QVXZR_DHCPCapabilities.MaxElementNameLen has another")));
}

TEST_F(StrictHostTest, APathWithoutItsKeysIsNotedWhenItIsDelivered) {
    EXPECT_THAT(noted(ResultObject::Kind::paths,
                      [](auto*, auto* result, auto* path) {
                          result->ft->returnObjectPath(result, path);
                          return ok;
                      }),
                ElementsAre(HasSubstr("A path without InstanceID is delivered")));
}

TEST_F(StrictHostTest, AnObjectOfARequestThatHasEndedIsNoted) {
    const CMPIObjectPath* kept = nullptr;
    EXPECT_THAT(noted(ResultObject::Kind::nothing,
                      [&](auto*, auto*, auto* path) {
                          kept = path;
                          return ok;
                      }),
                IsEmpty());
    EXPECT_EQ(strict::RequestObjects::get<strict::PathObject>(kept, "getKey"), nullptr);
    EXPECT_THAT(strict::violations().take(),
                ElementsAre("getKey was given a dead or foreign object"));
}

TEST_F(StrictHostTest, NullArgumentsOfTheBrokersFunctionsAreNoted) {
    EXPECT_THAT(noted(ResultObject::Kind::nothing,
                      [&](auto* context, auto*, auto* path) {
                          broker_->eft->newString(broker_, nullptr, nullptr);
                          broker_->eft->newObjectPath(broker_, nullptr, "CIM_System", nullptr);
                          broker_->eft->newInstance(broker_, nullptr, nullptr);
                          broker_->eft->classPathIsA(broker_, path, nullptr, nullptr);
                          broker_->bft->getInstance(broker_, nullptr, path, nullptr, nullptr);
                          broker_->bft->enumerateInstances(broker_, context, nullptr, nullptr,
                                                           nullptr);
                          return ok;
                      }),
                ::testing::SizeIs(6));
}

TEST_F(StrictHostTest, AFineAnswerIsNotNoted) {
    EXPECT_THAT(noted(ResultObject::Kind::instances,
                      [&](auto*, auto* result, auto*) {
                          CMPIObjectPath* path = broker_->eft->newObjectPath(
                              broker_, "root/cimv2", "QVXZR_DHCPCapabilities", nullptr);
                          const CMPIValue id = text("eth0");
                          path->ft->addKey(path, "InstanceID", &id, CMPI_string);
                          CMPIInstance* instance =
                              broker_->eft->newInstance(broker_, path, nullptr);
                          result->ft->returnInstance(result, instance);
                          result->ft->returnDone(result);
                          return ok;
                      }),
                IsEmpty());
}

TEST_F(StrictHostTest, NoValueIsTheNullOfAProperty) {
    StrictHost::Response response = host_.request(
        ResultObject::Kind::instances, {"", "root/cimv2", capabilities, {}},
        [&](auto*, auto* result, auto*) {
            CMPIObjectPath* path =
                broker_->eft->newObjectPath(broker_, "root/cimv2", capabilities, nullptr);
            const CMPIValue id = text("eth0");
            path->ft->addKey(path, "InstanceID", &id, CMPI_string);
            CMPIInstance* instance = broker_->eft->newInstance(broker_, path, nullptr);
            instance->ft->setProperty(instance, "ElementName", nullptr, CMPI_string);
            EXPECT_EQ(instance->ft->getPropertyCount(instance, nullptr), 1U);
            const CMPIData data = instance->ft->getPropertyAt(instance, 0, nullptr, nullptr);
            EXPECT_EQ(data.state, CMPI_nullValue);
            result->ft->returnInstance(result, instance);
            return ok;
        });
    EXPECT_THAT(strict::violations().take(), IsEmpty());
    ASSERT_EQ(response.instances.size(), 1U);
    ASSERT_NE(response.instances[0].property("ElementName"), nullptr);
    EXPECT_TRUE(response.instances[0].property("ElementName")->isNull());
}

TEST_F(StrictHostTest, TheMessageOfAStatusIsPartOfTheResponse) {
    const StrictHost::Response response =
        host_.request(ResultObject::Kind::nothing, {"", "root/cimv2", capabilities, {}},
                      [&](auto*, auto*, auto*) {
                          return CMPIStatus{CMPI_RC_ERR_FAILED, text("a reason").string};
                      });
    EXPECT_EQ(response.code, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(response.message, "a reason");
}

// The traits.

TEST_F(StrictHostTest, DeclaredKeysAreCountedAndMustNotBeAskedForByName) {
    const auto look = [](auto*, auto*, const CMPIObjectPath* path) {
        EXPECT_EQ(path->ft->getKeyCount(path, nullptr), 1U);
        CMPIString* name = nullptr;
        CMPIStatus status{CMPI_RC_ERR_FAILED, nullptr};
        EXPECT_EQ(path->ft->getKeyAt(path, 0, &name, &status).state, CMPI_nullValue);
        EXPECT_EQ(status.rc, CMPI_RC_OK);
        EXPECT_STREQ(name->ft->getCharPtr(name, nullptr), "InstanceID");
        path->ft->getKey(path, "InstanceID", nullptr);
        return ok;
    };
    StrictHost declaring = makeHost({.declaredKeys = true});
    declaring.request(ResultObject::Kind::nothing, {"", "root/cimv2", capabilities, {}}, look);
    EXPECT_THAT(strict::violations().take(),
                ElementsAre("getKey reads out of bounds: the path has no InstanceID"));
    EXPECT_THAT(noted(ResultObject::Kind::nothing,
                      [](auto*, auto*, const CMPIObjectPath* path) {
                          EXPECT_EQ(path->ft->getKeyCount(path, nullptr), 0U);
                          path->ft->getKey(path, "InstanceID", nullptr);
                          return ok;
                      }),
                IsEmpty());
}

TEST_F(StrictHostTest, DefaultsOfParentsAreShownWhereNullIsNoInitialiser) {
    const auto shown = [](StrictHost& host) {
        StrictHost::Response response = host.request(
            ResultObject::Kind::instances, {"", "root/cimv2", capabilities, {}},
            [&host](auto*, auto* result, auto*) {
                const CMPIBroker* broker = host.broker();
                const CMPIObjectPath* path = broker->eft->newObjectPath(
                    broker, "root/cimv2", "QVXZR_DHCPProtocolEndpoint", nullptr);
                result->ft->returnInstance(result, broker->eft->newInstance(broker, path, nullptr));
                return ok;
            });
        // Its keys are not what this is about.
        EXPECT_THAT(strict::violations().take(), ::testing::SizeIs(4));
        const cimom::Value* value = response.instances.at(0).property("RequestedState");
        const cimom::Scalar* scalar = value == nullptr ? nullptr : value->scalar();
        return scalar == nullptr ? 0U : std::get<std::uint64_t>(*scalar);
    };
    StrictHost parents = makeHost({.parentsDefaults = true}, strict::wholeSchema);
    EXPECT_EQ(shown(parents), 12U);
    StrictHost plain = makeHost({}, strict::wholeSchema);
    EXPECT_EQ(shown(plain), 0U);
}

TEST_F(StrictHostTest, TheBrokerTellsItsVersionOrNone) {
    const StrictHost telling = makeHost({.tellsItsVersion = true});
    EXPECT_EQ(telling.broker()->bft->brokerVersion, 200);
    EXPECT_EQ(broker_->bft->brokerVersion, 0);
}

}  // namespace
