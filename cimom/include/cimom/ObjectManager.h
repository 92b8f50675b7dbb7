#pragma once

#include <cstddef>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "cimom/Cim.h"
#include "cimom/ClassRepository.h"

namespace cimom {

/// Which provider serves a class.
struct Registration {
    std::string className;
    std::string provider;  ///< the name in its factories' symbols
    std::string location;  ///< library without "lib" and ".so"
    bool instance = false;
    bool association = false;
    std::vector<std::string> nameSpaces;

    bool operator==(const Registration&) const = default;
};

/// A file or library that the object manager cannot use; what() tells which and why.
class LoadError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// Reads a registration file: a section "[CLASS]" per class with the lines
/// "provider:", "location:", "type:" and "namespace:" (the last two with one or
/// several words), "#" comments. Throws LoadError with file and line.
[[nodiscard]] std::vector<Registration> readRegistrations(const std::filesystem::path& file);

struct Configuration {
    std::vector<std::filesystem::path> schemaDirectories;
    std::vector<std::filesystem::path> registrationFiles;
    std::vector<std::filesystem::path> providerDirectories;  ///< searched in this order
    std::string host;  ///< host of full paths; the machine's name when empty
};

/// What a client asks beyond the object itself. Absent filters restrict nothing.
struct InstanceRequest {
    std::optional<std::vector<std::string>> propertyList;  ///< absent: all properties
    std::string principal;                                 ///< empty: none
};

struct AssociationRequest {
    std::optional<std::string> assocClass;   ///< of associators
    std::optional<std::string> resultClass;  ///< of references: the association class
    std::optional<std::string> role;
    std::optional<std::string> resultRole;  ///< of associators
    std::optional<std::vector<std::string>> propertyList;
    std::string principal;
};

/// The answer to one request. Entries that the provider delivered as null are
/// absent; they are kept so that a command line can show them.
struct PathsResult {
    Status status;
    std::vector<std::optional<ObjectPath>> paths;
    unsigned returnDoneCalls = 0;
};
struct InstancesResult {
    Status status;
    std::vector<std::optional<Instance>> instances;
    unsigned returnDoneCalls = 0;
};

/// How a request ended whose objects went to a receiver.
struct RequestEnd {
    Status status;
    unsigned returnDoneCalls = 0;
};

/// Gets the objects of a result one after the other, so that nobody has to hold
/// them all. One thread at a time calls it, while the provider delivers. What it
/// throws leaves the request, once the provider has returned.
template <typename Object>
class Receiver {
  public:
    Receiver() = default;
    virtual ~Receiver() = default;
    Receiver(const Receiver&) = delete;
    Receiver& operator=(const Receiver&) = delete;

    /// Absent: the provider delivered null.
    virtual void take(std::optional<Object> object) = 0;
    /// A name for what it has now.
    [[nodiscard]] virtual std::size_t mark() = 0;
    /// Forgets what came since that mark: a provider's call failed in the end.
    virtual void backTo(std::size_t mark) = 0;
};

/// Loads CMPI 2.0 providers and carries requests to them. Safe for concurrent
/// requests. It knows CIM and CMPI, and nothing about what providers serve.
///
/// A foreign exception, a null result or a missing slot of a provider costs the
/// request that met it alone. A crash of a provider is a crash of the process.
class ObjectManager {
  public:
    /// Reads schema and registrations; providers are opened when first asked.
    /// Throws MofError or LoadError.
    explicit ObjectManager(Configuration configuration);
    /// Cleans up and unloads every provider.
    ~ObjectManager();
    ObjectManager(const ObjectManager&) = delete;
    ObjectManager& operator=(const ObjectManager&) = delete;

    [[nodiscard]] const ClassRepository& repository() const noexcept;
    [[nodiscard]] const std::vector<Registration>& registrations() const noexcept;
    /// The namespaces that the registrations name, each once, in their order.
    [[nodiscard]] const std::vector<std::string>& nameSpaces() const noexcept;
    /// The host of full paths.
    [[nodiscard]] const std::string& host() const noexcept;

    // Instances. The class of the path may be a served class or a parent of one:
    // every served class at or below it is asked, in the order of the repository.
    PathsResult enumerateInstanceNames(const ObjectPath& path, const InstanceRequest& request = {});
    InstancesResult enumerateInstances(const ObjectPath& path, const InstanceRequest& request = {});
    /// One instance, or CMPI_RC_ERR_NOT_FOUND: the first delivered that agrees with
    /// every key of the path.
    InstancesResult getInstance(const ObjectPath& path, const InstanceRequest& request = {});
    InstancesResult modifyInstance(const Instance& instance, const InstanceRequest& request = {});

    // The same for results of any size. When the status at the end is an error, what
    // the receiver has got is no answer.
    RequestEnd enumerateInstanceNames(const ObjectPath& path, const InstanceRequest& request,
                                      Receiver<ObjectPath>& receiver);
    RequestEnd enumerateInstances(const ObjectPath& path, const InstanceRequest& request,
                                  Receiver<Instance>& receiver);

    // Associations of the object that the path names.
    PathsResult associatorNames(const ObjectPath& path, const AssociationRequest& request = {});
    InstancesResult associators(const ObjectPath& path, const AssociationRequest& request = {});
    PathsResult referenceNames(const ObjectPath& path, const AssociationRequest& request = {});
    InstancesResult references(const ObjectPath& path, const AssociationRequest& request = {});

    RequestEnd associatorNames(const ObjectPath& path, const AssociationRequest& request,
                               Receiver<ObjectPath>& receiver);
    RequestEnd associators(const ObjectPath& path, const AssociationRequest& request,
                           Receiver<Instance>& receiver);
    RequestEnd referenceNames(const ObjectPath& path, const AssociationRequest& request,
                              Receiver<ObjectPath>& receiver);
    RequestEnd references(const ObjectPath& path, const AssociationRequest& request,
                          Receiver<Instance>& receiver);

  private:
    class Implementation;
    std::unique_ptr<Implementation> implementation_;
};

}  // namespace cimom
