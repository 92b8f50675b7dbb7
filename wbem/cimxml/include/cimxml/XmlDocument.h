#pragma once

#include <cstddef>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace cimom::wbem {

/// One element with all that is in it. Character data directly in the element is
/// one text, whatever stands between its parts; white space counts.
struct XmlElement {
    std::string name;
    std::vector<std::pair<std::string, std::string>> attributes;
    std::vector<XmlElement> children;
    std::string text;

    /// Null when the element has no such attribute. Names are exact, as in XML.
    [[nodiscard]] const std::string* attribute(std::string_view wanted) const noexcept;

    bool operator==(const XmlElement&) const = default;
};

/// A text that is not an acceptable XML document; what() tells line and reason.
class XmlError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// Reads a whole XML 1.0 document in UTF-8, whatever encoding it names. Throws
/// XmlError when it is not well-formed, has a document type declaration (and so
/// might define entities), or nests its elements deeper than `maximumDepth`.
[[nodiscard]] XmlElement readXml(std::string_view text, std::size_t maximumDepth);

}  // namespace cimom::wbem
