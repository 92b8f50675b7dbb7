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

class StrictHostTest : public ::testing::Test {
  protected:
    /// Runs `call` as a provider would, and gives what was noted.
    std::vector<std::string> noted(ResultObject::Kind kind, const StrictHost::Call& call) {
        host_.request(kind, {"", "root/cimv2", "QVXZR_DHCPCapabilities", {}}, call);
        return strict::violations().take();
    }

    CMPIValue text(const char* characters) const {
        CMPIValue value{};
        value.string = broker_->eft->newString(broker_, characters, nullptr);
        return value;
    }

    static constexpr CMPIStatus ok{CMPI_RC_OK, nullptr};

    // Without registrations, and so without providers.
    StrictHost host_{ZR_SOURCE_DIR "/schema", {}, ZR_BINARY_DIR "/lib/cmpi"};
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

}  // namespace
