#pragma once

#include "arguments/Commands.h"
#include "cimom/ObjectPath.h"
#include "client/Response.h"

namespace cimdhcp {

class Client;

/// The one class whose instances the provider changes, and the one property of it that
/// the provider looks at, whatever else the standard's class lets a client write.
inline constexpr const char* settingClass = "QVXZR_DHCPSettingData";
inline constexpr const char* nameProperty = "ConfigurationName";

/// One CIM operation that was carried out, whatever the status of its response.
struct CimOperation {
    cimom::ObjectPath path;  ///< of the class or instance that was asked for
    Response response;
};

// The commands that are one CIM operation each. They throw Failure when their
// arguments cannot be understood.
[[nodiscard]] CimOperation carryOut(const NamesCommand& command, Client& client);
[[nodiscard]] CimOperation carryOut(const InstancesCommand& command, Client& client);
[[nodiscard]] CimOperation carryOut(const GetCommand& command, Client& client);
[[nodiscard]] CimOperation carryOut(const AssociatorsCommand& command, Client& client);
[[nodiscard]] CimOperation carryOut(const ReferencesCommand& command, Client& client);

/// Changes the properties that are named, and keeps the others: the instance is got, what
/// is new put in, all of it sent, and read back. Throws Failure, too, when a property
/// cannot be written, and when nothing was changed or is other than wanted.
[[nodiscard]] CimOperation carryOut(const ModifyCommand& command, Client& client);

}  // namespace cimdhcp
