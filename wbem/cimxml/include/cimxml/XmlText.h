#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "cimom/Value.h"

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

/// Appends a value as the text that VALUE and KEYVALUE hold (DSP0201, 5.2.4 and
/// 5.2.6), escaped for XML: numbers in decimal, TRUE and FALSE, reals with a point
/// and as many digits as bring the same number back, INF, -INF and NaN, one
/// character, 25 characters of a datetime. Writes nothing for null, references and
/// instances, which are not texts. `type` tells how many digits a real needs.
void appendScalarText(std::string& out, Type type, const Scalar& scalar);

/// Reads such a text as a value of the type; hexadecimal integers ("0x1F") are
/// accepted, white space only in texts. Nothing when the text is not a value of the
/// type, or the type is one whose values are not texts.
[[nodiscard]] std::optional<Scalar> readScalarText(Type type, std::string_view text);

/// Reads the text of a number whose type is not known: an unsigned integer, else a
/// signed one, else a real64.
[[nodiscard]] std::optional<Value> readNumberText(std::string_view text);

}  // namespace cimom::wbem
