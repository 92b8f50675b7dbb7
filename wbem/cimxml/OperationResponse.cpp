#include "cimxml/OperationResponse.h"

#include <charconv>
#include <system_error>
#include <utility>

#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimxml/Errors.h"
#include "cimxml/ObjectReader.h"

namespace cimom::wbem {

namespace {

/// The only child, which can be taken out of the element.
XmlElement& onlyChildOf(XmlElement& element, const char* name) {
    static_cast<void>(onlyChild(element));
    expectName(element.children.front(), name);
    return element.children.front();
}

void readError(const XmlElement& element, OperationResponse& response) {
    const std::string& code = requiredAttribute(element, "CODE");
    const char* const end = code.data() + code.size();
    const auto [stop, error] = std::from_chars(code.data(), end, response.code);
    if (error != std::errc() || stop != end || response.code == 0) {
        throw NotValid("CODE \"" + code + "\" of ERROR");
    }
    if (const std::string* const description = element.attribute("DESCRIPTION")) {
        response.description = *description;
    }
}

}  // namespace

OperationResponse readResponse(std::string_view body, std::string_view method,
                               std::size_t maximumDepth) {
    XmlElement cim = readXml(body, maximumDepth, usualMemory(body.size()));
    expectName(cim, "CIM");
    XmlElement& message = onlyChildOf(cim, "MESSAGE");
    XmlElement& simple = onlyChildOf(message, "SIMPLERSP");
    XmlElement& result = onlyChildOf(simple, "IMETHODRESPONSE");
    if (!sameName(requiredAttribute(result, "NAME"), method)) {
        throw NotValid("a response to " + requiredAttribute(result, "NAME"));
    }
    expectNoText(result);
    OperationResponse response;
    if (result.children.empty()) {
        return response;
    }
    // Output parameters stand behind the result; no operation that the client requests has any.
    XmlElement& first = result.children.front();
    if (first.name == "ERROR") {
        readError(first, response);
    } else {
        expectName(first, "IRETURNVALUE");
        expectNoText(first);
        response.returned = std::move(first.children);
    }
    return response;
}

ObjectPath readReturnedPath(const XmlElement& element, const std::string& nameSpace) {
    ObjectPath path = readPath(element.name == "OBJECTPATH" ? onlyChild(element) : element);
    locate(path, nameSpace);
    return path;
}

Instance readReturnedInstance(const XmlElement& element, const std::string& nameSpace) {
    Instance instance;
    if (element.name == "VALUE.NAMEDINSTANCE" || element.name == "VALUE.OBJECTWITHPATH") {
        expectNoText(element);
        if (element.children.size() != 2) {
            throw NotValid("the content of " + element.name);
        }
        ObjectPath path = readPath(element.children.front());
        instance = readInstance(element.children.back());
        if (!sameName(path.className, instance.path.className)) {
            throw NotValid("an instance of " + instance.path.className + " with a path of " +
                           path.className);
        }
        instance.path = std::move(path);
    } else {
        instance = readInstance(element);
    }
    locate(instance, nameSpace);
    return instance;
}

}  // namespace cimom::wbem
