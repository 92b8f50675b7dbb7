#pragma once

#include <ostream>
#include <string>
#include <vector>

#include "kit/Host.h"

namespace test {

enum class Operation {
    enumerateNames,
    enumerate,
    get,
    modify,
    associatorNames,
    associators,
    referenceNames,
    references,
};

/// One request to the provider's tables, as a row of a list.
struct Request {
    Operation operation;
    std::string path;                   ///< as text, with this host's name for "@"
    const char* association = nullptr;  ///< of association requests; null: none named

    /// Whether the request is one of the instance interface.
    [[nodiscard]] bool isOfInstances() const { return operation <= Operation::modify; }
    /// "associators of CLASS... through CLASS".
    [[nodiscard]] std::string name() const;
    /// The same without keys, as an identifier: "associatorsOfComputerSystemThrough...".
    [[nodiscard]] std::string identifier() const;
};

inline std::ostream& operator<<(std::ostream& out, const Request& request) {
    return out << request.identifier();
}

/// Runs the request. A modify writes the configuration name "new".
Host::Response run(Host& host, const Request& request);

/// An association class and a path of each of its ends, for the machine of this list:
/// of the interface eth0 and of its one server at an IPv4 address.
struct AssociationSources {
    const char* association;
    std::string first;
    std::string second;
};
const std::vector<AssociationSources>& associationSources();

/// The four element classes, and a path of each for the interface eth0.
struct ElementSource {
    const char* className;
    std::string path;
};
const std::vector<ElementSource>& elementSources();

/// Every request that names a class or a path of the lists above: enumerations and
/// gets of all classes, a modify, and the four association requests from both ends
/// of each association.
std::vector<Request> allRequests();

}  // namespace test
