#pragma once

#include <cmpift.h>

#include <string>
#include <utility>

#include "CMPI/ElementTables.h"
#include "include/TracePoint.h"
#include "providerutilities/Classes.h"
#include "providerutilities/ProviderUtilities.h"

namespace ZR::DHCPClientProvider {

/// Serves the elements of one class as instances.
///
/// An element adapter is built for one request and walked: while it is true, ask
/// it for an object path or an instance, and step on. What it hands out belongs to
/// the broker, which may also refuse: the result is then null. It borrows broker
/// and context, and lets the exceptions of its element pass. Used by one thread.
///
/// A row has the type Element and, as static members, Classes::Class servedClass,
/// RowSource trace and ElementClass<Element> elementClass. One whose instances can be changed has
/// modify(element, newInstance) besides, which returns a CMPIStatus.
template <typename Row>
class ElementAdapter {
  public:
    static constexpr const Classes::Class& servedClass = Row::servedClass;

    /// Stands on the first of all instances in a namespace.
    ElementAdapter(const CMPIBroker* mb, const CMPIContext* context, std::string nameSpace)
        : _broker(mb), _context(context), _namespace(std::move(nameSpace)) {
        traceMethod(Row::trace.constructor());
    }

    /// Stands on the first instance that a path names, in the path's namespace.
    ElementAdapter(const CMPIBroker* mb, const CMPIContext* context,
                   const CMPIObjectPath* objectPath)
        : _broker(mb), _context(context), _namespace(ProviderUtilities::getNamespace(objectPath)) {
        const ParameterScope scope(Row::trace.constructor(), " _broker=", _broker,
                                   " _context=", _context, " objectPath=", objectPath);
        setObjectPath(objectPath);
    }

    ~ElementAdapter() { traceMethod(Row::trace.destructor()); }
    ElementAdapter(const ElementAdapter&) = delete;
    ElementAdapter& operator=(const ElementAdapter&) = delete;

    /// Narrows the walk to the keys of the path that are filters of the class, as
    /// far as it has them. Filters add up; none is ever taken away.
    void setObjectPath(const CMPIObjectPath* objectPath) {
        const TracePoint at = Row::trace.at(__func__);
        const ParameterScope scope(at, " objectPath=", objectPath);
        filterByKeys(element_, objectPath, Row::elementClass.filterKeys, at);
    }

    explicit operator bool() {
        traceMethod(Row::trace.at(__func__));
        return static_cast<bool>(element_);
    }

    void operator++() {
        traceMethod(Row::trace.at(__func__));
        ++element_;
    }

    [[nodiscard]] CMPIObjectPath* getObjectPath() const {
        const TracePoint at = Row::trace.at(__func__);
        const TraceScope scope(at);
        return makeObjectPath(_broker, Row::servedClass.name, _namespace, element_,
                              Row::elementClass.pathKeys, at);
    }

    /// The property list is not looked at: an instance always has all that is known.
    CMPIInstance* getCMPIInstance(const char** properties) const {
        const ParameterScope scope(Row::trace.at(__func__), " properties=", properties);
        return makeInstance(_broker, getObjectPath(), element_, Row::elementClass.properties);
    }

    /// Writes what may be changed of the new instance to the element on which the
    /// adapter stands. CMPI_RC_ERR_FAILED when there is no new instance, or the
    /// element refuses.
    template <typename Changed = Row>
    CMPIStatus modifyInstance(const CMPIInstance* newInstance) {
        const ParameterScope scope(Row::trace.at(__func__), " newInstance=", newInstance);
        return Changed::modify(element_, newInstance);
    }

  private:
    const CMPIBroker* _broker;
    const CMPIContext* _context;
    std::string _namespace;
    typename Row::Element element_;
};

}  // namespace ZR::DHCPClientProvider
