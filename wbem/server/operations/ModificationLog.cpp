#include "operations/Modification.h"

#include "cimom/ObjectPathText.h"
#include "cimxml/Errors.h"

namespace cimom::wbem {

namespace {

constexpr std::size_t longest = 200;

std::string textOf(const Scalar& scalar) {
    return std::holds_alternative<std::monostate>(scalar)
               ? "null"
               : scalarText(scalar).value_or("an instance");
}

const char* verb(Modification::Kind kind) noexcept {
    switch (kind) {
        case Modification::Kind::create:
            return "create";
        case Modification::Kind::remove:
            return "delete";
        default:
            return "modify";
    }
}

}  // namespace

std::string valueText(const Value& value) {
    std::string text;
    if (value.isNull()) {
        return "null";
    }
    if (const Array* const elements = value.array()) {
        for (const Scalar& element : *elements) {
            text += (text.empty() ? "{" : ", ") + textOf(element);
        }
        text = text.empty() ? "{}" : text + '}';
    } else {
        text = textOf(*value.scalar());
    }
    if (text.size() > longest) {
        text = text.substr(0, longest) + "...";
    }
    return text;
}

std::string modificationText(const Modification& modification) {
    std::string text = verb(modification.kind);
    text += " user=";
    text += modification.caller.user ? '"' + *modification.caller.user + '"' : "none";
    text += " address=" + modification.caller.address + " object=" + toText(modification.object);
    for (const Modification::Change& change : modification.changes) {
        // Many clients send the whole instance back.
        if (change.oldValue == change.newValue) {
            continue;
        }
        text += ' ' + change.property + ": ";
        if (modification.kind == Modification::Kind::modify) {
            text += (change.oldValue ? valueText(*change.oldValue) : "unknown") + " -> ";
        }
        text += valueText(change.newValue);
    }
    text += " status=";
    if (modification.status != 0) {
        text += cimStatusName(modification.status);
    } else {
        text += modification.doubt ? "ACCEPTED (" + *modification.doubt + ')' : "OK";
    }
    return modification.description.empty() ? text : text + " (" + modification.description + ')';
}

}  // namespace cimom::wbem
