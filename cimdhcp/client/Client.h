#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "cimom/Forward.h"
#include "client/ClassList.h"
#include "client/ClassLookup.h"
#include "text/Failure.h"

namespace cimdhcp {

struct Response;

/// Sends the requests of the commands to the object manager of this process
/// (EmbeddedClient) or to a WBEM server (RemoteClient). Every response has a CIM status;
/// an operation that ends without one throws Failure. To be used by one thread at a time.
class Client {
  public:
    virtual ~Client() = default;
    Client(const Client&) = delete;
    Client& operator=(const Client&) = delete;

    /// The namespace of paths that name none.
    [[nodiscard]] const std::string& nameSpace() const noexcept { return nameSpace_; }
    /// The path of a class in that namespace.
    [[nodiscard]] cimom::ObjectPath classPath(const std::string& className) const;

    /// Borrows the client.
    [[nodiscard]] virtual ClassLookup classes() = 0;
    [[nodiscard]] virtual std::vector<ClassEntry> servedClasses() = 0;
    /// False: no provider serves the class, so that an empty response means nothing.
    [[nodiscard]] virtual bool mayServe(std::string_view className) const = 0;
    /// Where the ifcfg-INTERFACE files of the machine are, with "/" at the end; none
    /// for another machine than this one.
    [[nodiscard]] virtual std::optional<std::string> dataDir() const = 0;

    virtual Response enumerateNames(const cimom::ObjectPath& path) = 0;
    virtual Response enumerate(const cimom::ObjectPath& path) = 0;
    virtual Response get(const cimom::ObjectPath& path) = 0;
    // The same with a property list. The instances may have more than it names.
    virtual Response enumerateWith(const cimom::ObjectPath& path,
                                   const std::vector<std::string>& properties);
    virtual Response getWith(const cimom::ObjectPath& path,
                             const std::vector<std::string>& properties);
    /// Changes the properties that are named, to what the instance has for them. Providers
    /// that do not look at the names should find the others as they are in the instance.
    virtual Response modify(const cimom::Instance& instance,
                            const std::vector<std::string>& properties) = 0;
    virtual Response associatorNames(const cimom::ObjectPath& path,
                                     const cimom::AssociationRequest& request) = 0;
    virtual Response associators(const cimom::ObjectPath& path,
                                 const cimom::AssociationRequest& request) = 0;
    virtual Response referenceNames(const cimom::ObjectPath& path,
                                    const cimom::AssociationRequest& request) = 0;
    virtual Response references(const cimom::ObjectPath& path,
                                const cimom::AssociationRequest& request) = 0;

    /// What a command throws for a response that is not OK.
    [[nodiscard]] virtual Failure failure(const Response& response,
                                          const cimom::ObjectPath& asked) const = 0;

    /// The paths of all instances of a class. Throws Failure for a response that is not OK.
    [[nodiscard]] std::vector<cimom::ObjectPath> pathsIn(const std::string& className);
    /// All instances of a class; none when the class is not served. Throws Failure for any
    /// other response that is not OK.
    [[nodiscard]] std::optional<std::vector<cimom::Instance>> instancesIn(
        const std::string& className);

  protected:
    explicit Client(std::string nameSpace) : nameSpace_(std::move(nameSpace)) {}

  private:
    std::string nameSpace_;
};

}  // namespace cimdhcp
