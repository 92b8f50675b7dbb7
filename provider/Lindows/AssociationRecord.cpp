#include "Lindows/AssociationRecord.h"

namespace ZR::DHCPClientProvider {

using NodeLexicon::NodeType;
using NodeLexicon::Properties;

std::optional<std::string> findKey(Moniker& moniker, std::string_view name, const TracePoint& at) {
    std::optional<std::string> found;
    visitKeys(moniker, [&](std::size_t, const std::string& present) {
        std::string value;
        if (present != name || !moniker.getValue(value)) {
            return false;
        }
        traceVariable(at, name, value);
        found = std::move(value);
        return true;
    });
    return found;
}

std::string requireKey(Moniker& moniker, std::string_view name, const char* message,
                       const TracePoint& at) {
    std::optional<std::string> value = findKey(moniker, name, at);
    if (!value) {
        throw FrameworkException(message);
    }
    return *std::move(value);
}

Moniker monikerOf(const char* name, const std::string& value) {
    Moniker moniker;
    moniker.addKey(name, value);
    return moniker;
}

Moniker findSystemMoniker(Instrumentation& cursor, Moniker& known, const TracePoint& at) {
    const std::string systemName =
        requireKey(known, "SystemName", "Could not find 'System Name' Key in Moniker", at);
    std::string name;
    if (!walkTo(cursor, NodeType::ComputerSystem, [&](const auto& computer) {
            if (!computer.getProperty(Properties::Name, name)) {
                throw InstrumentationException("Name Property on computer not available.");
            }
            return name == systemName;
        })) {
        throw InstrumentationException("Concerned Computer Could Not Be Found.");
    }
    return monikerOf("Name", name);
}

std::string interfaceOfAccessPoint(const std::string& accessPointName, const TracePoint& at) {
    const std::size_t end = accessPointName.rfind('_');
    if (end == std::string::npos) {
        throw FrameworkException("Name Key is not correct.");
    }
    std::string nameKey = accessPointName.substr(0, end);
    traceVariable(at, "nameKey", nameKey);
    return nameKey;
}

}  // namespace ZR::DHCPClientProvider
