// Associators, References and their names (DSP0200, 5.4.2), of instances and of
// classes.
#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimxml/ObjectWriter.h"
#include "operations/ClassAssociations.h"
#include "operations/Request.h"

namespace cimom::wbem {

namespace {

/// The parameters of one of the four operations, which differ in what they have.
struct AssociationParameters {
    Parameters::ObjectName object;
    AssociationRequest filter;
    bool classOrigin = false;
    bool qualifiers = false;
};

enum class Kind { associators, references };
enum class Result { objects, names };

AssociationParameters readParameters(Request& request, Kind kind, Result result) {
    Parameters& parameters = request.parameters;
    AssociationParameters wanted;
    wanted.object = parameters.requiredObjectName("ObjectName");
    wanted.object.path = located(request, std::move(wanted.object.path));
    wanted.filter.resultClass = parameters.className("ResultClass");
    wanted.filter.role = parameters.text("Role");
    if (kind == Kind::associators) {
        wanted.filter.assocClass = parameters.className("AssocClass");
        wanted.filter.resultRole = parameters.text("ResultRole");
    }
    if (result == Result::objects) {
        wanted.qualifiers = parameters.flag("IncludeQualifiers", false);
        wanted.classOrigin = parameters.flag("IncludeClassOrigin", false);
        wanted.filter.propertyList = parameters.texts("PropertyList");
    }
    wanted.filter.principal = request.caller.user.value_or("");
    parameters.finish();
    return wanted;
}

ResponseBody classAssociationsResponse(Request& request, const AssociationParameters& wanted,
                                       Kind kind, Result result) {
    const ClassDeclaration& source =
        requireClass(request, wanted.object.path.className, CimStatus::invalidClass);
    const ClassRepository& repository = request.manager.repository();
    if (const Status status = checkClasses(wanted.filter, repository); !status.ok()) {
        throw CimError(CimStatus::invalidParameter, status.message);
    }
    auto classes = kind == Kind::associators
                       ? associatedClasses(source, wanted.filter, repository)
                       : associationClasses(source, wanted.filter, repository);
    const ClassForm form{false, wanted.qualifiers, wanted.classOrigin, wanted.filter.propertyList};
    return classesResponse(
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

ResponseBody objectsResponse(Request& request, Kind kind) {
    const AssociationParameters wanted = readParameters(request, kind, Result::objects);
    if (wanted.object.isClass) {
        return classAssociationsResponse(request, wanted, kind, Result::objects);
    }
    const ClassRepository* const origins =
        wanted.classOrigin ? &request.manager.repository() : nullptr;
    return spooledResponse(
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
                const ObjectPath& path = wanted.object.path;
                return kind == Kind::associators
                           ? request.manager.associators(path, wanted.filter, receiver)
                           : request.manager.references(path, wanted.filter, receiver);
            }));
}

ResponseBody namesResponse(Request& request, Kind kind) {
    const AssociationParameters wanted = readParameters(request, kind, Result::names);
    if (wanted.object.isClass) {
        return classAssociationsResponse(request, wanted, kind, Result::names);
    }
    return spooledResponse(
        request.call,
        spooled<ObjectPath>(
            request,
            [&host = request.manager.host()](std::string& out, const ObjectPath& path) {
                out += "<OBJECTPATH>";
                writeInstancePath(out, path, host);
                out += "</OBJECTPATH>";
            },
            [&](auto& receiver) {
                const ObjectPath& path = wanted.object.path;
                return kind == Kind::associators
                           ? request.manager.associatorNames(path, wanted.filter, receiver)
                           : request.manager.referenceNames(path, wanted.filter, receiver);
            }));
}

}  // namespace

std::vector<NamedOperation> associationOperations() {
    return {
        {"Associators",
         [](Request& request) { return objectsResponse(request, Kind::associators); }},
        {"AssociatorNames",
         [](Request& request) { return namesResponse(request, Kind::associators); }},
        {"References", [](Request& request) { return objectsResponse(request, Kind::references); }},
        {"ReferenceNames",
         [](Request& request) { return namesResponse(request, Kind::references); }}};
}

}  // namespace cimom::wbem
