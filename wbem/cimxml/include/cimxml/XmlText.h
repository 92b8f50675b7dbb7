#pragma once

#include <string>
#include <string_view>

namespace cimom::wbem {

/// Appends a text as character data of an element. Carriage returns are written as
/// references, since a reader takes bare ones for line ends. What XML 1.0 cannot
/// hold (most control characters, U+FFFE, U+FFFF, bytes that are not UTF-8) becomes
/// U+FFFD, so that no value can spoil the document around it.
void appendText(std::string& out, std::string_view text);

/// The same within a quoted attribute value: quotation marks, line feeds and tabs
/// are written as references, too.
void appendAttributeText(std::string& out, std::string_view text);

/// Appends ` NAME="VALUE"`. The name is written as it is.
void appendAttribute(std::string& out, std::string_view name, std::string_view value);

}  // namespace cimom::wbem
