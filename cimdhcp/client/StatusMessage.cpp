#include "client/StatusMessage.h"

#include "cimom/ObjectPathText.h"
#include "cimxml/Errors.h"
#include "text/DisplayText.h"

namespace cimdhcp {

namespace {

/// What a status means for the path, when nobody said it in words.
std::string explanation(const Answer& answer, const cimom::ObjectPath& asked) {
    const std::string operation = answer.operation + " of " + asked.className;
    switch (answer.status.code) {
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

std::string remedy(const Answer& answer, const cimom::ObjectPath& asked) {
    switch (answer.status.code) {
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

std::string statusMessage(const Answer& answer, const cimom::ObjectPath& asked) {
    const std::string& words = answer.status.message;
    return std::string(statusNameOf(answer.status)) + ": " +
           printable(words.empty() ? explanation(answer, asked) : words) + remedy(answer, asked);
}

}  // namespace cimdhcp
