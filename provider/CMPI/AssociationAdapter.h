#pragma once

#include <cmpift.h>

#include <cstdint>
#include <span>
#include <string>

#include "CMPI/ElementTables.h"
#include "include/TracePoint.h"
#include "providerutilities/ProviderUtilities.h"
#include "zrclient/Moniker.h"
#include "zrcommon/Strings.h"

namespace ZR::DHCPClientProvider {

/// One of the two ends of an association class, in the order of its schema.
enum class End { first, second };

constexpr End farFrom(End end) {
    return end == End::first ? End::second : End::first;
}

/// On what of an association class a source path stands.
enum class Source { first, second, association, none };

/// What an association class says of one of its ends.
template <typename Record>
struct AssociationEnd {
    const char* role = nullptr;
    unsigned short classId = 0;
    const char* className = nullptr;
    const char* standardClass = nullptr;  ///< the standard class of the same stem

    // How the end is located from the other one.
    std::string_view locatedBy;                      ///< name of the operation in the trace
    Moniker (Record::*moniker)(Moniker&) = nullptr;  ///< the record's operation
};

/// All that distinguishes one association class from the others, as a table. Of
/// static lifetime.
template <typename Record>
struct AssociationClass {
    const char* name;
    unsigned short id;
    AssociationEnd<Record> first;
    AssociationEnd<Record> second;
    std::span<const ElementProperty<Record>> ownProperties;  ///< beside the references

    template <End end>
    [[nodiscard]] constexpr const AssociationEnd<Record>& at() const {
        return end == End::first ? first : second;
    }

    [[nodiscard]] constexpr Source sourceOf(std::int32_t classId) const {
        if (classId == first.classId) {
            return Source::first;
        }
        if (classId == second.classId) {
            return Source::second;
        }
        return classId == id ? Source::association : Source::none;
    }
};

/// How an end is placed on a path: on all instances of the path's class, or on the
/// one that the path names.
enum class Placing { all, single };

/// Where the second of the two reference keys of an association path comes from:
/// the end's own path, or the one that is located from the first.
enum class Reference { own, located };

/// Serves one association class from one source path: finds out on which end the
/// source stands, places its two end adapters so that walking them yields the far
/// end (or the pairs of ends, when the source is the association class), and goes
/// from one end to the other through its association record.
///
/// An association adapter is built for one request from the path that the client
/// names, and walked: operator bool is asked exactly once per step. What it hands
/// out belongs to the broker, which may also refuse: the answer is then null.
/// Exceptions of its ends and of its record pass. Used by one thread.
///
/// A row has the types First, Second (adapters of the ends) and Record and, as
/// static members:
///   RowSource trace
///   AssociationClass<Record> associationClass
///   End walked            the end that is walked when the source is the association class
///   End referencedFirst   whose reference key is set first, from its own path
///   Reference other       where the other reference key comes from
///   Placing firstAsSource, firstLocated   how the first end is placed
///
/// What else is particular to a class, its row has as static functions:
///   place(adapter, path)        the beginning of a walk over the association class,
///                               in place of placeFromWalked
///   stands(adapter)             whether that walk goes on, in place of the walked end
///   step(adapter)               what follows each step of the walked end
///   inspect(end, at, moniker)   sees the moniker of an end that was located
template <typename Row>
class AssociationAdapter {
  public:
    using Record = typename Row::Record;

    AssociationAdapter(const CMPIBroker* mb, const CMPIContext* context,
                       const CMPIObjectPath* objectPath);
    ~AssociationAdapter() { traceMethod(Row::trace.destructor()); }
    AssociationAdapter(const AssociationAdapter&) = delete;
    AssociationAdapter& operator=(const AssociationAdapter&) = delete;

    explicit operator bool();
    void operator++();

    /// Whether the far end is of neither of the two classes that clients may name:
    /// the far class itself or the standard class of its stem. Ancestors and
    /// descendants do not count; without a far end nothing does.
    bool isNotTargetClass(const char* resultClass) const;

    // The far end; null without one.
    CMPIObjectPath* getAssociatorNames();
    CMPIInstance* getAssociator(const char** properties);

    // The association itself. The property list is not looked at.
    CMPIObjectPath* getObjectPath();
    CMPIInstance* getCMPIInstance(const char** properties);

    /// The path of an end by the path of the other one: through the record, when
    /// that has keys; else, or when the moniker found cannot be turned into a path,
    /// one of the end's class without keys, which stands for all its instances.
    template <End end>
    CMPIObjectPath* locate(const CMPIObjectPath* objectPath);

    template <End end>
    auto& at() {
        if constexpr (end == End::first) {
            return first_;
        } else {
            return second_;
        }
    }

    /// Places the walked end's far one on what belongs to the present instance of
    /// the walked end. The usual beginning of a walk over the association class.
    void placeFromWalked();

  private:
    [[nodiscard]] Source source() const {
        return Row::associationClass.sourceOf(requestedClassId_);
    }

    /// Places an end on a path of its class.
    template <End end, Placing placing = Placing::all>
    void place(const CMPIObjectPath* objectPath) {
        if constexpr (placing == Placing::single) {
            at<end>().setSingleObjectPath(objectPath);
        } else {
            at<end>().setObjectPath(objectPath);
        }
    }

    /// What `ask` answers of the end that is far from the source; null without one.
    template <typename Ask>
    auto askFarEnd(const Ask& ask) {
        switch (source()) {
            case Source::first:
                return ask(second_);
            case Source::second:
                return ask(first_);
            default:
                return decltype(ask(first_)){nullptr};
        }
    }

    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    std::int32_t requestedClassId_;  ///< of the source path
    typename Row::First first_;
    typename Row::Second second_;
    Record record_;
};

template <typename Row>
AssociationAdapter<Row>::AssociationAdapter(const CMPIBroker* mb, const CMPIContext* context,
                                            const CMPIObjectPath* objectPath)
    : _broker(mb),
      _context(context),
      _namespace(ProviderUtilities::getNamespace(objectPath)),
      requestedClassId_(ProviderUtilities::getClassId(objectPath)),
      first_(mb, context, _namespace),
      second_(mb, context, _namespace) {
    const TracePoint here = Row::trace.constructor();
    const ParameterScope scope(here, " _broker=", _broker, " _context=", _context,
                               " objectPath=", objectPath);
    traceVariable(here, "requestedClassId", static_cast<unsigned>(requestedClassId_));
    switch (source()) {
        case Source::first:
            place<End::second>(locate<End::second>(objectPath));
            place<End::first, Row::firstAsSource>(objectPath);
            break;
        case Source::second:
            place<End::first, Row::firstLocated>(locate<End::first>(objectPath));
            place<End::second>(objectPath);
            break;
        case Source::association:
            if constexpr (requires { Row::place(*this, objectPath); }) {
                Row::place(*this, objectPath);
            } else {
                placeFromWalked();
            }
            break;
        case Source::none:
            break;
    }
}

template <typename Row>
void AssociationAdapter<Row>::placeFromWalked() {
    constexpr End far = farFrom(Row::walked);
    if (at<Row::walked>()) {
        place<far>(locate<far>(at<Row::walked>().getObjectPath()));
    }
}

template <typename Row>
AssociationAdapter<Row>::operator bool() {
    traceMethod(Row::trace.at(__func__));
    switch (source()) {
        case Source::first:
            return static_cast<bool>(second_);
        case Source::second:
            return static_cast<bool>(first_);
        case Source::association:
            if constexpr (requires { Row::stands(*this); }) {
                return Row::stands(*this);
            } else {
                return static_cast<bool>(at<Row::walked>());
            }
        case Source::none:
            break;
    }
    return false;
}

template <typename Row>
void AssociationAdapter<Row>::operator++() {
    traceMethod(Row::trace.at(__func__));
    switch (source()) {
        case Source::first:
            ++second_;
            break;
        case Source::second:
            ++first_;
            break;
        case Source::association:
            ++at<Row::walked>();
            if constexpr (requires { Row::step(*this); }) {
                Row::step(*this);
            }
            break;
        case Source::none:
            break;
    }
}

template <typename Row>
bool AssociationAdapter<Row>::isNotTargetClass(const char* resultClass) const {
    const ParameterScope scope(Row::trace.at(__func__), " resultClass=", resultClass);
    const Source from = source();
    if (from != Source::first && from != Source::second) {
        return true;
    }
    const auto& far =
        from == Source::first ? Row::associationClass.second : Row::associationClass.first;
    return !equalNames(resultClass, far.className) && !equalNames(resultClass, far.standardClass);
}

template <typename Row>
CMPIObjectPath* AssociationAdapter<Row>::getAssociatorNames() {
    const TraceScope scope(Row::trace.at(__func__));
    return askFarEnd([](const auto& end) { return end.getObjectPath(); });
}

template <typename Row>
CMPIInstance* AssociationAdapter<Row>::getAssociator(const char** properties) {
    const ParameterScope scope(Row::trace.at(__func__), " properties=", properties);
    return askFarEnd([properties](const auto& end) { return end.getCMPIInstance(properties); });
}

template <typename Row>
CMPIObjectPath* AssociationAdapter<Row>::getObjectPath() {
    const TraceScope scope(Row::trace.at(__func__));
    const auto& ours = Row::associationClass;
    CMPIObjectPath* path = ProviderUtilities::createObjectPath(_broker, ours.name, _namespace);
    if (path == nullptr) {
        return nullptr;
    }
    constexpr End other = farFrom(Row::referencedFirst);
    CMPIObjectPath* reference = at<Row::referencedFirst>().getObjectPath();
    ProviderUtilities::setKeyProperty(path, ours.template at<Row::referencedFirst>().role,
                                      reference);
    if constexpr (Row::other == Reference::located) {
        reference = locate<other>(reference);
    } else {
        reference = at<other>().getObjectPath();
    }
    ProviderUtilities::setKeyProperty(path, ours.template at<other>().role, reference);
    return path;
}

template <typename Row>
CMPIInstance* AssociationAdapter<Row>::getCMPIInstance(const char** properties) {
    const ParameterScope scope(Row::trace.at(__func__), " properties=", properties);
    const auto& ours = Row::associationClass;
    const CMPIObjectPath* path = getObjectPath();
    CMPIInstance* instance = ProviderUtilities::createInstance(_broker, path);
    if (instance == nullptr) {
        return nullptr;
    }
    for (const char* role : {ours.first.role, ours.second.role}) {
        CMPIObjectPath* reference = nullptr;
        if (ProviderUtilities::getKeyProperty(path, role, &reference)) {
            ProviderUtilities::setProperty(instance, role, reference);
        }
    }
    for (const ElementProperty<Record>& property : ours.ownProperties) {
        property.set(_broker, instance, property.name, record_);
    }
    return instance;
}

template <typename Row>
template <End end>
CMPIObjectPath* AssociationAdapter<Row>::locate(const CMPIObjectPath* objectPath) {
    const auto& ours = Row::associationClass.template at<end>();
    const TracePoint here = Row::trace.at(ours.locatedBy);
    const ParameterScope scope(here, " objectPath=", objectPath);
    CMPIObjectPath* result =
        ProviderUtilities::createObjectPath(_broker, ours.className, _namespace);
    if (ProviderUtilities::getKeyCount(objectPath) != 0) {
        Moniker moniker;
        ProviderUtilities::transformObjectPathToMoniker(objectPath, moniker);
        Moniker far = (record_.*ours.moniker)(moniker);
        if constexpr (requires { Row::inspect(end, here, far); }) {
            Row::inspect(end, here, far);
        }
        ProviderUtilities::transformMonikerToObjectPath(far, &result);
    }
    return result;
}

}  // namespace ZR::DHCPClientProvider
