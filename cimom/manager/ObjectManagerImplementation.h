#pragma once

#include <deque>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimom/ObjectManager.h"
#include "cimom/OwnClass.h"
#include "cimom/Results.h"
#include "manager/ActiveFilters.h"
#include "manager/ProviderCall.h"
#include "manager/Providers.h"
#include "manager/RequestedObjects.h"

namespace cimom {

/// A class with who serves it: a provider, from a registration, or the object manager.
struct ServedClass {
    const ClassDeclaration* declaration;
    Provider* provider;  ///< null: own is there
    OwnClass* own;       ///< null: provider is there
    bool instance;
    bool association;
    std::vector<std::string> nameSpaces;

    [[nodiscard]] bool isIn(std::string_view nameSpace) const noexcept;
};

class ObjectManager::Implementation {
  public:
    Implementation(ObjectManager& manager, Configuration configuration);
    ~Implementation();
    /// Ends subscriptions and providers. False when a provider has left a thread behind,
    /// which needs all of this.
    [[nodiscard]] bool end();
    /// Keeps it until the process ends.
    static void leave(std::unique_ptr<Implementation> left);
    Implementation(const Implementation&) = delete;
    Implementation& operator=(const Implementation&) = delete;

    [[nodiscard]] const ClassRepository& repository() const noexcept { return repository_; }
    [[nodiscard]] const std::vector<Registration>& registrations() const noexcept {
        return registrations_;
    }
    [[nodiscard]] const std::vector<std::string>& nameSpaces() const noexcept {
        return nameSpaces_;
    }
    [[nodiscard]] const std::string& host() const noexcept { return configuration_.host; }
    void serve(std::unique_ptr<OwnClass> own);

    [[nodiscard]] IndicationHub& indications() noexcept { return filters_; }

    RequestEnd enumerateInstanceNames(ObjectPath path, const InstanceRequest& request,
                                      ResultReceiver<ObjectPath>& receiver);
    RequestEnd enumerateInstances(ObjectPath path, const InstanceRequest& request,
                                  ResultReceiver<Instance>& receiver);
    InstancesResult getInstance(ObjectPath path, const InstanceRequest& request);
    InstancesResult modifyInstance(Instance instance, const InstanceRequest& request);
    PathsResult createInstance(Instance instance, const InstanceRequest& request);
    Status deleteInstance(ObjectPath path, const InstanceRequest& request);
    RequestEnd execQuery(const std::string& nameSpace, const Query& query,
                         const InstanceRequest& request, ResultReceiver<Instance>& receiver);

    RequestEnd associatorNames(ObjectPath path, const AssociationRequest& request,
                               ResultReceiver<ObjectPath>& receiver);
    RequestEnd associators(ObjectPath path, const AssociationRequest& request,
                           ResultReceiver<Instance>& receiver);
    RequestEnd referenceNames(ObjectPath path, const AssociationRequest& request,
                              ResultReceiver<ObjectPath>& receiver);
    RequestEnd references(ObjectPath path, const AssociationRequest& request,
                          ResultReceiver<Instance>& receiver);

  private:
    using AnyReceiver = broker::AnyReceiver;
    using ServedClasses = std::vector<const ServedClass*>;

    /// The association classes that a request can concern, in the order of the repository.
    struct Associations {
        ServedClasses classes;
        /// The client named the one class, whose status is that of the whole.
        bool exact = false;
    };

    void serve(const Registration& registration);
    /// Enters a class; `who` is how errors name it. Throws LoadError when it is served already.
    void serve(ServedClass served, const std::vector<std::string>& nameSpaces,
               const std::string& who);
    void orderAssociations();
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
    /// The served associations at or below the class, or all of them, which can have an object
    /// like the source as an end in the roles of the request.
    [[nodiscard]] Associations associationsOf(const ObjectPath& source,
                                              const std::optional<std::string>& className,
                                              const AssociationRequest& request) const;

    /// Whether the class of what a provider delivered fits one of these associations. A class
    /// that is not known cannot be told from a fitting one.
    [[nodiscard]] bool canBeAssociator(const ServedClasses& associations, const ObjectPath& source,
                                       const std::string& className,
                                       const AssociationRequest& request) const;

    // Calls of one provider.
    [[nodiscard]] CallSettings settings(const std::string& principal, CMPIFlags flags) const;
    enum class Reading { names, instances, one };
    CallOutcome callReading(const ServedClass& target, Reading reading, ObjectPath path,
                            const InstanceRequest& request, const AnyReceiver& receiver);
    /// The instance of that class that agrees with the path, or NOT_FOUND.
    InstancesResult getFrom(const ServedClass& target, const ObjectPath& path,
                            const InstanceRequest& request);
    CallOutcome callModify(const ServedClass& target, const Instance& instance,
                           const InstanceRequest& request);
    /// The frame of a call of an association slot: `invoke` gets the slot, the record,
    /// context, result and path.
    template <typename Slot, typename Invoke>
    CallOutcome callAssociation(Provider& provider, Slot CMPIAssociationMIFT::*slot,
                                const char* name, const ObjectPath& path,
                                const std::string& principal, const AnyReceiver& receiver,
                                Invoke&& invoke);
    CallOutcome callAssociators(Provider& provider, const ObjectPath& path,
                                const AssociationRequest& request, const AnyReceiver& receiver);
    CallOutcome callReferences(Provider& provider, const ObjectPath& path,
                               const std::string& resultClass, const AssociationRequest& request,
                               const AnyReceiver& receiver);

    CallOutcome callCreate(const ServedClass& target, const Instance& instance,
                           const InstanceRequest& request, ResultReceiver<ObjectPath>& receiver);
    CallOutcome callDelete(const ServedClass& target, const ObjectPath& path,
                           const InstanceRequest& request);
    /// The class of the target that has the instance, of those that the path can mean; null
    /// when there is none.
    [[nodiscard]] const ServedClass* ownerOf(const ObjectPath& path, const std::string& principal);

    // The same for own classes, which only read.
    static CallOutcome readOwn(const ServedClass& target, Reading reading, const ObjectPath& path,
                               const AnyReceiver& receiver);
    /// The instances of an own class of associations in which the source plays its role.
    CallOutcome ownAssociations(const ServedClass& target, const ObjectPath& source,
                                const std::optional<std::string>& role,
                                std::vector<Instance>& associations) const;
    /// What those lead to, for a receiver that wants it.
    template <typename Object>
    CallOutcome associatedByOwn(const ServedClass& target, const ObjectPath& source,
                                const AssociationRequest& request,
                                ResultReceiver<Object>& receiver);

    // Requests that become several calls.
    RequestEnd enumerate(Reading reading, const ObjectPath& path, const InstanceRequest& request,
                         const AnyReceiver& receiver);
    template <typename Object>
    RequestEnd associated(ObjectPath path, const AssociationRequest& request,
                          ResultReceiver<Object>& receiver);
    template <typename Object>
    RequestEnd referring(ObjectPath path, const AssociationRequest& request,
                         ResultReceiver<Object>& receiver);
    /// Tells the associations of the object that one provider has, for a comparison of roles;
    /// nothing when the provider does not offer to tell them.
    CallOutcome callForAssociations(Provider& provider, const ServedClasses& classes,
                                    const ObjectPath& path, const std::string& principal,
                                    std::optional<std::vector<Instance>>& associations);
    /// The outcome, after a failure was written to the log.
    CallOutcome noted(const Provider& provider, const ObjectPath& path, CallOutcome outcome) const;

    /// Borrows the request's namespace.
    [[nodiscard]] RequestSurroundings surroundings(const ObjectPath& path) const {
        return {configuration_.host, path.nameSpace};
    }
    /// Carries a request out by `ask`, which gets the path in its canonical form.
    template <typename Ask>
    RequestEnd run(ObjectPath& path, Ask&& ask) const;

    Configuration configuration_;
    ClassRepository repository_;
    std::vector<Registration> registrations_;
    std::vector<std::unique_ptr<OwnClass>> own_;
    /// A deque, since it grows behind the construction, while others point into it.
    std::deque<ServedClass> served_;
    /// Indices into served_, by class name.
    std::unordered_map<std::string_view, std::vector<std::size_t>, NameHash, NameEqual>
        servedByName_;
    ServedClasses associations_;  ///< all, in the order of the repository
    std::vector<std::string> nameSpaces_;
    bool ending_ = false;
    Implementation* leftBefore_ = nullptr;  ///< another one that is kept
    ActiveFilters filters_{{repository_, nameSpaces_, configuration_.host, configuration_.log}};
    /// Ends first: a provider that is being cleaned up may still ask.
    std::optional<Providers> providers_;
};

template <typename Ask>
RequestEnd ObjectManager::Implementation::run(ObjectPath& path, Ask&& ask) const {
    try {
        if (Status status = canonical(path); !status.ok()) {
            return {std::move(status)};
        }
        return std::forward<Ask>(ask)();
    } catch (const broker::ConversionError& error) {
        return {{CMPI_RC_ERR_INVALID_PARAMETER, error.what()}};
    }
}

}  // namespace cimom
