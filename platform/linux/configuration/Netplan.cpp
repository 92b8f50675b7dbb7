#include "configuration/ConfigurationFiles.h"

#include <string>
#include <utility>

#include "formats/Files.h"
#include "formats/InterfaceName.h"
#include "formats/NetworkFile.h"
#include "formats/Trust.h"

namespace ZR::Live {

void readNetplan(const Roots& roots, ClientFacts& facts) {
    const std::string directory = roots.path(netplanDirectory);
    for (const std::string& name : listOptionalDirectory(directory, facts.diagnostics)) {
        if (name.find("-netplan-") == std::string::npos || !name.ends_with(".network")) {
            continue;
        }
        std::string path = pathIn(directory, name);
        const auto text = readTrustedFile(path, {}, facts.diagnostics);
        if (!text) {
            continue;
        }
        NetworkFile file;
        applyNetworkFile(*text, file);
        // Of a pattern only networkd can tell what it matches.
        const auto interface = InterfaceName::from(file.matchName);
        if (!interface || file.matchName.find_first_of("*?[!") != std::string::npos) {
            continue;
        }
        facts.configurations.push_back({.client = Client::Netplan,
                                        .interfaceName = interface,
                                        .dhcp4 = file.dhcp4,
                                        .dhcp6 = file.dhcp6,
                                        .staticAddresses = std::move(file.addresses),
                                        .linkLocal4 = file.linkLocal4,
                                        .origin = std::move(path)});
    }
}

}  // namespace ZR::Live
