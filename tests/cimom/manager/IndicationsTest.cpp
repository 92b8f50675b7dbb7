// Filters and indications between subscribers and providers.

#include <cmpift.h>
#include <dlfcn.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <cstdlib>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "cimom/Indications.h"
#include "cimom/Instance.h"
#include "cimom/ObjectManager.h"
#include "kit/Files.h"
#include "kit/TestManager.h"

namespace cimom::test {
namespace {

using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

/// Gets indications, by their identifiers.
class Received {
  public:
    IndicationReceiver receiver() {
        return [this](const Indication& indication) {
            const std::lock_guard lock(mutex_);
            all_.push_back(indication);
        };
    }
    std::vector<Indication> all() const {
        const std::lock_guard lock(mutex_);
        return all_;
    }
    std::vector<std::string> identifiers() const {
        std::vector<std::string> texts;
        for (const Indication& each : all()) {
            texts.push_back(textOf(each.instance, "IndicationIdentifier"));
        }
        return texts;
    }

  private:
    mutable std::mutex mutex_;
    std::vector<Indication> all_;
};

class Indications : public testing::Test {
  protected:
    /// A section for each "CLASS PROVIDER".
    void start(const std::vector<std::pair<std::string, std::string>>& sections,
               const std::string& nameSpaces = "root/cimv2 root/interop") {
        std::string text;
        for (const auto& [className, provider] : sections) {
            text += "[" + className + "]\nprovider: " + provider +
                    "\nlocation: TellingProvider\ntype: indication\nnamespace: " + nameSpaces +
                    "\n";
        }
        const std::string file = (directory_.path() / "telling.reg").string();
        ZR::Testing::writeFile(file, text);
        Configuration configuration{
            {ZR_SOURCE_DIR "/schema"}, {file}, {BROKER_PROVIDER_DIR}, "testhost"};
        configuration.log = [this](const std::string& line) {
            const std::lock_guard lock(mutex_);
            log_.push_back(line);
        };
        manager_ = std::make_unique<ObjectManager>(std::move(configuration));
    }

    IndicationActivation activate(const std::string& query, IndicationReceiver receiver,
                                  const std::vector<std::string>& nameSpaces = {"root/cimv2"}) {
        return manager_->indications().activate(
            {.query = query, .sourceNameSpaces = nameSpaces, .owner = "ann"}, std::move(receiver));
    }
    CMPIrc refused(const std::string& query,
                   const std::vector<std::string>& nameSpaces = {"root/cimv2"}) {
        const IndicationActivation activation = activate(
            query, [](const auto&) {}, nameSpaces);
        EXPECT_FALSE(activation.subscription.active());
        return activation.status.code;
    }

    template <typename Function>
    Function function(const char* name) {
        return reinterpret_cast<Function>(dlsym(library_.get(), name));
    }
    std::string calls() { return function<const char* (*)()>("tellingTakeCalls")(); }
    CMPIrc tell(const char* className, const char* identifier,
                const char* nameSpace = "root/cimv2") {
        return function<CMPIrc (*)(const char*, const char*, const char*)>("tellingTell")(
            nameSpace, className, identifier);
    }
    std::vector<std::string> log() {
        const std::lock_guard lock(mutex_);
        return log_;
    }

    const Library library_{dlopen(BROKER_PROVIDER_DIR "/libTellingProvider.so", RTLD_NOW), dlclose};
    ZR::Testing::TemporaryDirectory directory_;
    std::mutex mutex_;
    std::vector<std::string> log_;
    std::unique_ptr<ObjectManager> manager_;
    Received received_;
};

TEST_F(Indications, ProviderIsCalledInOrderAndWithWhatItNeeds) {
    start({{"CIM_InstCreation", "Plain"}});
    calls();
    auto one = activate("SELECT * FROM CIM_InstCreation", received_.receiver());
    ASSERT_EQ(one.status, Status{});
    EXPECT_TRUE(one.subscription.active());
    EXPECT_EQ(calls(),
              "Plain.authorize(SELECT * FROM CIM_InstCreation,CIM_InstCreation,root/cimv2,ann) "
              "Plain.activate(first) Plain.enable ");
    auto two = activate("SELECT * FROM CIM_InstCreation WHERE IndicationIdentifier = 'x'",
                        received_.receiver());
    EXPECT_THAT(calls(), AllOf(HasSubstr("Plain.activate "), Not(HasSubstr("enable"))));
    one.subscription.end();
    EXPECT_EQ(calls(), "Plain.deActivate ");
    two.subscription.end();
    EXPECT_EQ(calls(), "Plain.deActivate(last) Plain.disable ");
    manager_.reset();
    EXPECT_EQ(calls(), "Plain.cleanup ");
}

TEST_F(Indications, MissingFunctionsHaveNothingAgainstAFilter) {
    start({{"CIM_InstCreation", "Bare"}});
    auto active = activate("SELECT * FROM CIM_InstCreation", received_.receiver());
    EXPECT_EQ(active.status, Status{});
    EXPECT_EQ(tell("CIM_InstCreation", "told"), CMPI_RC_OK);
    EXPECT_THAT(received_.identifiers(), ElementsAre("told"));
    active.subscription.end();
    EXPECT_EQ(tell("CIM_InstCreation", "late"), CMPI_RC_OK) << "there may be other filters";
    EXPECT_THAT(received_.identifiers(), ElementsAre("told"));
    EXPECT_THAT(log(), IsEmpty());
}

TEST_F(Indications, AnIndicationIsTakenWithItsEmbeddedInstanceAndItsNamespace) {
    start({{"CIM_InstCreation", "Plain"}});
    const auto active = activate("SELECT * FROM CIM_InstCreation", received_.receiver());
    tell("CIM_InstCreation", "told");
    ASSERT_EQ(received_.all().size(), 1U);
    const Instance indication = received_.all().front().instance;
    EXPECT_EQ(indication.path.nameSpace, "root/cimv2");
    EXPECT_EQ(indication.path.className, "CIM_InstCreation");
    const auto& source =
        std::get<std::shared_ptr<const Instance>>(scalarOf(indication.property("SourceInstance")));
    EXPECT_EQ(source->path.className, "CIM_ProtocolEndpoint");
    EXPECT_EQ(textOf(*source, "Name"), "told");
}

TEST_F(Indications, AFilterSelectsByClassConditionAndNamespace) {
    start({{"CIM_InstCreation", "Plain"}, {"CIM_InstDeletion", "Plain"}});
    Received creations;
    Received named;
    Received interop;
    const auto all = activate("SELECT * FROM CIM_InstIndication", received_.receiver());
    const auto one = activate("SELECT * FROM CIM_InstCreation", creations.receiver());
    const auto two = activate(
        "SELECT IndicationIdentifier FROM CIM_InstIndication WHERE SourceInstance ISA "
        "CIM_ServiceAccessPoint AND SourceInstance.Name = 'b'",
        named.receiver());
    const auto three =
        activate("SELECT * FROM CIM_InstIndication", interop.receiver(), {"root/interop"});
    ASSERT_TRUE(all.status.ok() && one.status.ok() && two.status.ok() && three.status.ok());
    tell("CIM_InstCreation", "a");
    tell("CIM_InstDeletion", "b");
    tell("CIM_InstDeletion", "c", "root/interop");
    EXPECT_THAT(received_.identifiers(), ElementsAre("a", "b"));
    EXPECT_THAT(creations.identifiers(), ElementsAre("a"));
    EXPECT_THAT(named.identifiers(), ElementsAre("b"));
    EXPECT_EQ(named.all().front().instance.properties.size(), 1U) << "the selected one alone";
    EXPECT_THAT(interop.identifiers(), ElementsAre("c"));
}

TEST_F(Indications, AClassAboveThoseOfAProviderIsOneCallForEachNamespace) {
    start({{"CIM_InstCreation", "Plain"}, {"CIM_InstDeletion", "Plain"}});
    calls();
    auto active = activate("SELECT * FROM CIM_Indication", received_.receiver(),
                           {"root/cimv2", "ROOT/interop/"});
    ASSERT_EQ(active.status, Status{});
    const std::string made = calls();
    EXPECT_THAT(made, HasSubstr("CIM_Indication,root/cimv2,ann) Plain.activate(first) "
                                "Plain.enable Plain.authorize("));
    EXPECT_THAT(made, HasSubstr("CIM_Indication,root/interop,ann) Plain.activate(first) "));
    active.subscription.end();
    EXPECT_EQ(calls(), "Plain.deActivate(last) Plain.deActivate(last) Plain.disable ");
}

TEST_F(Indications, WhatIsNotAFilterIsRefusedBeforeAnyProviderIsAsked) {
    start({{"CIM_InstCreation", "Plain"}});
    calls();
    EXPECT_EQ(refused("SELECT"), CMPI_RC_ERR_INVALID_QUERY);
    EXPECT_EQ(refused("SELECT * FROM CIM_System"), CMPI_RC_ERR_INVALID_QUERY);
    EXPECT_EQ(refused("SELECT Nothing FROM CIM_InstCreation"), CMPI_RC_ERR_INVALID_QUERY);
    EXPECT_EQ(refused("SELECT * FROM No_Class"), CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(refused("SELECT * FROM CIM_InstCreation", {"root/nowhere"}),
              CMPI_RC_ERR_INVALID_NAMESPACE);
    EXPECT_EQ(refused("SELECT * FROM CIM_InstCreation", {}), CMPI_RC_ERR_INVALID_NAMESPACE);
    EXPECT_EQ(refused("SELECT * FROM CIM_InstDeletion"), CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(manager_->indications()
                  .activate({.query = "SELECT * FROM CIM_InstCreation",
                             .queryLanguage = "Latin",
                             .sourceNameSpaces = {"root/cimv2"}},
                            received_.receiver())
                  .status.code,
              CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED);
    EXPECT_EQ(calls(), "");
}

TEST_F(Indications, ARefusalOfEveryProviderIsTheSubscribers) {
    start({{"CIM_InstCreation", "Refusing"}, {"CIM_InstDeletion", "Failing"}});
    calls();
    EXPECT_EQ(refused("SELECT * FROM CIM_InstCreation"), CMPI_RC_ERR_ACCESS_DENIED);
    EXPECT_EQ(refused("SELECT * FROM CIM_InstDeletion"), CMPI_RC_ERR_FAILED);
    EXPECT_THAT(calls(), AllOf(Not(HasSubstr("enable")), Not(HasSubstr("deActivate"))));
    EXPECT_EQ(tell("CIM_InstCreation", "told"), CMPI_RC_OK);
    EXPECT_THAT(received_.identifiers(), IsEmpty());
}

TEST_F(Indications, OneProviderThatAcceptsIsEnough) {
    start({{"CIM_InstCreation", "Throwing"},
           {"CIM_InstDeletion", "Plain"},
           {"CIM_InstModification", "Refusing"}});
    auto active = activate("SELECT * FROM CIM_InstIndication", received_.receiver());
    EXPECT_EQ(active.status, Status{});
    EXPECT_THAT(log(), testing::Contains(HasSubstr("Throwing: activateFilter threw")));
    calls();
    active.subscription.end();
    EXPECT_EQ(calls(), "Plain.deActivate(last) Plain.disable ");
}

TEST_F(Indications, AProviderMayTellFromWithinEachOfItsFunctions) {
    start({{"CIM_InstCreation", "Eager"}});
    auto active = activate("SELECT * FROM CIM_InstCreation", received_.receiver());
    ASSERT_EQ(active.status, Status{});
    EXPECT_THAT(received_.identifiers(), ElementsAre("activate(first)", "enable"));
    active.subscription.end();
    manager_.reset();
    EXPECT_EQ(received_.all().size(), 2U) << "and is heard while the filter is active only";
}

TEST_F(Indications, ThreadsOfAProviderAttachTellAndDetach) {
    start({{"CIM_InstDeletion", "Plain"}});
    const auto active = activate("SELECT * FROM CIM_InstDeletion", received_.receiver());
    std::string identifier = "from a thread";
    void* told = nullptr;
    std::thread thread(
        [&] { told = function<void* (*)(void*)>("tellingThread")(identifier.data()); });
    thread.join();
    EXPECT_EQ(told, identifier.data());
    EXPECT_THAT(received_.identifiers(), ElementsAre("from a thread"));
}

TEST_F(Indications, WhatAReceiverThrowsIsItsOwnLoss) {
    start({{"CIM_InstCreation", "Plain"}});
    const auto bad = activate("SELECT * FROM CIM_InstCreation",
                              [](const Indication&) { throw std::runtime_error("no room"); });
    const auto good = activate("SELECT * FROM CIM_InstCreation", received_.receiver());
    EXPECT_EQ(tell("CIM_InstCreation", "told"), CMPI_RC_OK);
    EXPECT_THAT(received_.identifiers(), ElementsAre("told"));
    EXPECT_THAT(log(), testing::Contains(HasSubstr("no room")));
}

TEST_F(Indications, TheEndOfTheManagerEndsActiveFilters) {
    start({{"CIM_InstCreation", "Eager"}});
    auto active = activate("SELECT * FROM CIM_InstCreation", received_.receiver());
    calls();
    manager_.reset();
    EXPECT_EQ(calls(), "Eager.deActivate(last) Eager.disable Eager.cleanup ");
    active.subscription.end();
    EXPECT_EQ(received_.all().size(), 2U);
}

TEST_F(Indications, AThreadThatAProviderLeavesBehindRunsIntoNothing) {
    start({{"CIM_InstDeletion", "Plain"}});
    auto active = activate("SELECT * FROM CIM_InstDeletion", received_.receiver());
    std::atomic<bool> over = false;
    void* detached = nullptr;
    std::thread thread(
        [&] { detached = function<void* (*)(void*)>("tellingThreadThatStays")(&over); });
    while (received_.all().empty()) {
        std::this_thread::yield();
    }
    manager_.reset();
    const std::size_t told = received_.all().size();
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    EXPECT_EQ(received_.all().size(), told);
    over = true;
    thread.join();
    EXPECT_EQ(detached, &over) << "its broker is still there";
}

TEST_F(Indications, AfterItsEndAReceiverIsNeverCalled) {
    start({{"CIM_InstCreation", "Plain"}});
    std::atomic<bool> over = false;
    std::atomic<int> told = 0;
    const auto keep = activate("SELECT * FROM CIM_InstCreation", [&](const auto&) { ++told; });
    std::vector<std::thread> threads;
    for (int number = 0; number < 3; ++number) {
        threads.emplace_back([&] {
            while (!over) {
                EXPECT_EQ(tell("CIM_InstCreation", "busy"), CMPI_RC_OK);
            }
        });
    }
    for (int round = 0; round < 50; ++round) {
        // Ends with the round: a call after it would be seen by the sanitizers, too.
        auto ended = std::make_unique<std::atomic<bool>>(false);
        auto active =
            activate("SELECT * FROM CIM_InstCreation", [&](const auto&) { EXPECT_FALSE(*ended); });
        ASSERT_TRUE(active.status.ok());
        std::this_thread::yield();
        active.subscription.end();
        *ended = true;
    }
    over = true;
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_GT(told, 0);
}

TEST_F(Indications, WhatIsNotAnInstanceIsNotDelivered) {
    start({{"CIM_InstCreation", "Plain"}});
    const auto active = activate("SELECT * FROM CIM_InstCreation", received_.receiver());
    const CMPIBroker* broker = function<const CMPIBroker* (*)()>("tellingBroker")();
    EXPECT_EQ(broker->bft->deliverIndication(broker, nullptr, "root/cimv2", nullptr).rc,
              CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(broker->bft->deliverIndication(nullptr, nullptr, "root/cimv2", nullptr).rc,
              CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_THAT(received_.identifiers(), IsEmpty());
}

}  // namespace
}  // namespace cimom::test
