#pragma once

#include <filesystem>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "cimom/Forward.h"
#include "cimom/Registrations.h"
#include "cimom/Requests.h"

namespace cimom {

struct Configuration {
    std::vector<std::filesystem::path> schemaDirectories;  ///< read in this order
    std::vector<std::filesystem::path> registrationFiles;
    std::vector<std::filesystem::path> providerDirectories;  ///< searched in this order
    std::string host;  ///< host of full paths; the machine's name when empty
    /// A file of a whole CIM schema, with what it includes. It is read first, and what it
    /// declares stands: the schema directories add to it. Empty: none.
    std::filesystem::path fullSchema = {};
    /// Gets a line about each provider that failed in a request about associations, of which
    /// the client is not told if others responded. Any thread calls it, several at once.
    /// Empty: no log.
    std::function<void(const std::string& line)> log = {};
};

/// Loads CMPI 2.0 providers and carries requests to them. Safe for concurrent
/// requests. It knows CIM and CMPI, and nothing about what providers serve.
///
/// A foreign exception, a null result or a missing slot of a provider costs the
/// request that met it alone. A crash of a provider is a crash of the process.
class ObjectManager final : public RequestHandler {
  public:
    /// Reads schema and registrations; providers are opened when first asked.
    /// Throws MofError or LoadError.
    explicit ObjectManager(Configuration configuration);
    /// Cleans up and unloads every provider; the own classes end behind them.
    ~ObjectManager() override;
    ObjectManager(const ObjectManager&) = delete;
    ObjectManager& operator=(const ObjectManager&) = delete;

    /// Serves a class without a provider. Only while no request runs, and so before the
    /// first. Throws LoadError for a class that neither schema nor its own declaration knows,
    /// or that a provider serves in one of the namespaces, and MofError for a declaration
    /// that cannot be read.
    void serve(std::unique_ptr<OwnClass> own);

    [[nodiscard]] const ClassRepository& repository() const noexcept;
    [[nodiscard]] const std::vector<Registration>& registrations() const noexcept;
    /// The namespaces that the registrations and the own classes name, each once, in their
    /// order.
    [[nodiscard]] const std::vector<std::string>& nameSpaces() const noexcept;
    /// The one of them that a client means, who may write it in any case, and "interop" for
    /// "root/interop"; null: none.
    [[nodiscard]] const std::string* findNameSpace(const std::string& wanted) const;
    /// The host of full paths.
    [[nodiscard]] const std::string& host() const noexcept;
    /// Subscriptions to what providers tell by themselves.
    [[nodiscard]] IndicationHub& indications() noexcept;

    RequestEnd enumerateInstanceNames(const ObjectPath& path, const InstanceRequest& request,
                                      ResultReceiver<ObjectPath>& receiver) override;
    RequestEnd enumerateInstances(const ObjectPath& path, const InstanceRequest& request,
                                  ResultReceiver<Instance>& receiver) override;
    InstancesResult getInstance(const ObjectPath& path,
                                const InstanceRequest& request = {}) override;
    InstancesResult modifyInstance(const Instance& instance,
                                   const InstanceRequest& request = {}) override;
    PathsResult createInstance(const Instance& instance,
                               const InstanceRequest& request = {}) override;
    Status deleteInstance(const ObjectPath& path, const InstanceRequest& request = {}) override;
    RequestEnd execQuery(const std::string& nameSpace, const Query& query,
                         const InstanceRequest& request,
                         ResultReceiver<Instance>& receiver) override;
    RequestEnd associatorNames(const ObjectPath& path, const AssociationRequest& request,
                               ResultReceiver<ObjectPath>& receiver) override;
    RequestEnd associators(const ObjectPath& path, const AssociationRequest& request,
                           ResultReceiver<Instance>& receiver) override;
    RequestEnd referenceNames(const ObjectPath& path, const AssociationRequest& request,
                              ResultReceiver<ObjectPath>& receiver) override;
    RequestEnd references(const ObjectPath& path, const AssociationRequest& request,
                          ResultReceiver<Instance>& receiver) override;

    // The same for those who need the whole result at once. After an error it is empty.
    PathsResult enumerateInstanceNames(const ObjectPath& path, const InstanceRequest& request = {});
    InstancesResult enumerateInstances(const ObjectPath& path, const InstanceRequest& request = {});
    PathsResult associatorNames(const ObjectPath& path, const AssociationRequest& request = {});
    InstancesResult associators(const ObjectPath& path, const AssociationRequest& request = {});
    PathsResult referenceNames(const ObjectPath& path, const AssociationRequest& request = {});
    InstancesResult references(const ObjectPath& path, const AssociationRequest& request = {});

  private:
    class Implementation;
    std::unique_ptr<Implementation> implementation_;
};

}  // namespace cimom
