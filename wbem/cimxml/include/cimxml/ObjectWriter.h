#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Forward.h"

/// Writes objects as the elements of DSP0201, appended to a buffer. Whatever the
/// objects hold, the elements are well-formed and of the structure of DSP0203.
namespace cimom::wbem {

/// INSTANCENAME. Keys that are null are left out. KEYVALUE goes without the
/// attribute TYPE: clients that keep to DTD version 2.0 take it for an error, and
/// all others know the type from the class.
void writeInstanceName(std::string& out, const ObjectPath& path);
/// INSTANCEPATH. `host` stands in for one that the path lacks.
void writeInstancePath(std::string& out, const ObjectPath& path, std::string_view host);
/// LOCALNAMESPACEPATH, with one NAMESPACE per component.
void writeLocalNamespacePath(std::string& out, std::string_view nameSpace);
/// CLASSNAME.
void writeClassName(std::string& out, std::string_view className);
/// CLASSPATH.
void writeClassPath(std::string& out, std::string_view host, std::string_view nameSpace,
                    std::string_view className);
/// VALUE.REFERENCE around the fullest path that host and namespace allow.
void writeReference(std::string& out, const ObjectPath& path);

/// INSTANCE. `origins` is where CLASSORIGIN attributes come from; null: none are
/// written. Array properties of references, which DSP0201 does not know, are
/// written as the texts of their paths.
void writeInstance(std::string& out, const Instance& instance, const ClassDeclaration* origins);

/// QUALIFIER.DECLARATION.
void writeQualifierType(std::string& out, const QualifierType& type);

/// What of a class is written.
struct ClassForm {
    bool localOnly = false;
    bool qualifiers = true;
    bool classOrigin = false;
    std::optional<std::vector<std::string>> propertyList;  ///< absent: all
};
/// CLASS.
void writeClass(std::string& out, const ClassDeclaration& declaration, const ClassForm& form);

}  // namespace cimom::wbem
