#pragma once

#include <cstddef>
#include <limits>
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

/// Memory that a document of such a length may well take: its elements are as long as those of
/// CIM-XML, on the whole. A short element takes many times its length.
[[nodiscard]] constexpr std::size_t usualMemory(std::size_t length) noexcept {
    constexpr std::size_t least = 65536;
    constexpr std::size_t times = 16;
    return least + times * length;
}

/// Reads a whole XML 1.0 document in UTF-8, whatever encoding it names. Throws
/// XmlError when it is not well-formed, has a document type declaration (and so
/// might define entities), nests its elements deeper than `maximumDepth`, or whose
/// elements would take more than some `maximumMemory` bytes.
[[nodiscard]] XmlElement readXml(
    std::string_view text, std::size_t maximumDepth,
    std::size_t maximumMemory = std::numeric_limits<std::size_t>::max());

}  // namespace cimom::wbem
