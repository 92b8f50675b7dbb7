#include "cimxml/OperationRequest.h"

#include <utility>

#include "MessageHead.h"
#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimxml/ObjectWriter.h"
#include "cimxml/XmlText.h"

namespace cimom::wbem {

namespace {

std::string valueElement(std::string_view text) {
    std::string element = "<VALUE>";
    appendText(element, text);
    return element + "</VALUE>";
}

/// What needs no encoding in a URI (RFC 3986, 2.3), and the slash of namespaces.
bool isPlain(char c) noexcept {
    return isDigit(c) || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || c == '-' || c == '.' ||
           c == '_' || c == '~' || c == '/';
}

}  // namespace

OperationRequest::OperationRequest(std::string method, std::string nameSpace)
    : method_(std::move(method)), nameSpace_(std::move(nameSpace)) {}

void OperationRequest::parameter(const char* name, std::string_view value) {
    parameters_ += "<IPARAMVALUE";
    appendAttribute(parameters_, "NAME", name);
    parameters_.append(">").append(value).append("</IPARAMVALUE>");
}

OperationRequest& OperationRequest::flag(const char* name, bool value) {
    parameter(name, value ? "<VALUE>TRUE</VALUE>" : "<VALUE>FALSE</VALUE>");
    return *this;
}

OperationRequest& OperationRequest::text(const char* name,
                                         const std::optional<std::string>& value) {
    if (value) {
        parameter(name, valueElement(*value));
    }
    return *this;
}

OperationRequest& OperationRequest::texts(const char* name,
                                          const std::optional<std::vector<std::string>>& values) {
    if (values) {
        std::string element = "<VALUE.ARRAY>";
        for (const std::string& value : *values) {
            element += valueElement(value);
        }
        parameter(name, element + "</VALUE.ARRAY>");
    }
    return *this;
}

OperationRequest& OperationRequest::className(const char* name,
                                              const std::optional<std::string>& value) {
    if (value) {
        std::string element;
        writeClassName(element, *value);
        parameter(name, element);
    }
    return *this;
}

OperationRequest& OperationRequest::instanceName(const char* name, const ObjectPath& path) {
    std::string element;
    writeInstanceName(element, path);
    parameter(name, element);
    return *this;
}

OperationRequest& OperationRequest::instance(const char* name, const Instance& value) {
    std::string element;
    writeInstance(element, value, nullptr);
    parameter(name, element);
    return *this;
}

OperationRequest& OperationRequest::namedInstance(const char* name, const Instance& instance) {
    std::string element = "<VALUE.NAMEDINSTANCE>";
    writeInstanceName(element, instance.path);
    writeInstance(element, instance, nullptr);
    parameter(name, element + "</VALUE.NAMEDINSTANCE>");
    return *this;
}

std::string OperationRequest::body() const {
    std::string text(messageHead);
    text += R"( ID="1" PROTOCOLVERSION="1.0"><SIMPLEREQ><IMETHODCALL)";
    appendAttribute(text, "NAME", method_);
    text += '>';
    writeLocalNamespacePath(text, nameSpace_);
    return text + parameters_ + "</IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>\n";
}

std::string OperationRequest::objectHeader() const {
    constexpr std::string_view digits = "0123456789ABCDEF";
    std::string text;
    for (const char c : nameSpace_) {
        if (isPlain(c)) {
            text += c;
        } else {
            const auto byte = static_cast<unsigned char>(c);
            text += '%';
            text += digits[byte >> 4U];
            text += digits[byte & 15U];
        }
    }
    return text;
}

}  // namespace cimom::wbem
