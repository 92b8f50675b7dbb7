#include <cstdio>

#include "providerutilities/ProviderUtilities.h"
#include "zrclient/Instrumentation.h"
#include "zrclient/NodeLexicon.h"

// Prints the names of the network interfaces, and the number of a class.
int main() {
    ZR::Instrumentation interfaces;
    interfaces.selectNode(ZR::NodeLexicon::NodeType::NetworkInterface);
    for (; interfaces; ++interfaces) {
        std::string name;
        if (interfaces.getProperty(ZR::NodeLexicon::Properties::Name, name)) {
            std::puts(name.c_str());
        }
    }
    std::printf("%u\n",
                static_cast<unsigned>(ZR::ProviderUtilities::getClassId("QVXZR_DHCPSettingData")));
}
