#include "client/Response.h"

#include "cimom/ObjectPathText.h"
#include "cimxml/Errors.h"
#include "text/DisplayText.h"

namespace cimdhcp {

namespace {

/// What a status means for the path, when the response has no words of its own.
std::string explanation(const Response& response, const cimom::ObjectPath& asked) {
    const std::string operation = response.operation + " of " + asked.className;
    switch (response.status.code) {
        case CMPI_RC_ERR_ACCESS_DENIED:
            return operation + " is not allowed";
        case CMPI_RC_ERR_INVALID_NAMESPACE:
            return "nothing is served in the namespace " + asked.nameSpace;
        case CMPI_RC_ERR_INVALID_CLASS:
            return operation + ": the class is not served";
        case CMPI_RC_ERR_NOT_FOUND:
            return "there is no " + cimom::toText(asked);
        case CMPI_RC_ERR_NOT_SUPPORTED:
            return operation + " is not supported";
        default:
            return operation + " failed; the system log may tell more";
    }
}

std::string remedy(const Response& response, const cimom::ObjectPath& asked) {
    switch (response.status.code) {
        case CMPI_RC_ERR_INVALID_CLASS:
            return "; \"cimdhcp classes\" lists what is";
        case CMPI_RC_ERR_NOT_FOUND:
            return "; \"cimdhcp names " + asked.className + "\" lists what there is";
        default:
            return {};
    }
}

}  // namespace

std::string_view statusNameOf(const cimom::Status& status) noexcept {
    return status.ok() ? cimom::statusName(status.code)
                       : cimom::wbem::cimStatusName(static_cast<unsigned>(status.code));
}

std::string statusMessage(const Response& response, const cimom::ObjectPath& asked) {
    const std::string& words = response.status.message;
    return std::string(statusNameOf(response.status)) + ": " +
           printable(words.empty() ? explanation(response, asked) : words) +
           remedy(response, asked);
}

}  // namespace cimdhcp
