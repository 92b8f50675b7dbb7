#include "cimxml/ExportMessage.h"

#include <charconv>
#include <utility>

#include "MessageHead.h"
#include "cimom/Names.h"
#include "cimxml/Errors.h"
#include "cimxml/HttpStatus.h"
#include "cimxml/ObjectReader.h"
#include "cimxml/ObjectWriter.h"
#include "cimxml/XmlText.h"

namespace cimom::wbem {

namespace {

constexpr std::string_view instanceEnd = "</INSTANCE>";

void appendProperty(std::string& out, const char* name, const char* type, std::string_view value) {
    out += "<PROPERTY";
    appendAttribute(out, "NAME", name);
    appendAttribute(out, "TYPE", type);
    out += "><VALUE>";
    appendText(out, value);
    out += "</VALUE></PROPERTY>";
}

ExportResponse readExportError(const XmlElement& element) {
    ExportResponse response;
    const std::string& code = requiredAttribute(element, "CODE");
    const char* const end = code.data() + code.size();
    const auto [stop, error] = std::from_chars(code.data(), end, response.code);
    if (error != std::errc() || stop != end || response.code == 0) {
        throw NotValid("CODE \"" + code + "\" of ERROR");
    }
    if (const std::string* const description = element.attribute("DESCRIPTION")) {
        response.description = *description;
    }
    return response;
}

ExportCall exportCallOf(ReadMessage message) {
    ExportCall call;
    call.messageId = std::move(message.id);
    expectName(message.content, "SIMPLEEXPREQ");
    expectNoText(message.content);
    std::erase_if(message.content.children,
                  [](const XmlElement& child) { return child.name == "CORRELATOR"; });
    static_cast<void>(onlyChild(message.content));
    XmlElement& method = message.content.children.front();
    expectName(method, "EXPMETHODCALL");
    expectNoText(method);
    call.method = requiredAttribute(method, "NAME");
    for (XmlElement& child : method.children) {
        expectName(child, "EXPPARAMVALUE");
        expectNoText(child);
        if (child.children.size() > 1) {
            throw NotValid("the content of EXPPARAMVALUE");
        }
        Parameter parameter{requiredAttribute(child, "NAME"), std::nullopt};
        if (!child.children.empty()) {
            parameter.value = std::move(child.children.front());
        }
        call.parameters.push_back(std::move(parameter));
    }
    return call;
}

}  // namespace

std::string indicationText(const Instance& indication, std::string_view filterName) {
    Instance sent = indication;
    std::erase_if(sent.properties, [](const NamedValue& property) {
        return sameName(property.name, "SequenceContext") ||
               sameName(property.name, "SequenceNumber") ||
               sameName(property.name, "IndicationFilterName");
    });
    std::string text;
    writeInstance(text, sent, nullptr);
    text.resize(text.size() - instanceEnd.size());
    appendProperty(text, "IndicationFilterName", "string", filterName);
    return text.append(instanceEnd);
}

std::string exportMessage(std::string_view messageId, std::string_view indication,
                          const IndicationSequence& sequence) {
    std::string text(messageHead);
    appendAttribute(text, "ID", messageId);
    // EXPPARAMVALUE has its name alone: there are listeners that refuse any other attribute.
    text += R"( PROTOCOLVERSION="1.0"><SIMPLEEXPREQ><EXPMETHODCALL NAME="ExportIndication">)"
            R"(<EXPPARAMVALUE NAME="NewIndication">)";
    text += indication.substr(0, indication.size() - instanceEnd.size());
    appendProperty(text, "SequenceContext", "string", sequence.context);
    appendProperty(text, "SequenceNumber", "sint64", std::to_string(sequence.number));
    text += instanceEnd;
    return text + "</EXPPARAMVALUE></EXPMETHODCALL></SIMPLEEXPREQ></MESSAGE></CIM>\n";
}

ExportResponse readExportResponse(std::string_view body, std::size_t maximumDepth) {
    const XmlElement cim = readXml(body, maximumDepth);
    expectName(cim, "CIM");
    const XmlElement& message = onlyChild(cim);
    expectName(message, "MESSAGE");
    const XmlElement& simple = onlyChild(message);
    expectName(simple, "SIMPLEEXPRSP");
    const XmlElement& response = onlyChild(simple);
    expectName(response, "EXPMETHODRESPONSE");
    if (!sameName(requiredAttribute(response, "NAME"), exportMethod)) {
        throw NotValid("a response to " + requiredAttribute(response, "NAME"));
    }
    const bool failed = !response.children.empty() && response.children.front().name == "ERROR";
    return failed ? readExportError(response.children.front()) : ExportResponse{};
}

ExportCall readExportCall(std::string_view body, std::size_t maximumDepth) {
    try {
        return exportCallOf(readMessage(readXml(body, maximumDepth)));
    } catch (const XmlError& error) {
        throw HttpFailure(http::badRequest, "request-not-well-formed", error.what());
    } catch (const NotValid& error) {
        throw HttpFailure(http::badRequest, "request-not-valid", error.what());
    }
}

Instance indicationOf(const ExportCall& call) {
    if (!sameName(call.method, exportMethod)) {
        throw CimError(CimStatus::notSupported, "the method " + call.method + " is not offered");
    }
    const bool one =
        call.parameters.size() == 1 && sameName(call.parameters.front().name, "NewIndication");
    if (!one || !call.parameters.front().value ||
        call.parameters.front().value->name != "INSTANCE") {
        throw CimError(CimStatus::invalidParameter, "NewIndication with an instance is expected");
    }
    try {
        return readInstance(*call.parameters.front().value);
    } catch (const NotValid& error) {
        throw CimError(CimStatus::invalidParameter, error.what());
    }
}

std::string exportResponse(const ExportCall& call, const ExportResponse& response) {
    std::string text(messageHead);
    appendAttribute(text, "ID", call.messageId);
    text += R"( PROTOCOLVERSION="1.0"><SIMPLEEXPRSP><EXPMETHODRESPONSE)";
    appendAttribute(text, "NAME", call.method);
    text += '>';
    if (response.code != 0) {
        text += "<ERROR";
        appendAttribute(text, "CODE", std::to_string(response.code));
        appendAttribute(text, "DESCRIPTION",
                        response.description.empty() ? cimStatusName(response.code)
                                                     : std::string_view(response.description));
        text += "/>";
    }
    return text + "</EXPMETHODRESPONSE></SIMPLEEXPRSP></MESSAGE></CIM>\n";
}

}  // namespace cimom::wbem
