#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "cimom/ObjectManager.h"
#include "client/ClassList.h"
#include "client/ClassLookup.h"
#include "client/MachineInterfaces.h"
#include "client/Response.h"
#include "text/Failure.h"

namespace cimdhcp {

/// What the commands ask: the object manager of this process (EmbeddedClient) or a
/// WBEM server (RemoteClient). Every answer has a CIM status; what keeps an operation
/// from having one throws Failure. To be used by one thread at a time.
class Client {
  public:
    virtual ~Client() = default;
    Client(const Client&) = delete;
    Client& operator=(const Client&) = delete;

    /// The namespace of paths that name none.
    [[nodiscard]] const std::string& nameSpace() const noexcept { return nameSpace_; }
    /// The path of a class in that namespace.
    [[nodiscard]] cimom::ObjectPath classPath(const std::string& className) const {
        return {"", nameSpace_, className, {}};
    }

    /// Borrows the client.
    [[nodiscard]] virtual ClassLookup classes() = 0;
    [[nodiscard]] virtual std::vector<ClassEntry> servedClasses() = 0;
    /// False: no provider serves the class, so that an empty answer means nothing.
    [[nodiscard]] virtual bool mayServe(std::string_view className) const = 0;
    /// The interfaces of the machine, with nothing about DHCP yet.
    [[nodiscard]] virtual MachineInterfaces interfaces(const ServedInstances& served) = 0;
    /// Where this machine's ifcfg-INTERFACE files are, with "/" at its end; none:
    /// another machine is asked.
    [[nodiscard]] virtual std::optional<std::string> dataDir() const = 0;

    virtual Answer enumerateNames(const cimom::ObjectPath& path) = 0;
    virtual Answer enumerate(const cimom::ObjectPath& path) = 0;
    virtual Answer get(const cimom::ObjectPath& path) = 0;
    /// Changes the properties that the instance has, and no others.
    virtual Answer modify(const cimom::Instance& instance) = 0;
    virtual Answer associatorNames(const cimom::ObjectPath& path,
                                   const cimom::AssociationRequest& request) = 0;
    virtual Answer associators(const cimom::ObjectPath& path,
                               const cimom::AssociationRequest& request) = 0;
    virtual Answer referenceNames(const cimom::ObjectPath& path,
                                  const cimom::AssociationRequest& request) = 0;
    virtual Answer references(const cimom::ObjectPath& path,
                              const cimom::AssociationRequest& request) = 0;

    /// What an answer that is not OK ends the command with.
    [[nodiscard]] virtual Failure failure(const Answer& answer,
                                          const cimom::ObjectPath& asked) const = 0;

  protected:
    explicit Client(std::string nameSpace) : nameSpace_(std::move(nameSpace)) {}

  private:
    std::string nameSpace_;
};

}  // namespace cimdhcp
