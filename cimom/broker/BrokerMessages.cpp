#include "broker/BrokerText.h"

#include <vector>

#include "broker/objects/BrokerString.h"

namespace cimom::broker {

namespace {

constexpr CMPICount mostArguments = 10;

}  // namespace

bool formatMessage(std::string_view text, CMPICount count, std::va_list arguments,
                   std::string& message) {
    if (count > mostArguments) {
        return false;
    }
    std::vector<std::string> values;
    values.reserve(count);
    for (CMPICount index = 0; index < count; ++index) {
        switch (va_arg(arguments, int)) {
            case CMPI_sint8:
            case CMPI_sint16:
                values.push_back(std::to_string(va_arg(arguments, int)));
                break;
            case CMPI_uint8:
            case CMPI_uint16:
            case CMPI_char16:
                values.push_back(std::to_string(va_arg(arguments, unsigned)));
                break;
            case CMPI_sint32:
                values.push_back(std::to_string(va_arg(arguments, long)));
                break;
            case CMPI_uint32:
                values.push_back(std::to_string(va_arg(arguments, unsigned long)));
                break;
            case CMPI_sint64:
                values.push_back(std::to_string(va_arg(arguments, long long)));
                break;
            case CMPI_uint64:
                values.push_back(std::to_string(va_arg(arguments, unsigned long long)));
                break;
            case CMPI_real32:
            case CMPI_real64:
                values.push_back(std::to_string(va_arg(arguments, double)));
                break;
            case CMPI_boolean:
                values.emplace_back(va_arg(arguments, int) != 0 ? "true" : "false");
                break;
            case CMPI_chars: {
                const char* const characters = va_arg(arguments, const char*);
                values.emplace_back(characters == nullptr ? "" : characters);
                break;
            }
            case CMPI_string:
                values.emplace_back(textOf(va_arg(arguments, const CMPIString*)));
                break;
            default:
                return false;
        }
    }
    message.clear();
    for (std::size_t at = 0; at < text.size(); ++at) {
        const bool place =
            text[at] == '$' && at + 1 < text.size() && text[at + 1] >= '0' && text[at + 1] <= '9';
        const std::size_t index = place ? static_cast<std::size_t>(text[at + 1] - '0') : 0;
        if (place && index < values.size()) {
            message += values[index];
            ++at;
        } else {
            message += text[at];
        }
    }
    return true;
}

}  // namespace cimom::broker
