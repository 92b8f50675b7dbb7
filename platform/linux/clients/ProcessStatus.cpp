#include "clients/Processes.h"

#include <algorithm>
#include <cstddef>

#include "formats/ValueFormats.h"
#include "zrcommon/Strings.h"

namespace ZR::Live {
namespace {

constexpr int hexadecimalBase = 16;

}  // namespace

std::optional<ProcessStatus> parseProcessStatus(std::string_view text) {
    ProcessStatus status;
    bool hasUsers = false;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        std::string_view line = text.substr(0, end);
        text.remove_prefix(std::min(end + 1, text.size()));
        const std::string_view key = nextWord(line);
        const std::string_view value = nextWord(line);
        if (key == "State:" && !value.empty()) {
            status.state = value.front();
        } else if (key == "PPid:") {
            status.parent = parseNumber<std::int32_t>(value).value_or(0);
        } else if (key == "Uid:") {
            const auto real = parseNumber<std::uint32_t>(value);
            const auto effective = parseNumber<std::uint32_t>(nextWord(line));
            hasUsers = real && effective;
            status.realUser = real.value_or(0);
            status.user = effective.value_or(0);
        } else if (key == "CapEff:") {
            status.capabilities = parseNumber<std::uint64_t>(value, hexadecimalBase).value_or(0);
        }
    }
    return hasUsers && status.state != '\0' ? std::optional{status} : std::nullopt;
}

}  // namespace ZR::Live
