// Providers that misbehave, each in a way of its own. The class that is asked
// for decides what happens.
#include <cmpift.h>

#include <cstring>
#include <stdexcept>
#include <string_view>

namespace {

const CMPIBroker* broker = nullptr;

CMPIStatus status(CMPIrc code) {
    return {code, nullptr};
}

CMPIObjectPath* newPath(const char* className, const char* id) {
    CMPIObjectPath* const path =
        broker->eft->newObjectPath(broker, "root/test", className, nullptr);
    CMPIValue value{};
    value.string = broker->eft->newString(broker, id, nullptr);
    path->ft->addKey(path, "Id", &value, CMPI_string);
    return path;
}

CMPIStatus misbehave(const CMPIResult* result, const CMPIObjectPath* op, bool names) {
    const std::string_view name = op->ft->getClassName(op, nullptr)
                                      ->ft->getCharPtr(op->ft->getClassName(op, nullptr), nullptr);
    const auto give = [&](CMPIObjectPath* path) {
        return names ? result->ft->returnObjectPath(result, path)
                     : result->ft->returnInstance(result,
                                                  broker->eft->newInstance(broker, path, nullptr));
    };
    if (name == "Test_Throws") {
        give(newPath("Test_Throws", "before"));
        throw std::runtime_error("lost my way");
    }
    if (name == "Test_ThrowsNumber") {
        throw 42;
    }
    if (name == "Test_NullResults") {
        give(newPath("Test_NullResults", "first"));
        const CMPIStatus nothing = names ? result->ft->returnObjectPath(result, nullptr)
                                         : result->ft->returnInstance(result, nullptr);
        give(newPath("Test_NullResults", "last"));
        return nothing;
    }
    if (name == "Test_Done") {
        for (int count = 0; count < 100; ++count) {
            result->ft->returnDone(result);
        }
        give(newPath("Test_Done", "after done"));
        return status(CMPI_RC_OK);
    }
    if (name == "Test_Million") {
        CMPIObjectPath* const path = newPath("Test_Million", "one of very many");
        CMPIInstance* const instance = broker->eft->newInstance(broker, path, nullptr);
        // The status of each is not looked at, as a bad provider does.
        for (int count = 0; count < 1'000'000; ++count) {
            names ? result->ft->returnObjectPath(result, path)
                  : result->ft->returnInstance(result, instance);
        }
        return status(CMPI_RC_OK);
    }
    if (name == "Test_WrongClass") {
        give(newPath("Test_Unserved", "1"));
        give(newPath("Nobody_Knows", "2"));
        return status(CMPI_RC_OK);
    }
    if (name == "Test_PartialError") {
        give(newPath("Test_PartialError", "1"));
        return {CMPI_RC_ERR_ACCESS_DENIED, broker->eft->newString(broker, "not you", nullptr)};
    }
    if (name == "Test_OddStatus") {
        CMPIStatus odd = status(CMPI_RC_OK);
        const int code = 4711;
        std::memcpy(&odd.rc, &code, sizeof code);
        return odd;
    }
    if (name == "Test_ErrorObject") {
        CMPIStatus rc{};
        const CMPIError* const error =
            broker->eft->newCMPIError(broker, "owner", "id", "told by an error object",
                                      ErrorSevHigh, Timeout, CMPI_RC_ERR_FAILED, &rc);
        result->ft->returnError(result, error);
        return status(CMPI_RC_ERR_FAILED);
    }
    return status(CMPI_RC_ERR_NOT_FOUND);
}

CMPIStatus enumerateInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                  const CMPIObjectPath* op) {
    return misbehave(result, op, true);
}

CMPIStatus enumerateInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                              const CMPIObjectPath* op, const char**) {
    return misbehave(result, op, false);
}

CMPIStatus throwingCleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
    throw std::runtime_error("cleanup failed");
}

const CMPIInstanceMIFT badTable{CMPIVersion200,
                                1,
                                "instanceBad",
                                throwingCleanup,
                                enumerateInstanceNames,
                                enumerateInstances,
                                enumerateInstances,
                                nullptr,
                                nullptr,
                                nullptr,
                                nullptr};
CMPIInstanceMI bad{nullptr, &badTable};

const CMPIInstanceMIFT emptyTable{CMPIVersion200, 1,       "instanceEmpty", nullptr,
                                  nullptr,        nullptr, nullptr,         nullptr,
                                  nullptr,        nullptr, nullptr};
CMPIInstanceMI empty{nullptr, &emptyTable};
CMPIInstanceMI tableless{nullptr, nullptr};

}  // namespace

CMPI_EXTERN_C CMPIInstanceMI* Bad_Create_InstanceMI(const CMPIBroker* mb, const CMPIContext*,
                                                    CMPIStatus*) {
    broker = mb;
    return &bad;
}

CMPI_EXTERN_C CMPIInstanceMI* NullRecord_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                           CMPIStatus*) {
    return nullptr;
}

CMPI_EXTERN_C CMPIInstanceMI* RefusedRecord_Create_InstanceMI(const CMPIBroker* mb,
                                                              const CMPIContext*, CMPIStatus* rc) {
    *rc = {CMPI_RC_ERR_ACCESS_DENIED, mb->eft->newString(mb, "no licence", nullptr)};
    return nullptr;
}

CMPI_EXTERN_C CMPIInstanceMI* NullTable_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                          CMPIStatus*) {
    return &tableless;
}

CMPI_EXTERN_C CMPIInstanceMI* NullSlots_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                          CMPIStatus*) {
    return &empty;
}

CMPI_EXTERN_C CMPIInstanceMI* ThrowingFactory_Create_InstanceMI(const CMPIBroker*,
                                                                const CMPIContext*, CMPIStatus*) {
    throw "a text";
}
