#pragma once

#include <optional>
#include <string>
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

/// Shows every key of that name to `visit(position, value)`, until it answers true.
/// Names compare exactly.
template <typename Visit>
void visitKeys(Moniker& moniker, const char* name, const Visit& visit) {
    const std::size_t count = moniker.getKeyCount();
    for (std::size_t position = 0; position < count; ++position) {
        std::string keyName;
        std::string value;
        if (moniker.selectKey(position) && moniker.getName(keyName) && keyName == name &&
            moniker.getValue(value) && visit(position, std::move(value))) {
            return;
        }
    }
}

/// Which of several keys of one name counts.
enum class Occurrence { first, last };

/// The value of a key. Each that is read is traced under the key's name.
std::optional<std::string> findKey(Moniker& moniker, const char* name, Occurrence occurrence,
                                   const TracePoint& at);

/// The value of the first key of that name; throws FrameworkException with the
/// message when there is none.
std::string requireKey(Moniker& moniker, const char* name, const char* message,
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
