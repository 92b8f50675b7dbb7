#pragma once

#include <cmpidt.h>

#include <optional>
#include <string>
#include <vector>

#include "cimom/Instance.h"
#include "kit/ReadOperation.h"

/// One description of what clients ask and of what they are to get, for every object
/// manager that the providers can be in.
namespace conformance {

using Texts = std::vector<std::string>;
using Name = std::optional<std::string>;

using Operation = test::ReadOperation;

inline constexpr const char* nameSpace = "root/cimv2";

struct Request {
    Operation operation = Operation::enumerateNames;
    cimom::ObjectPath path = {};  ///< a class's for enumerations
    // What of associations is wanted; nothing restricts nothing.
    Name association = {};
    Name resultClass = {};  ///< of associators only
    Name role = {};
    Name resultRole = {};  ///< of associators only
    std::optional<Texts> properties = {};

    /// For messages.
    [[nodiscard]] std::string text() const;
};

struct Response {
    CMPIrc code = CMPI_RC_OK;
    std::string message;
    std::vector<cimom::ObjectPath> paths;
    std::vector<cimom::Instance> instances;
};

[[nodiscard]] bool asksForNames(Operation operation) noexcept;

/// The same text for every way to write the same path: without host, with keys by name.
[[nodiscard]] std::string textOf(const cimom::ObjectPath& path);
/// The path and the properties with a value, by name, with their types. A property that is
/// null and one that is absent are the same to a client.
[[nodiscard]] std::string textOf(const cimom::Instance& instance);
/// The objects of a response, each as a text, in the order of the texts: object managers
/// have orders of their own.
[[nodiscard]] Texts textsOf(const Response& response);

}  // namespace conformance
