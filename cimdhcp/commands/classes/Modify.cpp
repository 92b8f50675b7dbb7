#include <algorithm>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "arguments/ArgumentValue.h"
#include "arguments/Commands.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/Names.h"
#include "client/Client.h"
#include "commands/classes/CimOperations.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/ValueMeaning.h"

namespace cimdhcp {

namespace {

std::pair<std::string, std::string> splitAssignment(const std::string& text) {
    const std::size_t sign = text.find('=');
    if (sign == std::string::npos || sign == 0) {
        throw Failure(ExitStatus::usage, "\"" + printable(text) +
                                             "\" is not an assignment of the form PROPERTY=VALUE");
    }
    return {text.substr(0, sign), text.substr(sign + 1)};
}

/// The response of an object manager to a property that the class does not have. There
/// is no type to send the value in.
Response noSuchProperty(const cimom::ClassDeclaration& declaration, const std::string& name) {
    Response response;
    response.operation = "ModifyInstance";
    response.status = {CMPI_RC_ERR_NO_SUCH_PROPERTY, noPropertyText(declaration, name)};
    return response;
}

template <typename Values>
auto find(Values& values, const std::string& name) {
    return std::find_if(values.begin(), values.end(),
                        [&](const auto& each) { return cimom::sameName(each.name, name); });
}

bool isConfigurationName(const cimom::ClassDeclaration& declaration, std::string_view property) {
    return cimom::sameName(declaration.name, settingClass) &&
           cimom::sameName(property, nameProperty);
}

void refuseBlanksAtEnds(const std::string& name, const std::string& value) {
    constexpr std::string_view blanks = " \t";
    if (!value.empty() && (blanks.find(value.front()) != std::string_view::npos ||
                           blanks.find(value.back()) != std::string_view::npos)) {
        throw Failure(ExitStatus::usage, name + " cannot be \"" + printable(value) +
                                             "\": blanks at its ends would not come back");
    }
}

/// The new values, or the response that there is instead.
struct Assignments {
    std::vector<cimom::NamedValue> values;
    std::optional<Response> refused;
};

Assignments readAssignments(const ModifyCommand& command, const std::string& className,
                            const cimom::ClassDeclaration* declaration) {
    Assignments result;
    std::string unwritable;
    for (const std::string& assignment : command.assignments) {
        const auto [name, value] = splitAssignment(assignment);
        if (find(result.values, name) != result.values.end()) {
            throw Failure(ExitStatus::usage, printable(name) + " is given twice");
        }
        if (declaration == nullptr) {
            // The class is not known: the object manager will say so.
            result.values.push_back({name, cimom::Value::ofString(value)});
            continue;
        }
        const cimom::PropertyDeclaration* const property = declaration->property(name);
        if (property == nullptr) {
            result.refused = noSuchProperty(*declaration, name);
            return result;
        }
        result.values.push_back({property->name, readValue(*property, value)});
        if (isConfigurationName(*declaration, name)) {
            refuseBlanksAtEnds(property->name, value);
        }
        if (!mayBeWritten(*declaration, *property)) {
            unwritable += (unwritable.empty() ? "" : ", ") + property->name;
        }
    }
    if (!unwritable.empty()) {
        throw Failure(ExitStatus::notDone, "not changed: " + unwritable + " of " +
                                               printable(className) + " cannot be written" +
                                               (cimom::sameName(className, settingClass)
                                                    ? ", only " + std::string(nameProperty) + " can"
                                                    : ""));
    }
    return result;
}

/// The one instance of a response; null when there is none.
cimom::Instance* instanceIn(Response& response) {
    for (auto& instance : response.instances) {
        if (instance) {
            return &*instance;
        }
    }
    return nullptr;
}

cimom::Instance get(const cimom::ObjectPath& path, Client& client) {
    Response response = client.get(path);
    if (!response.status.ok()) {
        throw client.failure(response, path);
    }
    if (cimom::Instance* const instance = instanceIn(response)) {
        return std::move(*instance);
    }
    throw Failure(ExitStatus::notDone, "the response to GetInstance has no instance");
}

cimom::Instance readBack(const cimom::ObjectPath& path, Client& client) {
    try {
        return get(path, client);
    } catch (const Failure& failure) {
        throw Failure(failure.status(),
                      std::string(failure.what()) +
                          "; what came of the change is not known, as it cannot be read back");
    }
}

void put(cimom::Instance& instance, const cimom::NamedValue& value) {
    const auto found = find(instance.properties, value.name);
    if (found == instance.properties.end()) {
        instance.properties.push_back(value);
    } else {
        found->value = value.value;
    }
}

/// The value of a property; null where there is none.
cimom::Value valueIn(const cimom::Instance& instance, const std::string& name) {
    const cimom::Value* const value = instance.property(name);
    return value == nullptr ? cimom::Value() : *value;
}

/// An empty text and none are one: a name that is taken away is not shown any more.
bool same(const cimom::Value& a, const cimom::Value& b) {
    const auto isNothing = [](const cimom::Value& value) {
        return value.isNull() || value == cimom::Value::ofString("");
    };
    return a == b || (isNothing(a) && isNothing(b));
}

std::string shown(const std::string& name, const cimom::Value& value) {
    return value.isNull() ? "not set" : valueWithMeaning(nullptr, {name, value});
}

/// Throws what is not as it was wanted; also when all was like that before.
void compare(const std::vector<cimom::NamedValue>& wanted, const cimom::Instance& before,
             const cimom::Instance& after) {
    bool changed = false;
    bool reached = true;
    std::string text;
    for (const cimom::NamedValue& each : wanted) {
        const cimom::Value was = valueIn(before, each.name);
        const cimom::Value is = valueIn(after, each.name);
        const bool moved = !same(was, is);
        const bool right = same(is, each.value);
        changed = changed || moved;
        reached = reached && right;
        text += (text.empty() ? "" : "; ") + each.name + " is " +
                (moved ? "now " : (right ? "" : "still ")) + shown(each.name, is) +
                (right ? (moved ? "" : " already") : ", not " + shown(each.name, each.value));
    }
    if (!changed) {
        throw Failure(ExitStatus::notDone, "not changed: " + printable(text));
    }
    if (!reached) {
        throw Failure(ExitStatus::notDone, "not changed as wanted: " + printable(text));
    }
}

}  // namespace

bool mayBeWritten(const cimom::ClassDeclaration& declaration,
                  const cimom::PropertyDeclaration& property) {
    if (cimom::sameName(declaration.name, settingClass)) {
        return isConfigurationName(declaration, property.name);
    }
    return !property.isKey() && cimom::isTrue(property.qualifier("Write"));
}

CimOperation carryOut(const ModifyCommand& command, Client& client) {
    const cimom::ObjectPath path =
        readPathArgument(command.path, client.nameSpace(), client.classes());
    Assignments assignments =
        readAssignments(command, path.className, client.classes().find(path.className));
    if (assignments.refused) {
        return {path, *std::move(assignments.refused)};
    }
    const cimom::Instance before = get(path, client);
    cimom::Instance instance = before;
    instance.path = path;
    std::vector<std::string> names;
    for (const cimom::NamedValue& each : assignments.values) {
        put(instance, each);
        names.push_back(each.name);
    }
    CimOperation operation{path, client.modify(instance, names)};
    if (operation.response.status.ok()) {
        compare(assignments.values, before, readBack(path, client));
    }
    return operation;
}

}  // namespace cimdhcp
