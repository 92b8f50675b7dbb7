#pragma once

#include <cmpift.h>
#include <gtest/gtest.h>

#include <string>

#include "broker/Broker.h"
#include "broker/RequestScope.h"
#include "cimom/ClassRepository.h"

namespace ZR::Testing {

/// The broker of the embedded object manager with a small schema, inside of a request.
class ProviderUtilitiesTest : public testing::Test {
  protected:
    static constexpr const char* nameSpace = "root/test";

    [[nodiscard]] CMPIObjectPath* newPath(const char* className) const {
        return broker->eft->newObjectPath(broker, nameSpace, className, nullptr);
    }
    [[nodiscard]] CMPIInstance* newInstance(const char* className) const {
        return broker->eft->newInstance(broker, newPath(className), nullptr);
    }

    static void addKey(CMPIObjectPath* path, const char* name, const CMPIValue& value,
                       CMPIType type) {
        ASSERT_EQ(path->ft->addKey(path, name, &value, type).rc, CMPI_RC_OK);
    }
    void addTextKey(CMPIObjectPath* path, const char* name, const char* text) const {
        CMPIValue value{};
        value.string = broker->eft->newString(broker, text, nullptr);
        addKey(path, name, value, CMPI_string);
    }
    static void addNumberKey(CMPIObjectPath* path, const char* name, unsigned number) {
        CMPIValue value{};
        value.uint32 = number;
        addKey(path, name, value, CMPI_uint32);
    }
    static void addReferenceKey(CMPIObjectPath* path, const char* name, CMPIObjectPath* reference) {
        CMPIValue value{};
        value.ref = reference;
        addKey(path, name, value, CMPI_ref);
    }

    /// A text as the broker hands it out; "null" for none.
    static std::string textOf(const CMPIString* string) {
        return string == nullptr ? "null" : string->ft->getCharPtr(string, nullptr);
    }
    static std::string textOf(const CMPIObjectPath* path) {
        return path == nullptr ? "null" : textOf(path->ft->toString(path, nullptr));
    }

  private:
    static cimom::ClassRepository load() {
        cimom::ClassRepository loaded;
        loaded.loadText(R"(
            Qualifier Key : boolean = false, Scope(property, reference),
                            Flavor(DisableOverride, ToSubclass);
            Qualifier Association : boolean = false, Scope(association),
                                    Flavor(DisableOverride, ToSubclass);
            class CIM_ManagedElement { string ElementName; };
            [Association] class CIM_Dependency {
                [Key] CIM_ManagedElement REF Antecedent;
                [Key] CIM_ManagedElement REF Dependent;
            };
            class CIM_HostedDependency : CIM_Dependency { };
            class CIM_HostedAccessPoint : CIM_HostedDependency { };
            class CIM_SAPSAPDependency : CIM_Dependency { };
            class TEST_Element : CIM_ManagedElement {
                [Key] string InstanceID;
                uint16 Number16;
                uint32 Number32;
                uint64 Number64;
                boolean Truth;
                datetime Moment;
                uint16 Numbers[];
                string Texts[];
            };
        )",
                        "test");
        return loaded;
    }

    cimom::ClassRepository repository_ = load();
    cimom::broker::Broker broker_{repository_};
    cimom::broker::RequestScope scope_;

  protected:
    const CMPIBroker* const broker = broker_.record();
};

/// The real broker with single functions of its table replaced, for results that
/// the real one does not give. The functions are plain ones: what they need to
/// know must be global.
class AlteredBroker {
  public:
    explicit AlteredBroker(const CMPIBroker* broker) : functions(*broker->eft), record_(*broker) {
        record_.eft = &functions;
    }
    AlteredBroker(const AlteredBroker&) = delete;
    AlteredBroker& operator=(const AlteredBroker&) = delete;
    ~AlteredBroker() = default;

    [[nodiscard]] const CMPIBroker* record() const noexcept { return &record_; }

    CMPIBrokerEncFT functions;

  private:
    CMPIBroker record_;
};

}  // namespace ZR::Testing
