// Operations on classes (DSP0200, 5.4.2).
#include <algorithm>

#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Names.h"
#include "cimxml/ObjectWriter.h"
#include "operations/Request.h"

namespace cimom::wbem {

namespace {

ClassForm classForm(Request& request) {
    ClassForm form;
    form.localOnly = request.parameters.flag("LocalOnly", true);
    form.qualifiers = request.parameters.flag("IncludeQualifiers", true);
    form.classOrigin = request.parameters.flag("IncludeClassOrigin", false);
    return form;
}

/// The classes below the one named, or all when none is named; without `deep`
/// only those directly below it, or without a superclass.
std::vector<const ClassDeclaration*> classesBelow(Request& request) {
    const auto className = request.parameters.className("ClassName");
    const bool deep = request.parameters.flag("DeepInheritance", false);
    request.parameters.finish();
    const ClassRepository& repository = request.manager.repository();
    std::vector<const ClassDeclaration*> classes;
    std::string superclass;
    if (className) {
        superclass = requireClass(request, *className, CimStatus::invalidClass).name;
        classes = repository.withSubclasses(superclass);
        classes.erase(classes.begin());
    } else {
        classes = repository.classes();
    }
    if (!deep) {
        std::erase_if(classes, [&superclass](const ClassDeclaration* each) {
            return !sameName(each->superclass, superclass);
        });
    }
    return classes;
}

ResponseBody getClass(Request& request) {
    const std::string className = request.parameters.requiredClassName("ClassName");
    ClassForm form = classForm(request);
    form.propertyList = request.parameters.texts("PropertyList");
    request.parameters.finish();
    std::string content = "<IRETURNVALUE>";
    writeClass(content, requireClass(request, className, CimStatus::notFound), form);
    return plainResponse(request.call, content + "</IRETURNVALUE>");
}

ResponseBody enumerateClasses(Request& request) {
    const ClassForm form = classForm(request);
    return classesResponse(request.call, classesBelow(request),
                           [form](std::string& out, const ClassDeclaration* declaration) {
                               writeClass(out, *declaration, form);
                           });
}

ResponseBody enumerateClassNames(Request& request) {
    return classesResponse(request.call, classesBelow(request),
                           [](std::string& out, const ClassDeclaration* declaration) {
                               writeClassName(out, declaration->name);
                           });
}

}  // namespace

std::vector<NamedOperation> classOperations() {
    return {{"GetClass", getClass},
            {"EnumerateClasses", enumerateClasses},
            {"EnumerateClassNames", enumerateClassNames}};
}

}  // namespace cimom::wbem
