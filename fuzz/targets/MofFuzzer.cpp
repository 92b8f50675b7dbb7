// MOF of a schema that others wrote.
#include <algorithm>

#include "Input.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/MofError.h"

namespace {

using Classes = std::vector<const cimom::ClassDeclaration*>;

bool contains(const Classes& classes, const cimom::ClassDeclaration* wanted) {
    return std::find(classes.begin(), classes.end(), wanted) != classes.end();
}

void checkClass(const cimom::ClassRepository& repository,
                const cimom::ClassDeclaration& declaration) {
    fuzz::require(repository.find(declaration.name) == &declaration, "a class is found by name");
    fuzz::require(repository.isA(declaration.name, declaration.name), "a class is itself");
    fuzz::require(contains(repository.withSubclasses(declaration.name), &declaration),
                  "a class is among itself and its subclasses");
    for (const cimom::PropertyDeclaration& property : declaration.properties) {
        fuzz::require(declaration.property(property.name) == &property,
                      "the names of properties are unique");
        fuzz::require(repository.find(property.classOrigin) != nullptr,
                      "a property comes from a class");
    }
    if (declaration.superclass.empty()) {
        return;
    }
    const cimom::ClassDeclaration* const parent = repository.find(declaration.superclass);
    fuzz::require(parent != nullptr, "a superclass is there");
    fuzz::require(repository.isA(declaration.name, declaration.superclass) &&
                      !repository.isA(declaration.superclass, declaration.name),
                  "a class is its parent, and the parent is not the class");
    fuzz::require(contains(repository.withSubclasses(declaration.superclass), &declaration),
                  "a class is among its parent's subclasses");
    for (const cimom::PropertyDeclaration& property : parent->properties) {
        fuzz::require(declaration.property(property.name) != nullptr, "properties are inherited");
    }
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    if (text.find("include") != std::string_view::npos) {
        return 0;  // would read files
    }
    cimom::ClassRepository repository;
    try {
        repository.loadText(text, "input.mof");
        repository.complete();
    } catch (const cimom::MofError& error) {
        fuzz::require(error.line > 0 && error.column > 0, "an error has a place");
        fuzz::require(
            error.line <= 1 + static_cast<std::size_t>(std::count(text.begin(), text.end(), '\n')),
            "the place of an error is in the text");
    }
    // What came before an error is there, and whole.
    for (const cimom::ClassDeclaration* declaration : repository.classes()) {
        checkClass(repository, *declaration);
    }
    return 0;
}
