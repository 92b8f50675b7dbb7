#pragma once

#include <string>
#include <vector>

#include "cimxml/XmlDocument.h"

namespace cimom::test {

/// What is wrong with the element or anything in it, by the element structure of
/// DSP0203 2.3.1: unknown elements, children that do not belong or stand in the
/// wrong order, attributes that are unknown, missing, or of another than the
/// enumerated values, text where only elements may be. Empty: nothing.
[[nodiscard]] std::vector<std::string> violations(const wbem::XmlElement& element);

}  // namespace cimom::test
