// The body of a request, as strangers send it to a server or to a listener.
#include "Input.h"
#include "cimxml/Call.h"
#include "cimxml/Errors.h"
#include "cimxml/ExportMessage.h"
#include "support/FuzzMachine.h"

namespace {

using cimom::wbem::Call;
using cimom::wbem::XmlElement;

constexpr std::size_t depth = 64;

/// The message that a response is.
XmlElement messageOf(const std::string& response) {
    return fuzz::validResponse(response).children.at(0);
}

/// What a listener makes of the same body, and a server of it as a listener's response.
void checkExport(std::string_view body) {
    try {
        const auto indication = cimom::wbem::indicationOf(cimom::wbem::readExportCall(body, depth));
        const std::string text = cimom::wbem::indicationText(indication, "filter");
        const auto again = cimom::wbem::readExportCall(
            cimom::wbem::exportMessage("1", text, {"context", 0}), depth);
        fuzz::require(again.parameters.size() == 1, "an indication can be sent on");
    } catch (const cimom::wbem::HttpFailure& failure) {
        fuzz::require(failure.status == 400 || failure.status == 501, "a refusal has a status");
    } catch (const cimom::wbem::CimError& error) {
        fuzz::require(error.code != 0, "an error has a status");
    }
    try {
        static_cast<void>(cimom::wbem::readExportResponse(body, depth));
    } catch (const cimom::wbem::XmlError& error) {
        fuzz::require(*error.what() != '\0', "a refusal has a reason");
    } catch (const cimom::wbem::NotValid& error) {
        fuzz::require(*error.what() != '\0', "a refusal has a reason");
    }
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    checkExport(fuzz::text(data, size));
    Call call;
    try {
        call = cimom::wbem::readCall(fuzz::text(data, size), depth);
    } catch (const cimom::wbem::HttpFailure& failure) {
        fuzz::require(failure.status == 400 || failure.status == 501, "a refusal has a status");
        return 0;
    } catch (const cimom::wbem::NotValid& error) {
        fuzz::require(*error.what() != '\0', "a refusal has a reason");
        return 0;
    }
    const std::string refusal = cimom::wbem::errorResponse(call, 1, fuzz::text(data, size));
    const std::string empty = cimom::wbem::responseHead(call) + cimom::wbem::responseTail(call);
    for (const std::string& response : {refusal, empty}) {
        const XmlElement message = messageOf(response);
        const std::string* const id = message.attribute("ID");
        fuzz::require(id != nullptr && *id == call.messageId,
                      "a response bears the request's number");
    }
    return 0;
}
