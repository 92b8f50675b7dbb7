#include "arguments/ArgumentValue.h"

#include <algorithm>
#include <string_view>

#include "cimom/ClassDeclaration.h"
#include "cimom/ObjectPathText.h"
#include "text/DisplayText.h"
#include "text/Failure.h"

namespace cimdhcp {

namespace {

/// The commonest mistake is a path without single quotes around it.
constexpr std::string_view remedy =
    "; write it in single quotes, as in 'QVXZR_DHCPSettingData.InstanceID=\"Computer%eth0\"'";

cimom::ObjectPath read(const std::string& text, const std::string& defaultNamespace,
                       std::string_view hint) {
    try {
        cimom::ObjectPath path = cimom::parseObjectPath(text);
        if (path.nameSpace.empty()) {
            path.nameSpace = defaultNamespace;
        }
        return path;
    } catch (const cimom::ObjectPathError& error) {
        throw Failure(ExitStatus::usage, "cannot read \"" + printable(text) +
                                             "\": " + error.what() + std::string(hint));
    }
}

}  // namespace

cimom::ObjectPath readClassArgument(const std::string& text, const std::string& defaultNamespace) {
    cimom::ObjectPath path = read(text, defaultNamespace, "");
    if (!path.keys.empty()) {
        throw Failure(ExitStatus::usage, "\"" + printable(text) +
                                             "\" is the path of an instance; " +
                                             "give its class alone: " + path.className);
    }
    return path;
}

cimom::ObjectPath readPathArgument(const std::string& text, const std::string& defaultNamespace,
                                   const ClassLookup& classes) {
    cimom::ObjectPath path = read(text, defaultNamespace, remedy);
    const cimom::ClassDeclaration* const declaration = classes.find(path.className);
    const bool keyed =
        declaration != nullptr &&
        std::any_of(declaration->properties.begin(), declaration->properties.end(),
                    [](const cimom::PropertyDeclaration& property) { return property.isKey(); });
    if (keyed && path.keys.empty()) {
        throw Failure(ExitStatus::usage,
                      "\"" + printable(text) +
                          "\" names a class, not an instance: its keys are missing; list the "
                          "paths with: cimdhcp names " +
                          path.className);
    }
    return path;
}

}  // namespace cimdhcp
