#include "cimxml/Call.h"

#include <algorithm>

#include "MessageHead.h"
#include "cimom/Names.h"
#include "cimxml/Errors.h"
#include "cimxml/HttpStatus.h"
#include "cimxml/ObjectReader.h"
#include "cimxml/XmlText.h"

namespace cimom::wbem {

namespace {

/// A version that differs in its second number alone is compatible.
void checkVersion(const XmlElement& element, const char* name, std::string_view major,
                  const char* cimError) {
    const std::string& version = requiredAttribute(element, name);
    const std::string_view minor =
        std::string_view(version).substr(std::min(version.size(), major.size()));
    if (!version.starts_with(major) || minor.empty() ||
        !std::all_of(minor.begin(), minor.end(), [](char c) { return isDigit(c) || c == '.'; })) {
        throw HttpFailure(http::notImplemented, cimError, std::string(name) + " " + version);
    }
}

void readParameters(XmlElement& element, Call& call) {
    for (auto child = element.children.begin() + 1; child != element.children.end(); ++child) {
        expectName(*child, "IPARAMVALUE");
        expectNoText(*child);
        Parameter parameter{requiredAttribute(*child, "NAME"), std::nullopt};
        if (child->children.size() > 1) {
            throw NotValid("the content of IPARAMVALUE");
        }
        if (!child->children.empty()) {
            parameter.value = std::move(child->children.front());
        }
        call.parameters.push_back(std::move(parameter));
    }
}

Call callOf(ReadMessage message) {
    Call call;
    call.messageId = std::move(message.id);
    call.protocolVersion = std::move(message.protocolVersion);
    XmlElement& request = message.content;
    expectName(request, "SIMPLEREQ");
    expectNoText(request);
    // Correlators are for event logs, and may be passed over.
    std::erase_if(request.children,
                  [](const XmlElement& child) { return child.name == "CORRELATOR"; });
    if (request.children.size() != 1) {
        throw NotValid("the content of SIMPLEREQ");
    }
    XmlElement& operation = request.children.front();
    expectNoText(operation);
    call.intrinsic = operation.name == "IMETHODCALL";
    if (!call.intrinsic) {
        expectName(operation, "METHODCALL");
        call.method = requiredAttribute(operation, "NAME");
        return call;
    }
    call.method = requiredAttribute(operation, "NAME");
    if (operation.children.empty()) {
        throw NotValid("IMETHODCALL without LOCALNAMESPACEPATH");
    }
    call.nameSpace = readLocalNamespacePath(operation.children.front());
    readParameters(operation, call);
    return call;
}

}  // namespace

ReadMessage readMessage(XmlElement cim) {
    expectName(cim, "CIM");
    checkVersion(cim, "CIMVERSION", "2.", "unsupported-cim-version");
    checkVersion(cim, "DTDVERSION", "2.", "unsupported-dtd-version");
    static_cast<void>(onlyChild(cim));
    XmlElement& message = cim.children.front();
    expectName(message, "MESSAGE");
    ReadMessage read;
    read.id = requiredAttribute(message, "ID");
    checkVersion(message, "PROTOCOLVERSION", "1.", "unsupported-protocol-version");
    read.protocolVersion = *message.attribute("PROTOCOLVERSION");
    static_cast<void>(onlyChild(message));
    read.content = std::move(message.children.front());
    if (read.content.name == "MULTIREQ" || read.content.name == "MULTIEXPREQ") {
        throw HttpFailure(http::notImplemented, "multiple-requests-unsupported",
                          "several requests");
    }
    return read;
}

Call readCall(std::string_view body, std::size_t maximumDepth, std::size_t maximumMemory) {
    try {
        return callOf(readMessage(readXml(body, maximumDepth, maximumMemory)));
    } catch (const XmlError& error) {
        throw HttpFailure(http::badRequest, "request-not-well-formed", error.what());
    } catch (const NotValid& error) {
        throw HttpFailure(http::badRequest, "request-not-valid", error.what());
    }
}

std::string responseHead(const Call& call) {
    std::string text(messageHead);
    appendAttribute(text, "ID", call.messageId);
    appendAttribute(text, "PROTOCOLVERSION", "1.0");
    text += "><SIMPLERSP>";
    text += call.intrinsic ? "<IMETHODRESPONSE" : "<METHODRESPONSE";
    appendAttribute(text, "NAME", call.method);
    return text + '>';
}

std::string responseTail(const Call& call) {
    return std::string(call.intrinsic ? "</IMETHODRESPONSE>" : "</METHODRESPONSE>") +
           "</SIMPLERSP></MESSAGE></CIM>\n";
}

std::string errorResponse(const Call& call, unsigned code, std::string_view description) {
    std::string text = responseHead(call) + "<ERROR";
    appendAttribute(text, "CODE", std::to_string(code));
    appendAttribute(text, "DESCRIPTION", description.empty() ? cimStatusName(code) : description);
    return text + "/>" + responseTail(call);
}

}  // namespace cimom::wbem
