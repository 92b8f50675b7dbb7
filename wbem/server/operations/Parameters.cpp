#include "operations/Parameters.h"

#include <algorithm>

#include "cimom/Names.h"
#include "cimxml/Errors.h"
#include "cimxml/ObjectReader.h"
#include "cimxml/XmlText.h"

namespace cimom::wbem {

namespace {

[[noreturn]] void invalid(const std::string& description) {
    throw CimError(CimStatus::invalidParameter, description);
}

}  // namespace

Parameters::Parameters(const Call& call) {
    for (const Parameter& parameter : call.parameters) {
        const bool twice =
            std::any_of(entries_.begin(), entries_.end(), [&parameter](const Entry& entry) {
                return sameName(entry.parameter->name, parameter.name);
            });
        if (twice) {
            invalid("parameter " + parameter.name + " is given twice");
        }
        entries_.push_back({&parameter});
    }
}

const XmlElement* Parameters::value(const char* name) {
    for (Entry& entry : entries_) {
        if (sameName(entry.parameter->name, name)) {
            entry.used = true;
            return entry.parameter->value ? &*entry.parameter->value : nullptr;
        }
    }
    return nullptr;
}

const XmlElement* Parameters::valueOf(const char* name, const char* element) {
    const XmlElement* const found = value(name);
    if (found != nullptr && found->name != element) {
        invalid(std::string("parameter ") + name + " is not " + element);
    }
    return found;
}

const XmlElement& Parameters::required(const char* name, const XmlElement* value) const {
    if (value == nullptr) {
        invalid(std::string("parameter ") + name + " is missing");
    }
    return *value;
}

bool Parameters::flag(const char* name, bool standard) {
    const XmlElement* const found = valueOf(name, "VALUE");
    if (found == nullptr) {
        return standard;
    }
    const auto scalar = readScalarText(Type::boolean, readText(*found));
    if (!scalar) {
        invalid(std::string("parameter ") + name + " is not a boolean");
    }
    return std::get<bool>(*scalar);
}

std::optional<std::string> Parameters::text(const char* name) {
    const XmlElement* const found = valueOf(name, "VALUE");
    return found == nullptr ? std::nullopt : std::optional(readText(*found));
}

std::optional<std::vector<std::string>> Parameters::texts(const char* name) {
    const XmlElement* const found = valueOf(name, "VALUE.ARRAY");
    return found == nullptr ? std::nullopt : std::optional(readTexts(*found));
}

std::optional<std::uint32_t> Parameters::number(const char* name) {
    const XmlElement* const found = valueOf(name, "VALUE");
    if (found == nullptr) {
        return std::nullopt;
    }
    const auto scalar = readScalarText(Type::uint32, readText(*found));
    if (!scalar) {
        invalid(std::string("parameter ") + name + " is not a uint32");
    }
    return static_cast<std::uint32_t>(std::get<std::uint64_t>(*scalar));
}

std::optional<std::string> Parameters::className(const char* name) {
    const XmlElement* const found = valueOf(name, "CLASSNAME");
    return found == nullptr ? std::nullopt : std::optional(readClassName(*found));
}

std::string Parameters::requiredText(const char* name) {
    return readText(required(name, valueOf(name, "VALUE")));
}

std::uint32_t Parameters::requiredNumber(const char* name) {
    const auto found = number(name);
    if (!found) {
        invalid(std::string("parameter ") + name + " is missing");
    }
    return *found;
}

std::string Parameters::requiredClassName(const char* name) {
    return readClassName(required(name, valueOf(name, "CLASSNAME")));
}

ObjectPath Parameters::requiredInstanceName(const char* name) {
    return readPath(required(name, valueOf(name, "INSTANCENAME")));
}

Parameters::ObjectName Parameters::requiredObjectName(const char* name) {
    const XmlElement& found = required(name, value(name));
    if (found.name != "INSTANCENAME" && found.name != "CLASSNAME") {
        invalid(std::string("parameter ") + name + " is neither INSTANCENAME nor CLASSNAME");
    }
    return {readPath(found), found.name == "CLASSNAME"};
}

Instance Parameters::requiredInstance(const char* name) {
    return readInstance(required(name, valueOf(name, "INSTANCE")));
}

Instance Parameters::requiredNamedInstance(const char* name) {
    const XmlElement& found = required(name, valueOf(name, "VALUE.NAMEDINSTANCE"));
    expectNoText(found);
    if (found.children.size() != 2) {
        throw NotValid("the content of VALUE.NAMEDINSTANCE");
    }
    expectName(found.children.front(), "INSTANCENAME");
    ObjectPath path = readPath(found.children.front());
    Instance instance = readInstance(found.children.back());
    if (!sameName(path.className, instance.path.className)) {
        invalid("the instance is of class " + instance.path.className + ", its name of class " +
                path.className);
    }
    instance.path = std::move(path);
    return instance;
}

void Parameters::finish() const {
    for (const Entry& entry : entries_) {
        if (!entry.used) {
            invalid("there is no parameter " + entry.parameter->name);
        }
    }
}

}  // namespace cimom::wbem
