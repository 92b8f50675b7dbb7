#pragma once

#include <cmpift.h>

#include <cstdint>
#include <functional>
#include <span>
#include <string>

#include "CMPI/ElementTables.h"
#include "include/TracePoint.h"
#include "providerutilities/Classes.h"
#include "providerutilities/ProviderUtilities.h"
#include "zrclient/Moniker.h"
#include "zrcommon/Strings.h"

namespace ZR::DHCPClientProvider {

/// One of the two ends of an association class, in the order of its schema.
enum class End { first, second };

/// On what of an association class a source path stands.
enum class Source { first, second, association, none };

template <typename Row>
class AssociationAdapter;

/// What an association class says of one of its ends.
template <typename Row>
struct AssociationEnd {
    const char* role;
    /// The path of the end by the path of the other one: AssociationAdapter::locate with
    /// an operation of the record.
    CMPIObjectPath* (*locate)(AssociationAdapter<Row>& adapter, const CMPIObjectPath* objectPath);
};

/// Where the second of the two reference keys of an association path comes from:
/// the end's own path, or the one that is located from the first.
enum class Reference { own, located };

// The usual steps of a walk over an association class, with itself as the source.

/// Places the far end of the walked one on what belongs to its present instance. The
/// source path is not looked at.
template <typename Row>
void placeFromWalked(AssociationAdapter<Row>& adapter, const CMPIObjectPath* objectPath);

/// Whether the walked end stands on an instance.
template <typename Row>
bool walkedStands(AssociationAdapter<Row>& adapter);

template <typename Row>
void stepWalked(AssociationAdapter<Row>& adapter);

/// All that distinguishes one association class from the others, as a table. Of
/// static lifetime. What has a default is the same for most classes; the compiler warns
/// of a row without one of the others.
template <typename Row>
// NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init)
struct AssociationClass {
    using Adapter = AssociationAdapter<Row>;
    using First = typename Row::First;

    AssociationEnd<Row> first;
    AssociationEnd<Row> second;
    std::span<const ElementProperty<typename Row::Record>> ownProperties = {};

    // The walk when the source is the association class.
    End walked;
    void (*place)(Adapter& adapter, const CMPIObjectPath* objectPath) = &placeFromWalked<Row>;
    bool (*stands)(Adapter& adapter) = &walkedStands<Row>;
    void (*step)(Adapter& adapter) = &stepWalked<Row>;

    // The reference keys of a path.
    End referencedFirst = walked;  ///< the key that is set first, from the end's own path
    Reference other = Reference::located;

    // How the first end is placed when either end is the source: on all instances of the
    // path's class or on the one that the path names.
    void (First::*placeFirstAsSource)(const CMPIObjectPath*) = &First::setObjectPath;
    void (First::*placeFirstLocated)(const CMPIObjectPath*) = &First::setObjectPath;
};

/// Serves one association class from one source path: finds out on which end the
/// source stands, places its two end adapters so that walking them yields the far
/// end (or the pairs of ends, when the source is the association class), and goes
/// from one end to the other through its association record.
///
/// An association adapter is built for one request from the path that the client
/// names, and walked: operator bool is asked exactly once per step. What it hands
/// out belongs to the broker, which may also refuse: the result is then null.
/// Exceptions of its ends and of its record pass. Used by one thread.
///
/// A row has the types First, Second (adapters of the ends) and Record and, as static
/// members:
///   Classes::Class servedClass
///   RowSource trace
///   AssociationClass<Row> associationClass
template <typename Row>
class AssociationAdapter {
  public:
    using First = typename Row::First;
    using Second = typename Row::Second;
    using Record = typename Row::Record;
    static constexpr const Classes::Class& servedClass = Row::servedClass;

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

    // For the steps of the rows.

    First& first() { return first_; }
    Second& second() { return second_; }

    /// The path of an end by the path of the other one: through `find`, an operation of
    /// the record or what takes one's place, when that path has keys; else, or when the
    /// moniker found cannot be turned into a path, one of the end's class without keys,
    /// which stands for all its instances.
    template <End end, typename Find>
    CMPIObjectPath* locate(const TracePoint& at, const CMPIObjectPath* objectPath,
                           const Find& find);

  private:
    [[nodiscard]] Source source() const {
        if (requestedClassId_ == First::servedClass.id) {
            return Source::first;
        }
        if (requestedClassId_ == Second::servedClass.id) {
            return Source::second;
        }
        return requestedClassId_ == servedClass.id ? Source::association : Source::none;
    }

    /// What `ask` returns for the end that is far from the source; null without one.
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

    /// The path of an end on which that end stands.
    [[nodiscard]] CMPIObjectPath* ownPath(End end) const {
        return end == End::first ? first_.getObjectPath() : second_.getObjectPath();
    }

    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    std::int32_t requestedClassId_;  ///< of the source path
    First first_;
    Second second_;
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
    const auto& ours = Row::associationClass;
    switch (source()) {
        case Source::first:
            second_.setObjectPath(ours.second.locate(*this, objectPath));
            (first_.*ours.placeFirstAsSource)(objectPath);
            break;
        case Source::second:
            (first_.*ours.placeFirstLocated)(ours.first.locate(*this, objectPath));
            second_.setObjectPath(objectPath);
            break;
        case Source::association:
            ours.place(*this, objectPath);
            break;
        case Source::none:
            break;
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
            return Row::associationClass.stands(*this);
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
            Row::associationClass.step(*this);
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
    const Classes::Class& far = from == Source::first ? Second::servedClass : First::servedClass;
    return !equalNames(resultClass, far.name) && !equalNames(resultClass, far.standardName);
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
    CMPIObjectPath* path =
        ProviderUtilities::createObjectPath(_broker, servedClass.name, _namespace);
    if (path == nullptr) {
        return nullptr;
    }
    const bool startsWithFirst = ours.referencedFirst == End::first;
    const auto& begin = startsWithFirst ? ours.first : ours.second;
    const auto& other = startsWithFirst ? ours.second : ours.first;
    CMPIObjectPath* reference = ownPath(ours.referencedFirst);
    ProviderUtilities::setKeyProperty(path, begin.role, reference);
    reference = ours.other == Reference::located
                    ? other.locate(*this, reference)
                    : ownPath(startsWithFirst ? End::second : End::first);
    ProviderUtilities::setKeyProperty(path, other.role, reference);
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
template <End end, typename Find>
CMPIObjectPath* AssociationAdapter<Row>::locate(const TracePoint& at,
                                                const CMPIObjectPath* objectPath,
                                                const Find& find) {
    constexpr const Classes::Class& located =
        end == End::first ? First::servedClass : Second::servedClass;
    const ParameterScope scope(at, " objectPath=", objectPath);
    CMPIObjectPath* result = ProviderUtilities::createObjectPath(_broker, located.name, _namespace);
    if (ProviderUtilities::getKeyCount(objectPath) != 0) {
        Moniker moniker;
        ProviderUtilities::transformObjectPathToMoniker(objectPath, moniker);
        Moniker far = std::invoke(find, record_, moniker);
        ProviderUtilities::transformMonikerToObjectPath(far, &result);
    }
    return result;
}

template <typename Row>
void placeFromWalked(AssociationAdapter<Row>& adapter, const CMPIObjectPath* /*objectPath*/) {
    const auto& ours = Row::associationClass;
    const auto place = [&adapter](auto& walked, auto& far, const auto& farEnd) {
        if (walked) {
            far.setObjectPath(farEnd.locate(adapter, walked.getObjectPath()));
        }
    };
    if (ours.walked == End::first) {
        place(adapter.first(), adapter.second(), ours.second);
    } else {
        place(adapter.second(), adapter.first(), ours.first);
    }
}

template <typename Row>
bool walkedStands(AssociationAdapter<Row>& adapter) {
    return Row::associationClass.walked == End::first ? static_cast<bool>(adapter.first())
                                                      : static_cast<bool>(adapter.second());
}

template <typename Row>
void stepWalked(AssociationAdapter<Row>& adapter) {
    if (Row::associationClass.walked == End::first) {
        ++adapter.first();
    } else {
        ++adapter.second();
    }
}

}  // namespace ZR::DHCPClientProvider
