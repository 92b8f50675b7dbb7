// From a DHCP client of this machine to a listener: the real library in the object manager.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>

#include "cimom/ObjectManager.h"
#include "cimom/Results.h"
#include "indications/Subscriptions.h"
#include "kit/Files.h"
#include "kit/Listeners.h"
#include "kit/Namespaces.h"

namespace cimom::wbem {
namespace {

using ZR::Live::run;

ObjectPath made(ObjectManager& manager, const char* className, std::vector<NamedValue> properties) {
    const auto result =
        manager.createInstance({{"", "root/interop", className, {}}, std::move(properties)}, {});
    EXPECT_TRUE(result.status.ok()) << className << ": " << result.status.message;
    return result.paths.empty() || !result.paths.front() ? ObjectPath() : *result.paths.front();
}

NamedValue endOf(const char* name, const ObjectPath& path) {
    return {name, {Type::reference, false, Scalar(std::make_shared<const ObjectPath>(path))}};
}

TEST(SubscriptionsEndToEnd, AClientThatBeginsOnAnInterfaceIsToldToTheListener) {
    ZR_NEEDS_NAMESPACES();
    EXPECT_TRUE(ZR::Live::passesInNamespaces(60, [] {
        ::setenv("ZR_LOG_SINK", "none", 1);
        run("ip link set lo up");
        const ZR::Testing::TemporaryDirectory directory;
        const std::filesystem::path build = ZR_BINARY_DIR;
        const std::filesystem::path schema = std::filesystem::path(ZR_SOURCE_DIR) / "schema";
        ObjectManager manager(
            {{schema}, {schema / "DHCPClient.registration"}, {build / "lib/cmpi"}, "testhost"});
        test::KeptLog log;
        SubscriptionSettings settings;
        settings.directory = directory / "state";
        const Subscriptions subscriptions(manager, manager.indications(), settings, log.log());
        test::KeptIndications listener;
        const ObjectPath filter = made(
            manager, "CIM_IndicationFilter",
            {{"Name", Value::ofString("endpoints")},
             {"Query", Value::ofString("SELECT * FROM CIM_InstCreation WHERE SourceInstance ISA "
                                       "CIM_DHCPProtocolEndpoint")},
             {"QueryLanguage", Value::ofString("WQL")},
             {"SourceNamespaces", {Type::string, true, Array{Scalar(std::string("root/cimv2"))}}}});
        const ObjectPath destination = made(
            manager, "CIM_ListenerDestinationCIMXML",
            {{"Name", Value::ofString("test")}, {"Destination", Value::ofString(listener.url())}});
        made(manager, "CIM_IndicationSubscription",
             {endOf("Filter", filter), endOf("Handler", destination)});

        run("ip link add test0 type bridge && ip link set test0 up");
        run("udhcpc -f -i test0 -s /bin/true >/dev/null 2>&1 &");
        const auto got = listener.await(1);
        ASSERT_EQ(got.size(), 1U) << testing::PrintToString(log.lines());
        EXPECT_EQ(got.front().instance.path.className, "CIM_InstCreation");
        EXPECT_EQ(test::numberIn(got.front().instance), 0);
        const Value* const source = got.front().instance.property("SourceInstance");
        ASSERT_NE(source, nullptr);
        const auto* const endpoint = std::get_if<std::shared_ptr<const Instance>>(source->scalar());
        ASSERT_NE(endpoint, nullptr);
        EXPECT_EQ((*endpoint)->path.className, "QVXZR_DHCPProtocolEndpoint");
        EXPECT_THAT(test::textIn(**endpoint, "Name"), testing::HasSubstr("test0"));
    }));
}

}  // namespace
}  // namespace cimom::wbem
