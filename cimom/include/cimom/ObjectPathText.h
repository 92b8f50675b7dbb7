#pragma once

#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>

#include "cimom/ObjectPath.h"
#include "cimom/Value.h"

namespace cimom {

/// A text that is not an object path; what() tells what is wrong and where.
class ObjectPathError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// Reads the text form of DSP0207: [//host/][namespace:]Class[.key=value,...].
/// String values in double quotes with \\ and \" escapes; integers, reals and
/// TRUE/FALSE bare; a reference is a quoted path and is read as a string (its
/// class tells; see ObjectManager). Throws ObjectPathError.
[[nodiscard]] ObjectPath parseObjectPath(std::string_view text);

/// Writes that form, keys in their order; no host, no leading slash:
/// root/cimv2:QVXZR_DHCPSettingData.InstanceID="Computer%eth0".
[[nodiscard]] std::string toText(const ObjectPath& path);

/// The text that a key's value has in that form: "old \"x\"", 42, 1.5, TRUE, and the
/// quoted text of a reference. Nothing for null and embedded instances.
[[nodiscard]] std::optional<std::string> scalarText(const Scalar& scalar);

}  // namespace cimom
