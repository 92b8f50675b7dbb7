#include "clients/Dhcp6c.h"

#include "formats/OptionWalk.h"
#include "kernel/Link.h"

namespace ZR::Live {

std::optional<ClientProcess> parseDhcp6cArguments(std::span<const std::string_view> arguments) {
    if (arguments.empty()) {
        return std::nullopt;
    }
    ClientProcess process{
        .client = Client::Dhcp6c, .interfaces = {}, .leaseFile = {}, .ipv6 = true};
    OptionWalk walk{arguments.subspan(1), "cpkP", {}};
    for (CommandOption option; walk.next(option);) {
        if (option.isOperand() && isInterfaceName(option.value)) {
            process.interfaces.emplace_back(option.value);
        }
    }
    return process;
}

}  // namespace ZR::Live
