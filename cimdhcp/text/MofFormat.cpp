#include "text/MofFormat.h"

#include <algorithm>

#include "text/DisplayText.h"
#include "text/InstanceMeanings.h"
#include "text/MofText.h"

namespace cimdhcp {

namespace {

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

std::string asMof(const Answer& answer, const ClassLookup& classes) {
    std::string text;
    const auto add = [&](const std::string& part) { text += (text.empty() ? "" : "\n") + part; };
    for (const auto& path : answer.paths) {
        add(path ? declaration(path->className, path->keys, nullptr)
                 : "// The provider delivered a null path.\n");
    }
    for (const auto& instance : answer.instances) {
        if (!instance) {
            add("// The provider delivered a null instance.\n");
            continue;
        }
        const std::string& className = instance->path.className;
        add(declaration(className, instance->properties, classes.find(className)));
    }
    return text;
}

std::string mofDeclaration(const cimom::Instance& instance) {
    std::string text = "instance of " + instance.path.className + " {";
    for (const cimom::NamedValue& property : instance.properties) {
        text += ' ' + property.name + " = " + mofInitializer(property.value) + ';';
    }
    return text + " };";
}

}  // namespace cimdhcp
