#include "commands/ResponseText.h"

#include <algorithm>
#include <cstdint>
#include <utility>

#include "cimom/ClassDeclaration.h"
#include "cimom/ObjectPathText.h"
#include "client/Response.h"
#include "client/StatusMessage.h"
#include "text/DisplayText.h"
#include "text/JsonText.h"
#include "text/MofText.h"
#include "text/ValueMeaning.h"

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

std::string declaration(const std::string& className, const std::vector<cimom::NamedValue>& values,
                        const cimom::ClassDeclaration* known) {
    std::size_t longest = 0;
    for (const cimom::NamedValue& value : values) {
        longest = std::max(longest, value.name.size());
    }
    std::string text = "instance of " + className + " {\n";
    for (const cimom::NamedValue& value : values) {
        text += "    " + value.name + std::string(longest - value.name.size(), ' ') + " = " +
                mofInitializer(value.value) + ';';
        const std::string meaning = meaningOf(known, value);
        // A line feed would end the comment.
        text += meaning.empty() ? "\n" : "  // " + printable(meaning) + '\n';
    }
    return text + "};\n";
}

}  // namespace

std::string asTable(const Response& response, const ClassLookup& classes,
                    std::optional<std::size_t> width, const Style& style) {
    std::string text;
    for (const auto& path : response.paths) {
        text += path ? printable(cimom::toText(*path)) : "(null)";
        text += '\n';
    }
    for (const auto& instance : response.instances) {
        text += text.empty() ? "" : "\n";
        text += instance ? block(*instance, classes.find(instance->path.className), width, style)
                         : "(null)\n";
    }
    return text;
}

std::string asMof(const Response& response, const ClassLookup& classes) {
    std::string text;
    const auto add = [&](const std::string& part) { text += (text.empty() ? "" : "\n") + part; };
    for (const auto& path : response.paths) {
        add(path ? declaration(path->className, path->keys, nullptr)
                 : "// The provider delivered a null path.\n");
    }
    for (const auto& instance : response.instances) {
        if (!instance) {
            add("// The provider delivered a null instance.\n");
            continue;
        }
        const std::string& className = instance->path.className;
        add(declaration(className, instance->properties, classes.find(className)));
    }
    return text;
}

std::string asJson(const Response& response) {
    JsonList paths;
    for (const auto& path : response.paths) {
        paths.push_back(path ? Json(cimom::toText(*path)) : Json(nullptr));
    }
    JsonList instances;
    for (const auto& instance : response.instances) {
        instances.push_back(instance ? instanceJson(*instance) : Json(nullptr));
    }
    const std::optional<unsigned>& returnDone = response.returnDoneCalls;
    return jsonText(
        JsonMembers{{"operation", response.operation},
                    {"status", JsonMembers{{"code", std::int64_t{response.status.code}},
                                           {"name", std::string(statusNameOf(response.status))}}},
                    {"returnDone", returnDone ? Json(std::uint64_t{*returnDone}) : Json(nullptr)},
                    {"paths", std::move(paths)},
                    {"instances", std::move(instances)}});
}

}  // namespace cimdhcp
