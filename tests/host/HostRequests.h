#pragma once

#include <string>
#include <vector>

#include "cimom/ObjectManager.h"
#include "kit/ReadOperation.h"
#include "kit/StrictHost.h"

/// Requests that are put to the embedded object manager and to the strict host alike,
/// and their responses as text, so that the two can be compared.
namespace strict {

using Texts = std::vector<std::string>;

using Operation = test::ReadOperation;

struct HostRequest {
    Operation operation;
    cimom::ObjectPath path;
    std::string association;  ///< of association requests; empty: none named

    [[nodiscard]] std::string name() const;
};

/// The status and, sorted, what came. A get that came to nothing is "not found" in
/// both: what an object manager's client sees of it.
Texts ask(cimom::ObjectManager& manager, const HostRequest& request);
Texts ask(StrictHost& host, const HostRequest& request, const char** properties = nullptr);

/// Every request for the classes and the instances that the manager's providers serve.
std::vector<HostRequest> allRequests(cimom::ObjectManager& manager);

}  // namespace strict
