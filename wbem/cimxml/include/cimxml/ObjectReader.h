#pragma once

#include <string>
#include <vector>

#include "cimom/Forward.h"
#include "cimxml/XmlDocument.h"

/// Reads the elements of DSP0201 into the model. Attributes that have no meaning
/// here are passed over; elements that do not belong are not. All functions throw
/// NotValid for a wrong structure and CimError for a value that is none of its type.
namespace cimom::wbem {

/// The value of an attribute that must be there.
[[nodiscard]] const std::string& requiredAttribute(const XmlElement& element, const char* name);
/// Throws unless the element has that name.
void expectName(const XmlElement& element, const char* name);
/// Throws when there is anything but white space directly in the element.
void expectNoText(const XmlElement& element);
/// The only child of an element that has no text.
[[nodiscard]] const XmlElement& onlyChild(const XmlElement& element);

/// INSTANCENAME, LOCALINSTANCEPATH or INSTANCEPATH, without keys CLASSNAME,
/// LOCALCLASSPATH or CLASSPATH, too. A KEYVALUE without TYPE gives a string,
/// boolean or number; the one without a name, which classes of one key may have,
/// gets an empty name. Namespaces that are not written stay empty.
[[nodiscard]] ObjectPath readPath(const XmlElement& element);
/// LOCALNAMESPACEPATH: the namespace with slashes between its components.
[[nodiscard]] std::string readLocalNamespacePath(const XmlElement& element);
/// CLASSNAME: the name of the class.
[[nodiscard]] std::string readClassName(const XmlElement& element);

/// INSTANCE. The path holds the class alone.
[[nodiscard]] Instance readInstance(const XmlElement& element);

/// Whether it is PROPERTY, PROPERTY.ARRAY or PROPERTY.REFERENCE.
[[nodiscard]] bool isProperty(const XmlElement& element);
/// The value of such an element; `name` is for messages.
[[nodiscard]] Value readPropertyValue(const XmlElement& element, const std::string& name);
/// The value of QUALIFIER.
[[nodiscard]] Value readQualifierValue(const XmlElement& element);

/// VALUE: its text.
[[nodiscard]] const std::string& readText(const XmlElement& element);
/// VALUE.ARRAY of texts, none of which may be null.
[[nodiscard]] std::vector<std::string> readTexts(const XmlElement& element);

/// Reads CLASS. Methods are passed over, as are the default values of embedded
/// instances. Inherited properties and qualifiers are there when the server was asked
/// for them. Throws NotValid for a wrong structure and CimError for a value that is
/// none of its type.
[[nodiscard]] ClassDeclaration readClass(const XmlElement& element);

/// Puts the namespace where a path names none: DSP0201 lets INSTANCENAME stand for an
/// object of the operation's own namespace. A reference in the keys that names none is
/// of the namespace of the path around it.
void locate(ObjectPath& path, const std::string& nameSpace);
/// The same for an instance: its path, and the references in its properties.
void locate(Instance& instance, const std::string& nameSpace);

}  // namespace cimom::wbem
