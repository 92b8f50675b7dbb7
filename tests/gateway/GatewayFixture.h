#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>
#include <string>
#include <utility>
#include <vector>

#include "cimom/ClassDeclaration.h"
#include "kit/StrictHost.h"
#include "kit/Tree.h"

/// A machine that has what made clients meet something else than they asked for, behind the
/// gateway in the strict object manager.
namespace gateway {

using Keys = std::vector<std::pair<std::string, std::string>>;
using Texts = std::vector<std::string>;

inline cimom::ObjectPath pathOf(const std::string& className, const Keys& keys = {}) {
    cimom::ObjectPath path{"", "root/cimv2", className, {}};
    for (const auto& [name, value] : keys) {
        path.keys.push_back({name, cimom::Value::ofString(value)});
    }
    return path;
}

/// Null when the value is no reference.
inline const cimom::ObjectPath* referenceOf(const cimom::Value& value) {
    const cimom::Scalar* scalar = value.scalar();
    const auto* reference =
        scalar == nullptr ? nullptr : std::get_if<std::shared_ptr<const cimom::ObjectPath>>(scalar);
    return reference == nullptr ? nullptr : reference->get();
}

/// What a test looks at of a path: the class without its prefix and the last text key, or
/// its references.
inline std::string brief(const cimom::ObjectPath& path) {
    std::string text = path.className.substr(path.className.find('_') + 1);
    for (const cimom::NamedValue& key : path.keys) {
        if (const cimom::ObjectPath* reference = referenceOf(key.value)) {
            text += ' ' + key.name + '=' + brief(*reference);
        }
    }
    const cimom::Scalar* scalar = path.keys.empty() ? nullptr : path.keys.back().value.scalar();
    const std::string* last = scalar == nullptr ? nullptr : std::get_if<std::string>(scalar);
    return last == nullptr ? text : text + ' ' + *last;
}

inline Texts briefs(const std::vector<cimom::ObjectPath>& paths) {
    Texts texts;
    for (const cimom::ObjectPath& path : paths) {
        texts.push_back(brief(path));
    }
    return texts;
}

inline Texts briefs(const std::vector<cimom::Instance>& instances) {
    Texts texts;
    for (const cimom::Instance& instance : instances) {
        texts.push_back(brief(instance.path));
    }
    return texts;
}

class GatewayTest : public test::TreeTest {
  protected:
    explicit GatewayTest(const strict::Traits& traits = {})
        : host_(ZR_SOURCE_DIR "/schema", {ZR_SOURCE_DIR "/schema/DHCPClient.registration"},
                ZR_BINARY_DIR "/lib/cmpi", traits) {}

    void SetUp() override {
        const auto with = [](test::Json node, const char* address) {
            node["properties"]["IPv4Address"] = address;
            return node;
        };
        setTree({test::host(
                     {with(test::staticInterface("fixed0"), "192.0.2.9"),
                      with(test::dhcpInterface("eth0", {"192.0.2.1", "2001:db8::1"}), "192.0.2.10"),
                      with(test::dhcpInterface("my_nic", {"192.0.2.2"}), "192.0.2.11"),
                      test::dhcpInterface("eth2")}),
                 test::serviceProcessor(
                     {with(test::dhcpInterface("bmc0", {"192.0.2.3"}), "192.0.2.20")})});
        static_cast<void>(strict::violations().take());
    }

    void TearDown() override { EXPECT_THAT(strict::violations().take(), ::testing::IsEmpty()); }

    static cimom::ObjectPath endpoint(const std::string& name) {
        return onSystem("QVXZR_DHCPProtocolEndpoint", name);
    }
    static cimom::ObjectPath ipEndpoint(const std::string& name) {
        return onSystem("QVXZR_IPProtocolEndpoint", name);
    }
    static cimom::ObjectPath accessPoint(const std::string& name) {
        return onSystem("QVXZR_DHCPRemoteServiceAccessPoint", name);
    }
    static cimom::ObjectPath computer() {
        return pathOf("QVXZR_ComputerSystem",
                      {{"CreationClassName", "QVXZR_ComputerSystem"}, {"Name", hostName()}});
    }
    static cimom::ObjectPath serviceProcessor() {
        return pathOf("QVXZR_SPComputerSystem",
                      {{"CreationClassName", "QVXZR_SPComputerSystem"}, {"Name", "BMC:-1"}});
    }
    static cimom::ObjectPath setting(const std::string& id) {
        return pathOf("QVXZR_DHCPSettingData", {{"InstanceID", id}});
    }

    strict::StrictHost host_;

  private:
    static cimom::ObjectPath onSystem(const std::string& className, const std::string& name) {
        return pathOf(className, {{"SystemCreationClassName", "QVXZR_ComputerSystem"},
                                  {"SystemName", hostName()},
                                  {"CreationClassName", className},
                                  {"Name", name}});
    }
};

}  // namespace gateway
