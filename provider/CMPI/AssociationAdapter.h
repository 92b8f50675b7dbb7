#pragma once

#include <cmpift.h>

#include <array>
#include <cstdint>
#include <string>

#include "CMPI/ElementAdapter.h"
#include "include/TracePoint.h"
#include "providerutilities/ProviderUtilities.h"
#include "zrclient/Moniker.h"
#include "zrcommon/Strings.h"

/// What the association adapters share. Each serves one association class from
/// one source path: it finds out on which end the source stands, places its two
/// end adapters so that walking them yields the far end, and goes from one end to
/// the other through its association record.
namespace ZR::DHCPClientProvider {

/// On which end of an association a source path stands.
enum class Source { first, second, association, none };

/// One end of an association class.
struct AssociationEnd {
    const char* role;
    unsigned short classId;
    const char* className;
    const char* standardClass;  ///< the standard class of the same stem
};

struct AssociationEnds {
    const char* className;
    unsigned short classId;
    AssociationEnd first;
    AssociationEnd second;

    [[nodiscard]] constexpr Source sourceOf(std::int32_t requestedClassId) const {
        if (requestedClassId == first.classId) {
            return Source::first;
        }
        if (requestedClassId == second.classId) {
            return Source::second;
        }
        return requestedClassId == classId ? Source::association : Source::none;
    }

    /// Whether the far end of such a source is of neither of the two classes that
    /// clients may name: the far class itself or the standard class of its stem.
    /// Ancestors and descendants do not count; without a far end nothing does.
    [[nodiscard]] bool isNotTarget(std::int32_t requestedClassId, const char* resultClass) const {
        const Source source = sourceOf(requestedClassId);
        if (source != Source::first && source != Source::second) {
            return true;
        }
        const AssociationEnd& far = source == Source::first ? second : first;
        return !equalNames(resultClass, far.className) &&
               !equalNames(resultClass, far.standardClass);
    }
};

/// The path of the far end of `known`: through the record, when the known path
/// has keys; else, or when the far moniker cannot be turned into a path, a path of
/// the target class without keys, which stands for all its instances.
/// `inspect` sees the far moniker.
template <typename Record, typename Inspect>
CMPIObjectPath* locate(const CMPIBroker* broker, const std::string& nameSpace,
                       const char* targetClass, const CMPIObjectPath* known, Record& record,
                       Moniker (Record::*build)(Moniker&), const Inspect& inspect) {
    CMPIObjectPath* result = ProviderUtilities::createObjectPath(broker, targetClass, nameSpace);
    if (ProviderUtilities::getKeyCount(known) != 0) {
        Moniker moniker;
        ProviderUtilities::transformObjectPathToMoniker(known, moniker);
        Moniker far = (record.*build)(moniker);
        inspect(far);
        ProviderUtilities::transformMonikerToObjectPath(far, &result);
    }
    return result;
}

template <typename Record>
CMPIObjectPath* locate(const CMPIBroker* broker, const std::string& nameSpace,
                       const char* targetClass, const CMPIObjectPath* known, Record& record,
                       Moniker (Record::*build)(Moniker&)) {
    return locate(broker, nameSpace, targetClass, known, record, build, [](const Moniker&) {});
}

/// What `ask` answers of the end that is far from the source; null without one.
template <typename First, typename Second, typename Ask>
auto askFarEnd(Source source, First& first, Second& second, const Ask& ask) {
    if (source == Source::first) {
        return ask(second);
    }
    return source == Source::second ? ask(first) : nullptr;
}

template <typename First, typename Second>
CMPIObjectPath* farPath(Source source, First& first, Second& second) {
    return askFarEnd(source, first, second, [](auto& end) { return end.getObjectPath(); });
}

template <typename First, typename Second>
CMPIInstance* farInstance(Source source, First& first, Second& second, const char** properties) {
    return askFarEnd(source, first, second,
                     [properties](auto& end) { return end.getCMPIInstance(properties); });
}

/// Whether the walked end stands on an instance: the far end, or `walked` when the
/// source is the association class.
template <typename First, typename Second, typename Walked>
bool stands(Source source, First& first, Second& second, Walked& walked) {
    switch (source) {
        case Source::first:
            return static_cast<bool>(second);
        case Source::second:
            return static_cast<bool>(first);
        case Source::association:
            return static_cast<bool>(walked);
        case Source::none:
            break;
    }
    return false;
}

/// Steps the walked end onward.
template <typename First, typename Second, typename Walked>
void step(Source source, First& first, Second& second, Walked& walked) {
    switch (source) {
        case Source::first:
            ++second;
            break;
        case Source::second:
            ++first;
            break;
        case Source::association:
            ++walked;
            break;
        case Source::none:
            break;
    }
}

/// Makes the instance of an association path: both references as far as the path
/// has them, and what the record adds. Null when the broker makes none.
template <typename Record, std::size_t count>
CMPIInstance* makeAssociationInstance(const CMPIBroker* broker, const CMPIObjectPath* path,
                                      const AssociationEnds& ends, const Record& record,
                                      const std::array<ElementProperty<Record>, count>& own) {
    CMPIInstance* instance = ProviderUtilities::createInstance(broker, path);
    if (instance == nullptr) {
        return nullptr;
    }
    for (const char* role : {ends.first.role, ends.second.role}) {
        CMPIObjectPath* reference = nullptr;
        if (ProviderUtilities::getKeyProperty(path, role, &reference)) {
            ProviderUtilities::setProperty(instance, role, reference);
        }
    }
    for (const ElementProperty<Record>& property : own) {
        property.set(broker, instance, property.name, record);
    }
    return instance;
}

}  // namespace ZR::DHCPClientProvider
