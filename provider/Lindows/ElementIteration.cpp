#include "Lindows/ElementIteration.h"

#include <unistd.h>

#include <array>

#include "providerutilities/Classes.h"
#include "zrcommon/SystemName.h"

namespace ZR::DHCPClientProvider {

std::string readSystemDescription(const Instrumentation& cursor, const TracePoint& at,
                                  const char* variable) {
    Instrumentation system;
    system.selectParentOf(cursor);
    system.selectParentOf(system);
    std::string description;
    system.getNodeDescription(description);
    traceVariable(at, variable, description);
    return description;
}

const char* systemClassOf(const std::string& systemDescription) {
    return systemDescription == NodeLexicon::serviceProcessorDescription
               ? "QVXZR_SPComputerSystem"
               : Classes::computerSystem.name;
}

bool readHostName(std::string& name, const TracePoint& at) {
    std::array<char, hostNameBufferSize> buffer;  // NOLINT(cppcoreguidelines-pro-type-member-init)
    if (::gethostname(buffer.data(), buffer.size()) == -1) {
        traceMessage(at, "gethostname Failed");
        return false;
    }
    buffer.back() = '\0';
    name = buffer.data();
    return true;
}

bool skipToDHCPInterface(Instrumentation& cursor) {
    for (; cursor; ++cursor) {
        // What cannot be read is not enabled.
        bool enabled = false;
        cursor.getProperty(NodeLexicon::Properties::DHCPEnabled, enabled);
        if (enabled) {
            return true;
        }
    }
    return false;
}

bool equalsReference(const std::string& actual, const std::string& reference,
                     const TracePoint& at) {
    traceVariable(at, "actualOutput", actual);
    traceVariable(at, "iterator->reference", reference);
    return actual == reference;
}

bool unsupported(const TracePoint& at, const void* output) {
    const ParameterScope scope(at, " value=", output);
    return false;
}

bool appendOptions(const TracePoint& at, std::vector<unsigned short>& output) {
    const ParameterScope scope(at, " value=", &output);
    output.insert(output.end(), {8, 14, 17});
    return true;
}

}  // namespace ZR::DHCPClientProvider
