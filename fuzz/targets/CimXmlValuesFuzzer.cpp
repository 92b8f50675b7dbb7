// Instances and paths as elements of CIM-XML.
#include "Input.h"
#include "cimom/Instance.h"
#include "cimxml/Errors.h"
#include "cimxml/ObjectReader.h"
#include "cimxml/ObjectWriter.h"
#include "support/FuzzMachine.h"

namespace {

using cimom::wbem::XmlElement;

/// A key without a name, which is for the class to name, cannot be written before.
bool hasBareKey(const std::string& xml) {
    return xml.find("KEYBINDING NAME=\"\"") != std::string::npos;
}

void checkInstance(const XmlElement& element) {
    const cimom::Instance instance = cimom::wbem::readInstance(element);
    std::string xml;
    cimom::wbem::writeInstance(xml, instance, nullptr);
    const XmlElement written = fuzz::validResponse(xml);
    if (hasBareKey(xml)) {
        return;
    }
    const cimom::Instance back = cimom::wbem::readInstance(written);
    std::string again;
    cimom::wbem::writeInstance(again, back, nullptr);
    fuzz::require(again == xml, "an instance survives being written");
}

void checkPath(const XmlElement& element) {
    const cimom::ObjectPath path = cimom::wbem::readPath(element);
    std::string xml;
    cimom::wbem::writeReference(xml, path);
    const XmlElement written = fuzz::validResponse(xml);
    if (hasBareKey(xml)) {
        return;
    }
    const cimom::ObjectPath back = cimom::wbem::readPath(cimom::wbem::onlyChild(written));
    std::string again;
    cimom::wbem::writeReference(again, back);
    fuzz::require(again == xml, "a path survives being written");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr std::size_t depth = 32;
    try {
        const XmlElement element = cimom::wbem::readXml(fuzz::text(data, size), depth);
        if (element.name == "INSTANCE") {
            checkInstance(element);
        } else {
            checkPath(element);
        }
    } catch (const cimom::wbem::XmlError&) {
        return 0;
    } catch (const cimom::wbem::NotValid&) {
        return 0;
    } catch (const cimom::wbem::CimError& error) {
        fuzz::require(error.code != 0, "an error has a status");
    }
    return 0;
}
