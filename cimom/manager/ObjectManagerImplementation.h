#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include "cimom/ObjectManager.h"
#include "manager/ProviderCall.h"
#include "manager/Providers.h"
#include "mof/Schema.h"

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

/// Holds a whole result, for those who need it at once.
template <typename Object>
class Collection final : public Receiver<Object> {
  public:
    void take(std::optional<Object> object) override { objects.push_back(std::move(object)); }
    [[nodiscard]] std::size_t mark() override { return objects.size(); }
    void backTo(std::size_t mark) override {
        objects.erase(objects.begin() + static_cast<std::ptrdiff_t>(mark), objects.end());
    }

    std::vector<std::optional<Object>> objects;
};

/// Wants whatever is delivered.
inline constexpr auto everything = [](const auto& /*object*/) { return true; };

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

    RequestEnd enumerateInstanceNames(ObjectPath path, const InstanceRequest& request,
                                      Receiver<ObjectPath>& receiver);
    RequestEnd enumerateInstances(ObjectPath path, const InstanceRequest& request,
                                  Receiver<Instance>& receiver);
    InstancesResult getInstance(ObjectPath path, const InstanceRequest& request);
    InstancesResult modifyInstance(Instance instance, const InstanceRequest& request);

    RequestEnd associatorNames(ObjectPath path, const AssociationRequest& request,
                               Receiver<ObjectPath>& receiver);
    RequestEnd associators(ObjectPath path, const AssociationRequest& request,
                           Receiver<Instance>& receiver);
    RequestEnd referenceNames(ObjectPath path, const AssociationRequest& request,
                              Receiver<ObjectPath>& receiver);
    RequestEnd references(ObjectPath path, const AssociationRequest& request,
                          Receiver<Instance>& receiver);

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
                            const InstanceRequest& request, const Sink& sink);
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
                                const std::string& principal, const Sink& sink, Invoke&& invoke);
    CallOutcome callAssociators(Provider& provider, const ObjectPath& path,
                                const AssociationRequest& request, const Sink& sink);
    CallOutcome callReferences(Provider& provider, const ObjectPath& path,
                               const std::string& resultClass, const AssociationRequest& request,
                               const Sink& sink);

    // Requests that become several calls.
    Outcomes enumerate(Reading reading, const ObjectPath& path, const InstanceRequest& request,
                       const Sink& sink);
    Outcomes askAssociators(const ObjectPath& path, const AssociationRequest& request,
                            const Sink& sink);
    Outcomes askReferences(const ObjectPath& path, const AssociationRequest& request,
                           const Sink& sink);
    template <typename Object>
    RequestEnd associated(ObjectPath path, const AssociationRequest& request,
                          Receiver<Object>& receiver);
    template <typename Object>
    RequestEnd referring(ObjectPath path, const AssociationRequest& request,
                         Receiver<Object>& receiver);
    /// The ends of the associations of the object; nothing when no provider
    /// can tell.
    std::optional<std::vector<Instance>> associationsOf(const ObjectPath& path,
                                                        const AssociationRequest& request);

    // Answers.
    void complete(ObjectPath& path, const std::string& nameSpace) const;
    void complete(Instance& instance, const std::string& nameSpace) const;
    /// Passes objects on as clients get them: complete, with the properties of the
    /// list alone, and only those that `keep` wants. Borrows all but `keep`.
    template <typename Object, typename Keep>
    [[nodiscard]] Sink sinkTo(Receiver<Object>& receiver, const std::string& nameSpace,
                              const std::optional<std::vector<std::string>>& propertyList,
                              Keep keep) const;
    /// Carries a request out by `ask`, which gets the path in its canonical form.
    template <typename Ask>
    RequestEnd run(ObjectPath& path, Ask&& ask) const;

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

/// The status of the whole, and what was counted.
[[nodiscard]] RequestEnd endOf(const std::vector<CallOutcome>& calls, bool exact);

/// Drops the properties that the list does not name; keys stay in the path.
void applyPropertyList(Instance& instance,
                       const std::optional<std::vector<std::string>>& propertyList);
inline void applyPropertyList(const ObjectPath& /*path*/,
                              const std::optional<std::vector<std::string>>& /*propertyList*/) {}

template <typename Object, typename Keep>
Sink ObjectManager::Implementation::sinkTo(
    Receiver<Object>& receiver, const std::string& nameSpace,
    const std::optional<std::vector<std::string>>& propertyList, Keep keep) const {
    auto take = [this, &receiver, &nameSpace, &propertyList,
                 keep = std::move(keep)](std::optional<Object> object) {
        if (object) {
            complete(*object, nameSpace);
            // An absent entry is no object that anybody could judge.
            if (!keep(*object)) {
                return;
            }
            applyPropertyList(*object, propertyList);
        }
        receiver.take(std::move(object));
    };
    Sink sink;
    if constexpr (std::is_same_v<Object, ObjectPath>) {
        sink.kind = Kind::paths;
        sink.consumer.path = std::move(take);
    } else {
        sink.kind = Kind::instances;
        sink.consumer.instance = std::move(take);
    }
    sink.mark = [&receiver] { return receiver.mark(); };
    sink.backTo = [&receiver](std::size_t mark) { receiver.backTo(mark); };
    return sink;
}

template <typename Ask>
RequestEnd ObjectManager::Implementation::run(ObjectPath& path, Ask&& ask) const {
    try {
        if (Status status = canonical(path); !status.ok()) {
            return {std::move(status)};
        }
        const Outcomes outcomes = std::forward<Ask>(ask)();
        return endOf(outcomes.calls, outcomes.exact);
    } catch (const broker::ConversionError& error) {
        return {{CMPI_RC_ERR_INVALID_PARAMETER, error.what()}};
    }
}

}  // namespace cimom
