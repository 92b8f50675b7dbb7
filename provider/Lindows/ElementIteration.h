#pragma once

#include <string>
#include <utility>
#include <vector>

#include "include/TracePoint.h"
#include "zrclient/Instrumentation.h"
#include "zrclient/NodeLexicon.h"

/// What the four element iterators share. Each is a plain class with a cursor on
/// the network interfaces, a list of filters and a flag that there are any; these
/// are the steps that more than one of them takes.
namespace ZR::DHCPClientProvider {

/// The description of the node two levels above the cursor's; empty when it cannot
/// be read. Traced as a variable of the name given.
std::string readSystemDescription(const Instrumentation& cursor, const TracePoint& at,
                                  const char* variable);

/// The class of the computer that a description stands for.
const char* systemClassOf(const std::string& systemDescription);

/// The host name from the kernel. False, with the output left as it was and a
/// failure line written, when the kernel does not tell it.
bool readHostName(std::string& name, const TracePoint& at);

/// Moves the cursor past interfaces whose DHCP flag is false or unreadable; true
/// when it then stands on one.
bool skipToDHCPInterface(Instrumentation& cursor);

/// Takes one more filter; earlier ones stay.
template <typename Filter, typename Type, typename Reference>
void addFilter(bool& filtered, std::vector<Filter>& filters, Type type, Reference&& reference) {
    filtered = true;
    filters.push_back({type, std::forward<Reference>(reference)});
}

/// Moves the cursor to the first interface from its present one on for which the
/// element's filters hold. The DHCP flag does not matter here.
template <typename Element>
void searchOnward(Instrumentation& cursor, const Element& element) {
    while (cursor && !element.evaluate()) {
        ++cursor;
    }
}

/// Moves on by one interface, and to the next for which the filters hold if there are any.
template <typename Element>
void stepOnward(Instrumentation& cursor, bool filtered, const Element& element) {
    ++cursor;
    if (filtered) {
        searchOnward(cursor, element);
    }
}

/// Whether a filter's reference equals what the element has; traces both.
bool equalsReference(const std::string& actual, const std::string& reference, const TracePoint& at);

/// Whether every filter of the one type that compares the InstanceID holds.
template <typename Filter, typename Element, typename Type>
bool holdsByInstanceID(const std::vector<Filter>& filters, const Element& element, Type compared,
                       const TracePoint& at) {
    for (const Filter& filter : filters) {
        if (filter.type != compared) {
            continue;
        }
        std::string actual;
        element.getInstanceID(actual);
        if (!equalsReference(actual, filter.reference, at)) {
            return false;
        }
    }
    return true;
}

// The shapes of getters. Each traces its entry and exit with the output's address.

/// A property that the element does not support.
bool unsupported(const TracePoint& at, const void* output);

/// A property that has the same value for every element.
template <typename Output, typename Constant>
bool constant(const TracePoint& at, Output& output, const Constant& value) {
    const ParameterScope scope(at, " value=", &output);
    output = value;
    return true;
}

/// A property that the node has; false when it cannot be read.
template <typename Output>
bool fromNode(const TracePoint& at, const Instrumentation& cursor, NodeLexicon::Properties id,
              Output& output) {
    const ParameterScope scope(at, " value=", &output);
    return cursor.getProperty(id, output);
}

/// The DHCP options that a client asks for and supports: domain name server, host
/// name and domain name, as option code plus 2 (the value map of the CIM classes).
/// Appends to what the output holds.
bool appendOptions(const TracePoint& at, std::vector<unsigned short>& output);

}  // namespace ZR::DHCPClientProvider
