// Providers of indications, which do by their names what providers may do.

#include <cmpift.h>

#include <array>
#include <atomic>
#include <mutex>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace {

struct Kind {
    const char* name;
    bool refuses = false;  ///< to authorize
    bool fails = false;    ///< to activate
    bool throws = false;
    bool eager = false;  ///< tells from within each function
};

constexpr std::array<Kind, 5> kinds{{{.name = "Plain"},
                                     {.name = "Refusing", .refuses = true},
                                     {.name = "Failing", .fails = true},
                                     {.name = "Throwing", .throws = true},
                                     {.name = "Eager", .eager = true}}};

const CMPIBroker* broker = nullptr;
CMPIContext* threadContext = nullptr;
std::mutex mutex;
std::string calls;

CMPIrc tell(const CMPIContext* context, const char* nameSpace, const char* className,
            const char* identifier) {
    const CMPIObjectPath* path = broker->eft->newObjectPath(broker, nameSpace, className, nullptr);
    CMPIInstance* indication = broker->eft->newInstance(broker, path, nullptr);
    CMPIValue text;
    text.string = broker->eft->newString(broker, identifier, nullptr);
    indication->ft->setProperty(indication, "IndicationIdentifier", &text, CMPI_string);
    const CMPIObjectPath* sourcePath =
        broker->eft->newObjectPath(broker, nameSpace, "CIM_ProtocolEndpoint", nullptr);
    CMPIValue source;
    source.inst = broker->eft->newInstance(broker, sourcePath, nullptr);
    source.inst->ft->setProperty(source.inst, "Name", &text, CMPI_string);
    const CMPIStatus set =
        indication->ft->setProperty(indication, "SourceInstance", &source, CMPI_instance);
    return set.rc != CMPI_RC_OK
               ? set.rc
               : broker->bft->deliverIndication(broker, context, nameSpace, indication).rc;
}

const Kind& kindOf(const CMPIIndicationMI* mi) {
    return *static_cast<const Kind*>(mi->hdl);
}

void note(const CMPIIndicationMI* mi, const CMPIContext* context, const std::string& call) {
    {
        const std::lock_guard lock(mutex);
        calls += std::string(kindOf(mi).name) + '.' + call + ' ';
    }
    if (kindOf(mi).eager && context != nullptr) {
        tell(context, "root/cimv2", "CIM_InstCreation", call.c_str());
    }
}

CMPIStatus cleanup(CMPIIndicationMI* mi, const CMPIContext* context, CMPIBoolean) {
    note(mi, context, "cleanup");
    return {CMPI_RC_OK, nullptr};
}

CMPIStatus authorizeFilter(CMPIIndicationMI* mi, const CMPIContext* context,
                           const CMPISelectExp* filter, const char* className,
                           const CMPIObjectPath* path, const char* owner) {
    const CMPIString* query = filter->ft->getString(filter, nullptr);
    const CMPIString* nameSpace = path->ft->getNameSpace(path, nullptr);
    note(mi, context,
         std::string("authorize(") + query->ft->getCharPtr(query, nullptr) + ',' + className + ',' +
             nameSpace->ft->getCharPtr(nameSpace, nullptr) + ',' + owner + ')');
    return {kindOf(mi).refuses ? CMPI_RC_ERR_ACCESS_DENIED : CMPI_RC_OK, nullptr};
}

CMPIStatus mustPoll(CMPIIndicationMI* mi, const CMPIContext* context, const CMPISelectExp*,
                    const char*, const CMPIObjectPath*) {
    note(mi, context, "mustPoll");
    return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

CMPIStatus activateFilter(CMPIIndicationMI* mi, const CMPIContext* context, const CMPISelectExp*,
                          const char*, const CMPIObjectPath*, CMPIBoolean first) {
    note(mi, context, first != 0 ? "activate(first)" : "activate");
    if (kindOf(mi).throws) {
        throw std::runtime_error("thrown");
    }
    if (threadContext == nullptr && context != nullptr) {
        threadContext = broker->bft->prepareAttachThread(broker, context);
    }
    return {kindOf(mi).fails ? CMPI_RC_ERR_FAILED : CMPI_RC_OK, nullptr};
}

CMPIStatus deActivateFilter(CMPIIndicationMI* mi, const CMPIContext* context, const CMPISelectExp*,
                            const char*, const CMPIObjectPath*, CMPIBoolean last) {
    note(mi, context, last != 0 ? "deActivate(last)" : "deActivate");
    return {CMPI_RC_OK, nullptr};
}

CMPIStatus enableIndications(CMPIIndicationMI* mi, const CMPIContext* context) {
    note(mi, context, "enable");
    return {CMPI_RC_OK, nullptr};
}

CMPIStatus disableIndications(CMPIIndicationMI* mi, const CMPIContext* context) {
    note(mi, context, "disable");
    return {CMPI_RC_OK, nullptr};
}

CMPIIndicationMIFT table{200,
                         200,
                         "telling",
                         &cleanup,
                         &authorizeFilter,
                         &mustPoll,
                         &activateFilter,
                         &deActivateFilter,
                         &enableIndications,
                         &disableIndications};
CMPIIndicationMIFT bareTable{200,     200,     "bare",  nullptr, nullptr,
                             nullptr, nullptr, nullptr, nullptr, nullptr};
std::array<CMPIIndicationMI, kinds.size()> records;
CMPIIndicationMI bare{nullptr, &bareTable};

}  // namespace

CMPI_EXTERN_C CMPIIndicationMI* _Generic_Create_IndicationMI(const CMPIBroker* host,
                                                             const CMPIContext* context,
                                                             const char* name, CMPIStatus* status);
CMPI_EXTERN_C const char* tellingTakeCalls();
CMPI_EXTERN_C CMPIrc tellingTell(const char* nameSpace, const char* className,
                                 const char* identifier);
CMPI_EXTERN_C void* tellingThread(void* identifier);
CMPI_EXTERN_C void* tellingThreadThatStays(void* until);
CMPI_EXTERN_C const CMPIBroker* tellingBroker();

CMPIIndicationMI* _Generic_Create_IndicationMI(const CMPIBroker* host, const CMPIContext*,
                                               const char* name, CMPIStatus* status) {
    broker = host;
    threadContext = nullptr;
    if (std::string_view(name) == "Bare") {
        return &bare;
    }
    for (std::size_t index = 0; index < kinds.size(); ++index) {
        if (std::string_view(kinds.at(index).name) == name) {
            // The function table has no place for a constant handle.
            records.at(index) = {const_cast<Kind*>(&kinds.at(index)), &table};
            return &records.at(index);
        }
    }
    *status = {CMPI_RC_ERR_NOT_FOUND, nullptr};
    return nullptr;
}

/// The calls since the last time, with a blank behind each.
const char* tellingTakeCalls() {
    static std::string taken;
    const std::lock_guard lock(mutex);
    taken = std::exchange(calls, {});
    return taken.c_str();
}

/// Tells from the calling thread, which the host need not know.
CMPIrc tellingTell(const char* nameSpace, const char* className, const char* identifier) {
    return tell(nullptr, nameSpace, className, identifier);
}

/// A thread of the provider: attaches, tells once and detaches.
void* tellingThread(void* identifier) {
    CMPIContext* const context = threadContext;
    if (broker->bft->attachThread(broker, context).rc != CMPI_RC_OK) {
        return nullptr;
    }
    const CMPIrc told =
        tell(context, "root/cimv2", "CIM_InstDeletion", static_cast<const char*>(identifier));
    const CMPIrc detached = broker->bft->detachThread(broker, context).rc;
    return told == CMPI_RC_OK && detached == CMPI_RC_OK ? identifier : nullptr;
}

/// Attaches, and uses the broker until the flag is set, whatever happens to the provider.
/// Gives its parameter when it could detach in the end.
void* tellingThreadThatStays(void* until) {
    const auto& over = *static_cast<const std::atomic<bool>*>(until);
    CMPIContext* const context = threadContext;
    if (broker->bft->attachThread(broker, context).rc != CMPI_RC_OK) {
        return nullptr;
    }
    while (!over) {
        tell(context, "root/cimv2", "CIM_InstDeletion", "from behind");
    }
    return broker->bft->detachThread(broker, context).rc == CMPI_RC_OK ? until : nullptr;
}

const CMPIBroker* tellingBroker() {
    return broker;
}
