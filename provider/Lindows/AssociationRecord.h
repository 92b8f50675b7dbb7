#pragma once

#include <algorithm>
#include <array>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "include/Exceptions.h"
#include "include/TracePoint.h"
#include "zrclient/Instrumentation.h"
#include "zrclient/Moniker.h"

/// What the association records share. A record knows how the two ends of one
/// association class belong together: each of its builders takes the moniker of
/// one end and returns that of the other.
///
/// A builder throws FrameworkException when the given moniker is malformed or has
/// no partner, and InstrumentationException when a node or property cannot be
/// had; nothing is traced for that, and no partly built moniker ever leaves it.
/// Builders move the record's cursor: one record is used by one request.
namespace ZR::DHCPClientProvider {

/// Shows every key to `visit(position, name)`, in the moniker's order, until that returns
/// true. The moniker stands on the key shown, so that its value can be read.
template <typename Visit>
void visitKeys(Moniker& moniker, const Visit& visit) {
    const std::size_t count = moniker.getKeyCount();
    for (std::size_t position = 0; position < count; ++position) {
        std::string name;
        if (moniker.selectKey(position) && moniker.getName(name) && visit(position, name)) {
            return;
        }
    }
}

// Names of keys compare exactly. The value of each key that is read is traced under the
// key's name.

/// The value of the first key of that name.
std::optional<std::string> findKey(Moniker& moniker, std::string_view name, const TracePoint& at);

/// The values of several keys, found in one walk over all keys. Of several keys of one
/// name the last counts.
template <std::size_t count>
std::array<std::optional<std::string>, count> findKeys(
    Moniker& moniker, const std::array<std::string_view, count>& names, const TracePoint& at) {
    std::array<std::optional<std::string>, count> values;
    visitKeys(moniker, [&](std::size_t, const std::string& name) {
        std::string value;
        const auto wanted = std::find(names.begin(), names.end(), name);
        if (wanted != names.end() && moniker.getValue(value)) {
            traceVariable(at, name, value);
            values[static_cast<std::size_t>(wanted - names.begin())] = std::move(value);
        }
        return false;
    });
    return values;
}

/// The value of the first key of that name; throws FrameworkException with the
/// message when there is none.
std::string requireKey(Moniker& moniker, std::string_view name, const char* message,
                       const TracePoint& at);

/// A moniker with one key.
Moniker monikerOf(const char* name, const std::string& value);

/// Walks an element iterator or a cursor to the first element that `matches`; false
/// when it runs out.
template <typename Element, typename Matches>
bool walkTo(Element& element, const Matches& matches) {
    for (; element; ++element) {
        if (matches(element)) {
            return true;
        }
    }
    return false;
}

/// Walks a cursor over all nodes of a type in the same way.
template <typename Matches>
bool walkTo(Instrumentation& cursor, NodeLexicon::NodeType type, const Matches& matches) {
    cursor.selectNode(type);
    return walkTo(cursor, matches);
}

/// Whether a text getter of an element succeeds with this value.
template <typename Element>
bool has(const Element& element, bool (Element::*getter)(std::string&) const,
         const std::string& value) {
    std::string actual;
    return (element.*getter)(actual) && actual == value;
}

/// The moniker of the computer whose name is the "SystemName" of the given end.
/// A computer without a readable name ends the search, even if a later one would match.
Moniker findSystemMoniker(Instrumentation& cursor, Moniker& known, const TracePoint& at);

/// The part of an access point's name before its last "_": the interface name.
/// Throws FrameworkException when there is no "_". Traced.
std::string interfaceOfAccessPoint(const std::string& accessPointName, const TracePoint& at);

}  // namespace ZR::DHCPClientProvider
