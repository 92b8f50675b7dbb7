// The body of a request, as strangers send it.
#include "Input.h"
#include "wbem/Call.h"
#include "wbem/Errors.h"
#include "wbem/XmlDocument.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr std::size_t depth = 64;
    try {
        const cimom::wbem::Call call = cimom::wbem::readCall(fuzz::text(data, size), depth);
        fuzz::require(!cimom::wbem::answerHead(call).empty());
    } catch (const std::runtime_error&) {
        return 0;
    }
    return 0;
}
