// A provider of another maker, which does no more than most object managers demand: what it
// delivers does not depend on the source or on any filter, and it makes paths of instances
// from their properties. Others in the same library fail.
#include <cmpift.h>

#include <array>
#include <string>
#include <string_view>

namespace {

const CMPIBroker* broker = nullptr;

CMPIStatus ok() {
    return {CMPI_RC_OK, nullptr};
}

CMPIStatus failure() {
    return {CMPI_RC_ERR_FAILED, broker->eft->newString(broker, "out of order", nullptr)};
}

CMPIInstance* newInstance(const char* className) {
    CMPIObjectPath* const path =
        broker->eft->newObjectPath(broker, "root/test", className, nullptr);
    return broker->eft->newInstance(broker, path, nullptr);
}

void setText(const CMPIInstance* instance, const char* name, const char* text) {
    CMPIValue value{};
    value.string = broker->eft->newString(broker, text, nullptr);
    instance->ft->setProperty(instance, name, &value, CMPI_string);
}

CMPIInstance* thing(const char* className, const char* id) {
    CMPIInstance* const instance = newInstance(className);
    setText(instance, "Id", id);
    setText(instance, "Note", "a thing");
    return instance;
}

CMPIObjectPath* pathOf(const CMPIInstance* instance) {
    return instance->ft->getObjectPath(instance, nullptr);
}

struct Tie {
    const char* near;
    const char* far;
};
constexpr std::array<Tie, 3> ties{{{"l1", "r1"}, {"l1", "r2"}, {"l2", "r2"}}};

CMPIInstance* link(const Tie& tie, const char** properties) {
    CMPIInstance* const instance = newInstance("Stranger_Link");
    if (properties != nullptr) {
        instance->ft->setPropertyFilter(instance, properties, nullptr);
    }
    CMPIValue value{};
    value.ref = pathOf(thing("Stranger_Left", tie.near));
    instance->ft->setProperty(instance, "Near", &value, CMPI_ref);
    value.ref = pathOf(thing("Stranger_Right", tie.far));
    instance->ft->setProperty(instance, "Far", &value, CMPI_ref);
    setText(instance, "Note", "a link");
    return instance;
}

void give(const CMPIResult* result, const CMPIInstance* instance, bool names) {
    names ? result->ft->returnObjectPath(result, pathOf(instance))
          : result->ft->returnInstance(result, instance);
}

void giveAllLinks(const CMPIResult* result, const char** properties, bool names) {
    for (const Tie& tie : ties) {
        give(result, link(tie, properties), names);
    }
}

CMPIStatus giveAll(const CMPIResult* result, const CMPIObjectPath* op, const char** properties,
                   bool names) {
    const CMPIString* const className = op->ft->getClassName(op, nullptr);
    const std::string_view asked = className->ft->getCharPtr(className, nullptr);
    if (asked == "Stranger_Link") {
        giveAllLinks(result, properties, names);
    } else if (asked == "Stranger_Left") {
        give(result, thing("Stranger_Left", "l1"), names);
        give(result, thing("Stranger_Left", "l2"), names);
    } else {
        give(result, thing("Stranger_Right", "r1"), names);
        give(result, thing("Stranger_Right", "r2"), names);
    }
    return ok();
}

CMPIStatus cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
    return ok();
}
CMPIStatus cleanup(CMPIAssociationMI*, const CMPIContext*, CMPIBoolean) {
    return ok();
}

CMPIStatus enumerateInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                  const CMPIObjectPath* op) {
    return giveAll(result, op, nullptr, true);
}

CMPIStatus enumerateInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                              const CMPIObjectPath* op, const char** properties) {
    return giveAll(result, op, properties, false);
}

const CMPIInstanceMIFT instanceTable{CMPIVersion200,
                                     1,
                                     "instanceStranger",
                                     cleanup,
                                     enumerateInstanceNames,
                                     enumerateInstances,
                                     enumerateInstances,
                                     nullptr,
                                     nullptr,
                                     nullptr,
                                     nullptr};
CMPIInstanceMI instanceRecord{nullptr, &instanceTable};

// Far ends of every link, and what is none.
CMPIStatus giveFarEnds(const CMPIResult* result, bool names) {
    give(result, thing("Stranger_Right", "r1"), names);
    give(result, thing("Stranger_Right", "r2"), names);
    give(result, thing("Stranger_Apart", "a1"), names);
    return ok();
}

CMPIStatus associators(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                       const CMPIObjectPath*, const char*, const char*, const char*, const char*,
                       const char**) {
    return giveFarEnds(result, false);
}
CMPIStatus associatorNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                           const CMPIObjectPath*, const char*, const char*, const char*,
                           const char*) {
    return giveFarEnds(result, true);
}
CMPIStatus references(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                      const CMPIObjectPath*, const char*, const char*, const char** properties) {
    giveAllLinks(result, properties, false);
    return ok();
}
CMPIStatus referenceNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                          const CMPIObjectPath*, const char*, const char*) {
    giveAllLinks(result, nullptr, true);
    return ok();
}

const CMPIAssociationMIFT associationTable{
    CMPIVersion200,  1,          "associationStranger", cleanup, associators,
    associatorNames, references, referenceNames};
CMPIAssociationMI associationRecord{nullptr, &associationTable};

// An association provider of which every operation ends with the status of `End`, the
// associators after a part of the result.
template <CMPIStatus (*End)()>
struct Ending {
    static CMPIStatus associators(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result,
                                  const CMPIObjectPath*, const char*, const char*, const char*,
                                  const char*, const char**) {
        give(result, thing("Stranger_Right", "partial"), false);
        return End();
    }
    static CMPIStatus associatorNames(CMPIAssociationMI*, const CMPIContext*,
                                      const CMPIResult* result, const CMPIObjectPath*, const char*,
                                      const char*, const char*, const char*) {
        give(result, thing("Stranger_Right", "partial"), true);
        return End();
    }
    static CMPIStatus references(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*,
                                 const CMPIObjectPath*, const char*, const char*, const char**) {
        return End();
    }
    static CMPIStatus referenceNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*,
                                     const CMPIObjectPath*, const char*, const char*) {
        return End();
    }
    inline static const CMPIAssociationMIFT table{
        CMPIVersion200,  1,          "associationEnding", cleanup, associators,
        associatorNames, references, referenceNames};
    inline static CMPIAssociationMI record{nullptr, &table};
};

CMPIStatus invalidClass() {
    return {CMPI_RC_ERR_INVALID_CLASS, nullptr};
}
CMPIStatus notFound() {
    return {CMPI_RC_ERR_NOT_FOUND, nullptr};
}

// Tells associators, and fails to tell the associations that their roles are in.
const CMPIAssociationMIFT rolelessTable{CMPIVersion200,
                                        1,
                                        "associationRoleless",
                                        cleanup,
                                        associators,
                                        associatorNames,
                                        Ending<failure>::references,
                                        Ending<failure>::referenceNames};
CMPIAssociationMI rolelessRecord{nullptr, &rolelessTable};

}  // namespace

CMPI_EXTERN_C CMPIInstanceMI* Stranger_Create_InstanceMI(const CMPIBroker* mb, const CMPIContext*,
                                                         CMPIStatus*) {
    broker = mb;
    return &instanceRecord;
}

CMPI_EXTERN_C CMPIAssociationMI* _Generic_Create_AssociationMI(const CMPIBroker* mb,
                                                               const CMPIContext*, const char* name,
                                                               CMPIStatus* rc) {
    broker = mb;
    const std::string_view wanted = name;
    if (wanted == "Stranger") {
        return &associationRecord;
    }
    if (wanted == "Failing") {
        return &Ending<failure>::record;
    }
    if (wanted == "Refusing") {
        return &Ending<invalidClass>::record;
    }
    if (wanted == "Missing") {
        return &Ending<notFound>::record;
    }
    if (wanted == "Roleless") {
        return &rolelessRecord;
    }
    *rc = {CMPI_RC_ERR_NOT_FOUND, nullptr};
    return nullptr;
}
