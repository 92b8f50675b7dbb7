#pragma once

#include <optional>
#include <string>
#include <vector>

#include "cimom/Forward.h"
#include "cimom/ResultReceiver.h"
#include "cimom/Status.h"

namespace cimom {

/// What a client asks for beyond the object itself. Absent filters restrict nothing.
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

/// INVALID_PARAMETER for a class of the request that is not known, which DSP0200 requires; a
/// role that no association has, and a class that is none of associations, leave nothing.
[[nodiscard]] Status checkClasses(const AssociationRequest& request,
                                  const ClassRepository& repository);

/// How a request ended whose objects went to a receiver.
struct RequestEnd {
    Status status;
    unsigned returnDoneCalls = 0;
};

/// Who carries requests out: the object manager, for clients and for providers that
/// ask other providers. Safe for concurrent use.
class RequestHandler {
  public:
    RequestHandler() = default;
    virtual ~RequestHandler() = default;
    RequestHandler(const RequestHandler&) = delete;
    RequestHandler& operator=(const RequestHandler&) = delete;

    // Instances. The class of the path may be a served class or a parent of one:
    // every served class at or below it is asked, in the order of the repository.
    // When the status at the end is an error, what the receiver has got does not
    // count.
    virtual RequestEnd enumerateInstanceNames(const ObjectPath& path,
                                              const InstanceRequest& request,
                                              ResultReceiver<ObjectPath>& receiver) = 0;
    virtual RequestEnd enumerateInstances(const ObjectPath& path, const InstanceRequest& request,
                                          ResultReceiver<Instance>& receiver) = 0;
    /// One instance, or CMPI_RC_ERR_NOT_FOUND: the first handed over that agrees with
    /// every key of the path.
    virtual InstancesResult getInstance(const ObjectPath& path, const InstanceRequest& request) = 0;
    virtual InstancesResult modifyInstance(const Instance& instance,
                                           const InstanceRequest& request) = 0;
    /// Makes an instance of its path's class, in its path's namespace; the keys of that path
    /// do not count. The result is the path of the instance, unless the status is an error.
    virtual PathsResult createInstance(const Instance& instance,
                                       const InstanceRequest& request) = 0;
    virtual Status deleteInstance(const ObjectPath& path, const InstanceRequest& request) = 0;
    /// The instances that the query selects in a namespace, with the selected properties. The
    /// request's property list does not count.
    virtual RequestEnd execQuery(const std::string& nameSpace, const Query& query,
                                 const InstanceRequest& request,
                                 ResultReceiver<Instance>& receiver) = 0;

    // Associations of the object that the path names.
    virtual RequestEnd associatorNames(const ObjectPath& path, const AssociationRequest& request,
                                       ResultReceiver<ObjectPath>& receiver) = 0;
    virtual RequestEnd associators(const ObjectPath& path, const AssociationRequest& request,
                                   ResultReceiver<Instance>& receiver) = 0;
    virtual RequestEnd referenceNames(const ObjectPath& path, const AssociationRequest& request,
                                      ResultReceiver<ObjectPath>& receiver) = 0;
    virtual RequestEnd references(const ObjectPath& path, const AssociationRequest& request,
                                  ResultReceiver<Instance>& receiver) = 0;
};

}  // namespace cimom
