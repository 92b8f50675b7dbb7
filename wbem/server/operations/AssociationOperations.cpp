// Associators, References and their names (DSP0200, 5.4.2), of instances and of
// classes.
#include "cimxml/ObjectWriter.h"
#include "operations/ClassAssociations.h"
#include "operations/Request.h"

namespace cimom::wbem {

namespace {

/// The parameters of one of the four operations, which differ in what they have.
struct Question {
    Parameters::ObjectName object;
    AssociationRequest filter;
    bool classOrigin = false;
    bool qualifiers = false;
};

enum class Kind { associators, references };
enum class Result { objects, names };

Question questionOf(Request& request, Kind kind, Result result) {
    Parameters& parameters = request.parameters;
    Question question;
    question.object = parameters.requiredObjectName("ObjectName");
    question.object.path = located(request, std::move(question.object.path));
    question.filter.resultClass = parameters.className("ResultClass");
    question.filter.role = parameters.text("Role");
    if (kind == Kind::associators) {
        question.filter.assocClass = parameters.className("AssocClass");
        question.filter.resultRole = parameters.text("ResultRole");
    }
    if (result == Result::objects) {
        question.qualifiers = parameters.flag("IncludeQualifiers", false);
        question.classOrigin = parameters.flag("IncludeClassOrigin", false);
        question.filter.propertyList = parameters.texts("PropertyList");
    }
    question.filter.principal = request.caller.user.value_or("");
    parameters.finish();
    return question;
}

Answer classAssociationsAnswer(Request& request, const Question& question, Kind kind,
                               Result result) {
    const ClassDeclaration& source =
        requireClass(request, question.object.path.className, CimStatus::invalidClass);
    const ClassRepository& repository = request.manager.repository();
    auto classes = kind == Kind::associators
                       ? associatedClasses(source, question.filter, repository)
                       : associationClasses(source, question.filter, repository);
    const ClassForm form{false, question.qualifiers, question.classOrigin,
                         question.filter.propertyList};
    return classesAnswer(
        request.call, std::move(classes),
        [form, result, host = request.manager.host(), nameSpace = request.call.nameSpace](
            std::string& out, const ClassDeclaration* declaration) {
            const bool names = result == Result::names;
            out += names ? "<OBJECTPATH>" : "<VALUE.OBJECTWITHPATH>";
            writeClassPath(out, host, nameSpace, declaration->name);
            if (!names) {
                writeClass(out, *declaration, form);
            }
            out += names ? "</OBJECTPATH>" : "</VALUE.OBJECTWITHPATH>";
        });
}

Answer objectsAnswer(Request& request, Kind kind) {
    const Question question = questionOf(request, kind, Result::objects);
    if (question.object.isClass) {
        return classAssociationsAnswer(request, question, kind, Result::objects);
    }
    const ClassRepository* const origins =
        question.classOrigin ? &request.manager.repository() : nullptr;
    return spoolAnswer(
        request.call,
        spooled<Instance>(
            request,
            [origins, &host = request.manager.host()](std::string& out, const Instance& instance) {
                out += "<VALUE.OBJECTWITHPATH>";
                writeInstancePath(out, instance.path, host);
                writeInstanceOf(out, instance, origins);
                out += "</VALUE.OBJECTWITHPATH>";
            },
            [&](auto& receiver) {
                const ObjectPath& path = question.object.path;
                return kind == Kind::associators
                           ? request.manager.associators(path, question.filter, receiver)
                           : request.manager.references(path, question.filter, receiver);
            }));
}

Answer namesAnswer(Request& request, Kind kind) {
    const Question question = questionOf(request, kind, Result::names);
    if (question.object.isClass) {
        return classAssociationsAnswer(request, question, kind, Result::names);
    }
    return spoolAnswer(
        request.call,
        spooled<ObjectPath>(
            request,
            [&host = request.manager.host()](std::string& out, const ObjectPath& path) {
                out += "<OBJECTPATH>";
                writeInstancePath(out, path, host);
                out += "</OBJECTPATH>";
            },
            [&](auto& receiver) {
                const ObjectPath& path = question.object.path;
                return kind == Kind::associators
                           ? request.manager.associatorNames(path, question.filter, receiver)
                           : request.manager.referenceNames(path, question.filter, receiver);
            }));
}

}  // namespace

std::vector<NamedOperation> associationOperations() {
    return {
        {"Associators", [](Request& request) { return objectsAnswer(request, Kind::associators); }},
        {"AssociatorNames",
         [](Request& request) { return namesAnswer(request, Kind::associators); }},
        {"References", [](Request& request) { return objectsAnswer(request, Kind::references); }},
        {"ReferenceNames",
         [](Request& request) { return namesAnswer(request, Kind::references); }}};
}

}  // namespace cimom::wbem
