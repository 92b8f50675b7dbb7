// Every verb of wbemcli that reads, on every served class and its parent: all that
// it prints is compared with what the machine's tree and the schema make expect.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <memory>

#include "ExpectedMachine.h"
#include "ProgramRun.h"
#include "ServedProgram.h"
#include "kit/Sanitizers.h"

namespace {

using test::Ended;
using test::ExpectedClasses;
using test::ExpectedMachine;
using Objects = std::vector<ExpectedMachine::Object>;

const ExpectedClasses& classes() {
    static const ExpectedClasses all(ZR_SOURCE_DIR "/schema");
    return all;
}

class Wbemcli : public test::ProgramTest {
  protected:
    /// Serves a machine with so many interfaces, all of which use DHCP.
    void serve(int interfaces) {
        std::vector<ExpectedMachine::Interface> expected;
        std::string nodes;
        for (int number = 0; number < interfaces; ++number) {
            const ExpectedMachine::Interface one{
                "if" + std::to_string(number),
                "198.18." + std::to_string(number / 250) + '.' + std::to_string(number % 250 + 1),
                "192.0.2." + std::to_string(number % 3 + 1)};
            nodes += std::string(nodes.empty() ? "" : ",") +
                     R"({"type": "NetworkInterface", "description": "Ethernet interface", )"
                     R"("properties": {"Name": ")" +
                     one.name +
                     R"(", "DHCPEnabled": true, "AddressSource": 1, )"
                     R"("InterfaceState": 1, "IPv4Address": ")" +
                     one.address + R"(", "DHCPServerAddresses": [")" + one.server + R"("]}})";
            expected.push_back(one);
        }
        setTree(nodes.empty() ? ""
                              : R"({"type": "ComputerSystem", "description": "Computer", )"
                                R"("properties": {"Name": "${HOSTNAME}"}, "children": [{"type": )"
                                R"("Network", "description": "Network", "children": [)" +
                                    nodes + "]}]}");
        machine_ = std::make_unique<ExpectedMachine>(classes(), hostName(), expected);
        server_ = std::make_unique<test::ServedProgram>(
            program(),
            std::vector<std::string>{"--tree", tree(), "--data-dir", dataDir(), "serve", "--listen",
                                     "127.0.0.1:0"},
            std::vector<std::string>{"ZR_CONFIG=" + (directory() / "platform.conf"),
                                     "ZR_LOG_SINK=none"});
    }

    Ended ask(const std::string& verb, const std::string& object,
              const std::vector<std::string>& options = {}) const {
        std::vector<std::string> arguments{verb};
        arguments.insert(arguments.end(), options.begin(), options.end());
        arguments.push_back(server_->url() + "/root/cimv2:" + object);
        return runAs("/usr/bin/wbemcli", arguments);
    }

    static Ended lines(const std::string& host, const Objects& objects, bool properties) {
        std::string text;
        for (const auto& object : objects) {
            text += host + '/' + object.nameSpace + ':' + object.path +
                    (properties ? ' ' + object.properties : "") + '\n';
        }
        return {0, text, ""};
    }
    /// Of instances, wbemcli writes whom it asked; of associated ones, what the
    /// server said.
    [[nodiscard]] Ended asked(const Objects& objects, bool properties) const {
        return lines(server_->host(), objects, properties);
    }
    [[nodiscard]] static Ended found(const Objects& objects, bool properties) {
        return lines(hostName(), objects, properties);
    }

    static std::vector<std::string> servedClasses() {
        std::vector<std::string> all = ExpectedMachine::elementClasses();
        const auto& associations = ExpectedMachine::associationClasses();
        all.insert(all.end(), associations.begin(), associations.end());
        return all;
    }

    void expectEnumerations() const {
        for (const std::string& name : servedClasses()) {
            for (const std::string& each : {name, classes().parentOf(name)}) {
                const Objects objects = machine_->instancesOf(each);
                EXPECT_EQ(ask("ein", each), asked(objects, false)) << each;
                EXPECT_EQ(ask("ei", each), asked(objects, true)) << each;
            }
        }
    }

    /// About the object of each class with that number, or the last one.
    void expectSingleObjects(std::size_t number) const {
        for (const std::string& name : ExpectedMachine::elementClasses()) {
            const Objects objects = machine_->instancesOf(name);
            ASSERT_FALSE(objects.empty()) << name;
            const auto& object = objects[std::min(number, objects.size() - 1)];
            EXPECT_EQ(ask("gi", object.path), asked({machine_->fetched(object)}, true));
            expectAssociations(object, "");
        }
    }

    void expectAssociations(const ExpectedMachine::Object& object,
                            const std::string& associationClass) const {
        const bool all = associationClass.empty();
        const std::vector<std::string> ofAssociators =
            all ? std::vector<std::string>{} : std::vector<std::string>{"-ac", associationClass};
        const std::vector<std::string> ofReferences =
            all ? std::vector<std::string>{} : std::vector<std::string>{"-arc", associationClass};
        SCOPED_TRACE(object.path + " by " + (all ? "any" : associationClass));
        const Objects far = machine_->associators(object, associationClass);
        EXPECT_EQ(ask("ain", object.path, ofAssociators), found(far, false));
        EXPECT_EQ(ask("ai", object.path, ofAssociators), found(far, true));
        const Objects near = machine_->references(object, associationClass);
        EXPECT_EQ(ask("rin", object.path, ofReferences), found(near, false));
        EXPECT_EQ(ask("ri", object.path, ofReferences), found(near, true));
    }

    std::unique_ptr<test::ServedProgram> server_;
    std::unique_ptr<ExpectedMachine> machine_;
};

TEST_F(Wbemcli, AnEmptyMachine) {
    serve(0);
    expectEnumerations();
    const std::string gone = "QVXZR_DHCPSettingData.InstanceID=\"Computer%if0\"";
    const Ended missing{
        16, "", "*\n* /usr/bin/wbemcli: Cim: (6) CIM_ERR_NOT_FOUND: there is no " + gone + "\n*\n"};
    for (const char* verb : {"ain", "ai", "rin", "ri", "gi"}) {
        EXPECT_EQ(ask(verb, gone), missing) << verb;
    }
}

TEST_F(Wbemcli, OneInterface) {
    serve(1);
    expectEnumerations();
    expectSingleObjects(0);
    // Each association class by itself, and its parent.
    for (const std::string& name : ExpectedMachine::elementClasses()) {
        for (const std::string& association : ExpectedMachine::associationClasses()) {
            const auto object = machine_->instancesOf(name).front();
            if (machine_->references(object, association).empty()) {
                continue;
            }
            expectAssociations(object, association);
            expectAssociations(object, classes().parentOf(association));
        }
    }
}

TEST_F(Wbemcli, AThousandInterfaces) {
    constexpr int count = ZR::Testing::sanitized ? 100 : 1000;
    serve(count);
    expectEnumerations();
    expectSingleObjects(count / 2);
    const std::string interface = "if" + std::to_string(count - 1);
    const std::string name = "QVXZR_DHCPSettingData.InstanceID=\"Computer%" + interface + '"';
    writeConfiguration(interface, "CONFIG_NAME=home\n");
    const std::vector<std::string> change{"mi", server_->url() + "/root/cimv2:" + name,
                                          "ConfigurationName=office"};
    const Ended changed = runAs("/usr/bin/wbemcli", change);
    EXPECT_EQ(changed.status, 0);
    EXPECT_EQ(changed.err, "");
    EXPECT_EQ(ZR::Testing::readFile(configuration(interface)), "CONFIG_NAME=office\n");
    auto last = machine_->instancesOf("QVXZR_DHCPSettingData").back();
    last.properties += ",ConfigurationName=\"office\"";
    EXPECT_EQ(ask("gi", name), asked({machine_->fetched(last)}, true));
}

TEST_F(Wbemcli, ClassesAndTheirParents) {
    serve(0);
    const auto shown = [](const std::string& name) {
        ExpectedMachine::Object object{name, name, ""};
        for (const std::string& property : classes().propertiesOf(name)) {
            object.properties += (object.properties.empty() ? "" : ",") + property + '=';
        }
        return object;
    };
    for (const std::string& name : servedClasses()) {
        for (const std::string& each : {name, classes().parentOf(name)}) {
            Objects names;
            Objects direct;
            std::vector<std::string> below = classes().treeOf(each);
            below.erase(below.begin());
            for (const std::string& one : below) {
                names.push_back({one, one, ""});
                direct.push_back(shown(one));
            }
            EXPECT_EQ(ask("ecn", each), asked(names, false)) << each;
            EXPECT_EQ(ask("ec", each), asked(direct, true)) << each;
            EXPECT_EQ(ask("gc", each), asked({shown(each)}, true)) << each;
        }
    }
}

}  // namespace
