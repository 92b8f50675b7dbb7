// The command lines of DHCP clients, arguments with zero bytes between, as
// /proc/PID/cmdline has them.
#include <algorithm>
#include <optional>

#include "Input.h"
#include "clients/Dhclient.h"
#include "clients/Dhcp6c.h"
#include "clients/Dhcpcd.h"
#include "clients/Udhcpc.h"
#include "formats/OptionWalk.h"

namespace {

using Arguments = std::vector<std::string_view>;
using ZR::Live::ClientProcess;

void check(const std::optional<ClientProcess>& process, ZR::Live::Client client) {
    if (!process) {
        return;
    }
    fuzz::require(process->client == client, "a client is the one whose arguments were read");
    for (const ZR::Live::InterfaceName& interface : process->interfaces) {
        fuzz::require(process->serves(interface), "a client serves the interface it names");
    }
}

/// Every value is a part of the command line, and every byte is looked at once.
void checkWalk(const Arguments& arguments, std::string_view line) {
    ZR::Live::OptionWalk walk{arguments, "cfi", {}};
    std::size_t steps = 0;
    for (ZR::Live::CommandOption option; walk.next(option); ++steps) {
        for (const std::string_view part : {option.value, option.longName}) {
            fuzz::require(part.empty() || (part.data() >= line.data() &&
                                           part.data() + part.size() <= line.data() + line.size()),
                          "options are parts of the line");
        }
    }
    fuzz::require(steps <= line.size() + arguments.size(), "a walk ends");
    ZR::Live::CommandOption option;
    fuzz::require(!walk.next(option), "a walk that has ended stays so");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view line = fuzz::text(data, size);
    const Arguments arguments = fuzz::fields(line);
    check(ZR::Live::parseDhclientArguments(arguments), ZR::Live::Client::Dhclient);
    check(ZR::Live::parseDhcpcdArguments(arguments), ZR::Live::Client::Dhcpcd);
    check(ZR::Live::parseUdhcpcArguments(arguments), ZR::Live::Client::Udhcpc);
    check(ZR::Live::parseDhcp6cArguments(arguments), ZR::Live::Client::Dhcp6c);
    const auto interfaces = ZR::Live::dhcpcdInterfaces(arguments.front());
    for (std::size_t i = 0; i < interfaces.size(); ++i) {
        fuzz::require(arguments.front().starts_with(interfaces[i].view()),
                      "an interface begins the name of its file");
        fuzz::require(i == 0 || interfaces[i].view().size() < interfaces[i - 1].view().size(),
                      "the longest name comes first");
    }
    checkWalk(arguments, line);
    return 0;
}
