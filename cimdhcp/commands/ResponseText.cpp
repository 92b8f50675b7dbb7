#include "commands/ResponseText.h"

#include <algorithm>

#include "cimom/ObjectPathText.h"
#include "text/DisplayText.h"
#include "text/InstanceMeanings.h"

namespace cimdhcp {

namespace {

/// Narrower than this, broken values read worse than ones that the terminal breaks.
constexpr std::size_t narrowestValue = 20;

std::string block(const cimom::Instance& instance, const cimom::ClassDeclaration* declaration,
                  std::optional<std::size_t> width, const Style& style) {
    std::size_t longest = 0;
    for (const cimom::NamedValue& property : instance.properties) {
        if (!property.value.isNull()) {
            longest = std::max(longest, property.name.size());
        }
    }
    const std::size_t indentation = 2 + longest + 3;
    std::string text = style.strong(printable(cimom::toText(instance.path))) + '\n';
    for (const cimom::NamedValue& property : instance.properties) {
        if (property.value.isNull()) {
            continue;
        }
        const std::string value = printable(valueWithMeaning(declaration, property));
        const bool wrap = width && *width >= indentation + narrowestValue;
        text += "  " + property.name + std::string(longest - property.name.size(), ' ') + " = ";
        const std::vector<std::string> lines =
            wrap ? wrapToWidth(value, *width - indentation) : std::vector{value};
        for (std::size_t line = 0; line < lines.size(); ++line) {
            text +=
                (line == 0 ? std::string() : std::string(indentation, ' ')) + lines[line] + '\n';
        }
    }
    return text;
}

}  // namespace

std::string asTable(const Answer& answer, const ClassLookup& classes,
                    std::optional<std::size_t> width, const Style& style) {
    std::string text;
    for (const auto& path : answer.paths) {
        text += path ? printable(cimom::toText(*path)) : "(null)";
        text += '\n';
    }
    for (const auto& instance : answer.instances) {
        text += text.empty() ? "" : "\n";
        text += instance ? block(*instance, classes.find(instance->path.className), width, style)
                         : "(null)\n";
    }
    return text;
}

}  // namespace cimdhcp
