#pragma once

#include <optional>
#include <string>
#include <vector>

#include "arguments/Commands.h"
#include "cimom/Forward.h"
#include "cimom/ObjectPath.h"
#include "client/Response.h"
#include "text/Failure.h"

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

/// Whether clients may change the property, by its class and by what the provider looks at.
[[nodiscard]] bool mayBeWritten(const cimom::ClassDeclaration& declaration,
                                const cimom::PropertyDeclaration& property);

/// The names of the references of served associations, of the class given or of all.
[[nodiscard]] std::vector<std::string> rolesOf(const std::optional<std::string>& assocClass,
                                               Client& client);

/// "CLASS has no property \"NAME\"", with the nearest name that it has.
[[nodiscard]] std::string noPropertyText(const cimom::ClassDeclaration& declaration,
                                         const std::string& name);

/// What the status of a response that is not OK comes from, as far as the names that were
/// asked for show it: the failure with the class that was likely meant, or the keys that the
/// class has.
[[nodiscard]] Failure explainedFailure(const CimOperation& operation, Client& client);

/// Throws Failure when the response is empty, or refused, for the sake of what is not there:
/// the instance, a class that filters, or a role that no association has.
void refuseMissingSource(const AssociatorsCommand& command, const CimOperation& operation,
                         Client& client);
void refuseMissingSource(const ReferencesCommand& command, const CimOperation& operation,
                         Client& client);

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
