// A byte that names a type, and the text of a value: of CIM-XML, of a date, and of what
// a person types.
#include "cimom/ClassDeclaration.h"
#include "cimxml/XmlText.h"

#include <cmath>

#include "Input.h"
#include "arguments/ArgumentValue.h"
#include "cimom/DateTimeText.h"
#include "cimxml/XmlDocument.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/IntegerText.h"
#include "text/MofText.h"

namespace {

using cimom::Scalar;
using cimom::Type;

std::string written(Type type, const Scalar& scalar) {
    std::string xml = "<V>";
    cimom::wbem::appendScalarText(xml, type, scalar);
    return xml + "</V>";
}

void checkScalar(Type type, std::string_view text) {
    const auto scalar = cimom::wbem::readScalarText(type, text);
    if (!scalar) {
        return;
    }
    const std::string xml = written(type, *scalar);
    // Whatever a value holds, it does not spoil the document around it.
    const std::string plain = cimom::wbem::readXml(xml, 2).text;
    const auto back = cimom::wbem::readScalarText(type, plain);
    fuzz::require(back && written(type, *back) == xml, "a value survives being written");
}

void checkDateTime(std::string_view text) {
    if (const auto date = cimom::parseDateTime(text)) {
        if (const auto again = cimom::toText(*date)) {
            fuzz::require(again->size() == 25 && cimom::parseDateTime(*again) == date,
                          "a date survives being written");
        }
    }
}

void checkInteger(std::string_view text) {
    if (const auto integer = cimdhcp::readInteger(text)) {
        const std::string decimal =
            (integer->negative ? "-" : "") + std::to_string(integer->magnitude);
        fuzz::require(cimdhcp::readInteger(decimal) == integer,
                      "an integer survives being written");
    }
}

void checkTyped(Type type, bool isArray, std::string_view text) {
    cimom::PropertyDeclaration property;
    property.name = "Property";
    property.type = type;
    property.isArray = isArray;
    property.referenceClass = "CIM_Thing";
    cimom::Value value;
    try {
        value = cimdhcp::readValue(property, text);
    } catch (const cimdhcp::Failure& failure) {
        fuzz::require(failure.status() == cimdhcp::ExitStatus::usage, "what is wrong is the usage");
        return;
    }
    fuzz::require(value.type == type && value.isArray == isArray,
                  "a value is of its property's type");
    fuzz::require(!cimdhcp::mofInitializer(value).empty(), "a value can be shown");
}

void checkDisplay(std::string_view text) {
    const std::string shown = cimdhcp::printable(text);
    for (const char letter : shown) {
        const auto byte = static_cast<unsigned char>(letter);
        fuzz::require(byte >= 0x20 && byte != 0x7F, "nothing steers a terminal");
    }
    fuzz::require(cimdhcp::printable(shown) == shown, "what can be printed is printed as it is");
    for (const std::size_t width : {std::size_t{2}, std::size_t{7}}) {
        fuzz::require(cimdhcp::displayWidth(cimdhcp::cutToWidth(shown, width)) <= width,
                      "what is cut has room");
        for (const std::string& line : cimdhcp::wrapToWidth(shown, width)) {
            fuzz::require(cimdhcp::displayWidth(line) <= width, "a line has room");
        }
    }
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    fuzz::Bytes input(data, size);
    const auto head = input.number<std::uint8_t>();
    const auto type = static_cast<Type>(head % 16U);
    const auto rest = input.take(size);
    const std::string_view text = fuzz::text(rest.data(), rest.size());
    checkScalar(type, text);
    checkDateTime(text);
    checkInteger(text);
    checkTyped(type, (head & 0x80U) != 0, text);
    checkDisplay(text);
    return 0;
}
