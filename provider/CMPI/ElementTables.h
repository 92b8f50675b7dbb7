#pragma once

#include <cmpift.h>

#include <span>
#include <string>
#include <vector>

#include "include/TracePoint.h"
#include "providerutilities/ProviderUtilities.h"

/// What the element adapters know of their classes, as tables (the keys that become
/// filters, the keys of the object path, the properties of the instance), and the
/// walks over these.
namespace ZR::DHCPClientProvider {

/// A key of an incoming path that becomes a filter of the element.
template <typename Element>
struct FilterKey {
    const char* name;
    typename Element::FilterType type;
    bool traced;
};

/// A key of the object path; `get` returns false when the element has no value for it.
template <typename Element>
struct PathKey {
    const char* name;
    bool (Element::*get)(std::string&) const;
    const char* tracedAs;  ///< null: not traced
};

/// A property of the instance; `set` asks the element and sets the value that it gets.
template <typename Element>
struct ElementProperty {
    const char* name;
    void (*set)(const CMPIBroker* mb, CMPIInstance* instance, const char* name,
                const Element& element);
};

/// All that distinguishes one element class from the others. Of static lifetime.
template <typename Element>
struct ElementClass {
    std::span<const FilterKey<Element>> filterKeys;
    std::span<const PathKey<Element>> pathKeys;
    std::span<const ElementProperty<Element>> properties;
};

// Rows of the property tables. The type of a property is that of its getter's
// output; each getter is handed a fresh value, empty, 0 or false.

template <typename Getter>
struct GetterOf;
template <typename E, typename Output>
struct GetterOf<bool (E::*)(Output&) const> {
    using Element = E;
    using Value = Output;
};

template <auto getter>
using ElementOf = typename GetterOf<decltype(getter)>::Element;
template <auto getter>
using ValueOf = typename GetterOf<decltype(getter)>::Value;

/// A property that is set when its getter succeeds.
template <auto getter>
constexpr ElementProperty<ElementOf<getter>> property(const char* propertyName) {
    return {propertyName, [](const CMPIBroker* mb, CMPIInstance* instance, const char* name,
                             const ElementOf<getter>& element) {
                ValueOf<getter> value{};
                if (!(element.*getter)(value)) {
                    return;
                }
                if constexpr (requires { typename ValueOf<getter>::value_type; } &&
                              !std::is_same_v<ValueOf<getter>, std::string>) {
                    ProviderUtilities::setProperty(mb, instance, name, value);
                } else {
                    ProviderUtilities::setProperty(instance, name, value);
                }
            }};
}

/// A property of type datetime.
template <auto getter>
constexpr ElementProperty<ElementOf<getter>> dateTime(const char* propertyName) {
    return {propertyName, [](const CMPIBroker* mb, CMPIInstance* instance, const char* name,
                             const ElementOf<getter>& element) {
                std::string value;
                if ((element.*getter)(value)) {
                    ProviderUtilities::setProperty(mb, instance, name, value, true);
                }
            }};
}

/// A text property that is not set when it is empty.
template <auto getter>
constexpr ElementProperty<ElementOf<getter>> nonEmptyText(const char* propertyName) {
    return {propertyName, [](const CMPIBroker* /*mb*/, CMPIInstance* instance, const char* name,
                             const ElementOf<getter>& element) {
                std::string value;
                if ((element.*getter)(value) && !value.empty()) {
                    ProviderUtilities::setProperty(instance, name, value);
                }
            }};
}

/// Turns the path's keys into filters. A path without keys, or none at all,
/// leaves the element as it is, and so does each key that the path lacks.
template <typename Element>
void filterByKeys(Element& element, const CMPIObjectPath* objectPath,
                  std::span<const FilterKey<Element>> keys, const TracePoint& at) {
    if (static_cast<unsigned short>(ProviderUtilities::getKeyCount(objectPath)) == 0) {
        return;
    }
    for (const FilterKey<Element>& key : keys) {
        std::string value;
        if (!ProviderUtilities::getKeyProperty(objectPath, key.name, value)) {
            continue;
        }
        if (key.traced) {
            traceVariable(at, key.name, value);
        }
        element.setFilter(key.type, value);
    }
}

/// Makes the object path of the element's present record; null when it stands on
/// none, or the broker makes none. The path belongs to the broker.
template <typename Element>
CMPIObjectPath* makeObjectPath(const CMPIBroker* mb, const char* className,
                               const std::string& nameSpace, const Element& element,
                               std::span<const PathKey<Element>> keys, const TracePoint& at) {
    CMPIObjectPath* path = element.isOnRecord()
                               ? ProviderUtilities::createObjectPath(mb, className, nameSpace)
                               : nullptr;
    if (path == nullptr) {
        return nullptr;
    }
    for (const PathKey<Element>& key : keys) {
        std::string value;
        if (!(element.*key.get)(value)) {
            continue;
        }
        if (key.tracedAs != nullptr) {
            traceVariable(at, key.tracedAs, value);
        }
        ProviderUtilities::setKeyProperty(path, key.name, value);
    }
    return path;
}

/// Makes the instance of a path and sets all that the element can tell; null when
/// the broker makes none. The instance belongs to the broker.
template <typename Element>
CMPIInstance* makeInstance(const CMPIBroker* mb, const CMPIObjectPath* path, const Element& element,
                           std::span<const ElementProperty<Element>> properties) {
    CMPIInstance* instance = ProviderUtilities::createInstance(mb, path);
    if (instance != nullptr) {
        for (const ElementProperty<Element>& property : properties) {
            property.set(mb, instance, property.name, element);
        }
    }
    return instance;
}

}  // namespace ZR::DHCPClientProvider
