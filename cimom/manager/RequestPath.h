#pragma once

#include <string>
#include <vector>

#include "cimom/Forward.h"
#include "cimom/Status.h"

namespace cimom {

/// A namespace without slashes before and behind it.
[[nodiscard]] std::string plainNameSpace(const std::string& nameSpace);

/// The namespace that a client means, as it is spelled among the known ones; null: none of
/// them. "interop", which standards have clients try first, stands for "root/interop".
[[nodiscard]] const std::string* knownNameSpace(const std::string& wanted,
                                                const std::vector<std::string>& nameSpaces);

/// Gives the references among the values the canonical spelling of their namespaces, so that
/// they agree with paths of the same object that came by another name of the namespace.
void canonicalizeReferences(std::vector<NamedValue>& values,
                            const std::vector<std::string>& nameSpaces);

/// Brings a client's path into the form that providers get: namespace and class
/// in their canonical spelling, key values in the types that the class declares
/// (text clients write references and datetimes as texts, and integers without
/// size). The status is CMPI_RC_ERR_INVALID_NAMESPACE, CMPI_RC_ERR_INVALID_CLASS,
/// or CMPI_RC_ERR_INVALID_PARAMETER for a key value that cannot be of its type.
[[nodiscard]] Status canonicalize(ObjectPath& path, const ClassRepository& repository,
                                  const std::vector<std::string>& nameSpaces);

/// INVALID_PARAMETER when a text of the instance's properties holds a control
/// character (below 0x20, or 0x7f): no administrator means one.
[[nodiscard]] Status checkTexts(const Instance& instance);

}  // namespace cimom
