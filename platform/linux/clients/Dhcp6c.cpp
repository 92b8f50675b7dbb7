#include "clients/Dhcp6c.h"

#include "formats/InterfaceName.h"
#include "formats/OptionWalk.h"

namespace ZR::Live {

std::optional<ClientProcess> parseDhcp6cArguments(std::span<const std::string_view> arguments) {
    if (arguments.empty()) {
        return std::nullopt;
    }
    ClientProcess process{
        .client = Client::Dhcp6c, .interfaces = {}, .leaseFile = {}, .ipv6 = true};
    OptionWalk walk{arguments.subspan(1), "cpkP", {}};
    for (CommandOption option; walk.next(option);) {
        const auto name = InterfaceName::from(option.value);
        if (option.isOperand() && name) {
            process.interfaces.push_back(*name);
        }
    }
    return process;
}

}  // namespace ZR::Live
