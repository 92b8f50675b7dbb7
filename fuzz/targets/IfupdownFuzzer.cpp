// interfaces(5) and the state file of ifupdown.
#include "configuration/ConfigurationFiles.h"

#include "Input.h"
#include "support/Texts.h"

namespace {

/// A blank behind each line keeps a "\" that is the last byte of a word from joining
/// lines, and a further word keeps blanks that do not separate words.
std::string written(const ZR::Live::IfaceStanza& stanza) {
    std::string text = "iface " + stanza.name + ' ' + stanza.family + ' ' + stanza.method +
                       (stanza.method.empty() ? "" : " -") + " \n";
    for (const auto& address : stanza.addresses) {
        text += "  address " + fuzz::textOf(address) + "/24\n";
    }
    return text + (stanza.dhcp ? "  dhcp 1\n" : "");
}

void checkInterfaces(std::string_view text) {
    const auto file = ZR::Live::parseInterfaces(text);
    std::string again;
    for (const auto& stanza : file.stanzas) {
        for (const auto& address : stanza.addresses) {
            fuzz::require(stanza.family == "inet" && address.isIPv4(),
                          "a fixed address is one of IPv4");
        }
        again += written(stanza);
    }
    for (const std::string& source : file.sources) {
        again += "source " + source + " \n";
    }
    for (const std::string& directory : file.directories) {
        again += "source-directory " + directory + " \n";
    }
    fuzz::require(ZR::Live::parseInterfaces(again) == file, "stanzas survive being written");
}

void checkState(std::string_view text) {
    const auto up = ZR::Live::parseIfstate(text);
    std::string again;
    for (const auto& [physical, logical] : up) {
        again.append(physical.view()).append("=").append(logical).append("\n");
    }
    fuzz::require(ZR::Live::parseIfstate(again) == up, "what is up survives being written");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    checkInterfaces(text);
    checkState(text);
    return 0;
}
