#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "ProviderCall.h"
#include "Providers.h"
#include "Schema.h"
#include "cimom/ObjectManager.h"

namespace cimom {

/// A class with its provider, from a registration.
struct ServedClass {
    const ClassDeclaration* declaration;
    Provider* provider;
    bool instance;
    bool association;
    std::vector<std::string> nameSpaces;

    [[nodiscard]] bool isIn(std::string_view nameSpace) const noexcept;
};

class ObjectManager::Implementation {
  public:
    Implementation(ObjectManager& manager, Configuration configuration);

    [[nodiscard]] const ClassRepository& repository() const noexcept { return repository_; }
    [[nodiscard]] const std::vector<Registration>& registrations() const noexcept {
        return registrations_;
    }
    [[nodiscard]] const std::vector<std::string>& nameSpaces() const noexcept {
        return nameSpaces_;
    }
    [[nodiscard]] const std::string& host() const noexcept { return configuration_.host; }

    PathsResult enumerateInstanceNames(ObjectPath path, const InstanceRequest& request);
    InstancesResult enumerateInstances(ObjectPath path, const InstanceRequest& request);
    InstancesResult getInstance(ObjectPath path, const InstanceRequest& request);
    InstancesResult modifyInstance(Instance instance, const InstanceRequest& request);

    PathsResult associatorNames(ObjectPath path, const AssociationRequest& request);
    InstancesResult associators(ObjectPath path, const AssociationRequest& request);
    PathsResult referenceNames(ObjectPath path, const AssociationRequest& request);
    InstancesResult references(ObjectPath path, const AssociationRequest& request);

  private:
    using Kind = broker::ResultCollector::Kind;
    using ServedClasses = std::vector<const ServedClass*>;

    /// The outcomes of the calls that one request became.
    struct Outcomes {
        std::vector<CallOutcome> calls;
        /// The client named the class that was asked: its status is the answer.
        bool exact = false;
    };

    void serve(const Registration& registration);
    [[nodiscard]] Status canonical(ObjectPath& path) const;
    [[nodiscard]] const std::string& canonicalClass(const std::string& className) const;
    /// The served classes at or below the class, in the order of the repository.
    [[nodiscard]] ServedClasses servedInstances(const std::string& className,
                                                const std::string& nameSpace) const;
    [[nodiscard]] ServedClasses servedAssociations(const std::string& className,
                                                   const std::string& nameSpace) const;
    template <typename Serves>
    [[nodiscard]] ServedClasses served(const std::string& className, const std::string& nameSpace,
                                       Serves&& serves) const;
    /// Each association provider once, in the order of its first class.
    [[nodiscard]] std::vector<Provider*> associationProviders(const std::string& nameSpace) const;

    // Calls of one provider.
    [[nodiscard]] CallSettings settings(const std::string& principal, CMPIFlags flags) const;
    enum class Reading { names, instances, one };
    CallOutcome callReading(const ServedClass& target, Reading reading, ObjectPath path,
                            const InstanceRequest& request);
    /// The instance of that class that agrees with the path, or NOT_FOUND.
    InstancesResult getFrom(const ServedClass& target, const ObjectPath& path,
                            const InstanceRequest& request);
    CallOutcome callModify(const ServedClass& target, const Instance& instance,
                           const InstanceRequest& request);
    CallOutcome callAssociators(Provider& provider, Kind kind, const ObjectPath& path,
                                const AssociationRequest& request);
    CallOutcome callReferences(Provider& provider, Kind kind, const ObjectPath& path,
                               const std::string& resultClass, const AssociationRequest& request);

    // Requests that become several calls.
    Outcomes enumerate(Reading reading, const ObjectPath& path, const InstanceRequest& request);
    Outcomes askAssociators(Kind kind, const ObjectPath& path, const AssociationRequest& request);
    Outcomes askReferences(Kind kind, const ObjectPath& path, const AssociationRequest& request);
    /// The ends of the associations of the object; nothing when no provider
    /// can tell.
    std::optional<std::vector<Instance>> associationsOf(const ObjectPath& path,
                                                        const AssociationRequest& request);

    // Answers.
    void complete(ObjectPath& path, const std::string& nameSpace) const;
    void complete(Instance& instance, const std::string& nameSpace) const;
    PathsResult pathsFrom(Outcomes outcomes, const std::string& nameSpace) const;
    InstancesResult instancesFrom(Outcomes outcomes, const std::string& nameSpace) const;

    Configuration configuration_;
    ClassRepository repository_;
    std::vector<Registration> registrations_;
    std::optional<broker::Schema> schema_;
    std::vector<ServedClass> served_;
    /// Indices into served_, by class name.
    broker::NameMap<std::vector<std::size_t>> servedByName_;
    std::vector<std::string> nameSpaces_;
    /// Ends first: a provider that is being cleaned up may still ask.
    std::optional<Providers> providers_;
};

/// Drops the properties that the list does not name; keys stay in the path.
void applyPropertyList(InstancesResult& result,
                       const std::optional<std::vector<std::string>>& propertyList);

}  // namespace cimom
