// The responses of a server that others wrote, as the remote client reads them.
#include "Input.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "cimxml/Errors.h"
#include "cimxml/ObjectReader.h"
#include "cimxml/ObjectWriter.h"
#include "cimxml/OperationResponse.h"
#include "support/FuzzMachine.h"

namespace {

using cimom::wbem::XmlElement;

constexpr std::size_t depth = 64;
const std::string nameSpace = "root/cimv2";

/// Runs a reader that may say that the element is not of its kind, or holds no value.
template <typename Read>
void attempt(const Read& read) {
    try {
        read();
    } catch (const cimom::wbem::NotValid& error) {
        fuzz::require(*error.what() != '\0', "a refusal has a reason");
    } catch (const cimom::wbem::CimError& error) {
        fuzz::require(error.code != 0, "an error has a status");
    }
}

void checkReturned(const XmlElement& element) {
    attempt([&] {
        const auto path = cimom::wbem::readReturnedPath(element, nameSpace);
        fuzz::require(!path.nameSpace.empty() && !path.className.empty(),
                      "what was returned is an object of a namespace");
        std::string xml;
        cimom::wbem::writeReference(xml, path);
        fuzz::validResponse(xml);
    });
    attempt([&] {
        const auto instance = cimom::wbem::readReturnedInstance(element, nameSpace);
        fuzz::require(!instance.path.className.empty(), "an instance is of a class");
        std::string xml;
        cimom::wbem::writeInstance(xml, instance, nullptr);
        fuzz::validResponse(xml);
    });
    attempt([&] {
        const auto declaration = cimom::wbem::readClass(element);
        fuzz::require(!declaration.name.empty(), "a class has a name");
        for (const auto& property : declaration.properties) {
            fuzz::require(declaration.property(property.name) != nullptr,
                          "a property is found by its name");
        }
    });
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    try {
        const auto response =
            cimom::wbem::readResponse(fuzz::text(data, size), "EnumerateInstances", depth);
        fuzz::require(response.code == 0 || response.returned.empty(),
                      "a server returns objects or an error");
        for (const XmlElement& element : response.returned) {
            checkReturned(element);
        }
    } catch (const cimom::wbem::XmlError& error) {
        fuzz::require(*error.what() != '\0', "a refusal has a reason");
    } catch (const cimom::wbem::NotValid& error) {
        fuzz::require(*error.what() != '\0', "a refusal has a reason");
    }
    return 0;
}
