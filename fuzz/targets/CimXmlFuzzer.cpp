// The body of a request, as strangers send it.
#include "Input.h"
#include "cimxml/Call.h"
#include "cimxml/Errors.h"
#include "support/FuzzMachine.h"

namespace {

using cimom::wbem::Call;
using cimom::wbem::XmlElement;

/// The message that a response is.
XmlElement messageOf(const std::string& response) {
    return fuzz::validResponse(response).children.at(0);
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr std::size_t depth = 64;
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
