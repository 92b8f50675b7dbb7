#include "cimom/ObjectManager.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <mutex>
#include <utility>

#include "cimom/ClassDeclaration.h"
#include "manager/ObjectManagerImplementation.h"
#include "manager/RequestPath.h"

namespace cimom {

namespace {

std::string machineName() {
    std::array<char, 256> name{};
    // The paths of a machine without a readable name need a host, too.
    if (gethostname(name.data(), name.size() - 1) != 0 || name.front() == '\0') {
        return "localhost";
    }
    return name.data();
}

}  // namespace

bool ServedClass::isIn(std::string_view nameSpace) const noexcept {
    return std::any_of(nameSpaces.begin(), nameSpaces.end(),
                       [nameSpace](const std::string& one) { return sameName(one, nameSpace); });
}

ObjectManager::Implementation::Implementation(ObjectManager& manager, Configuration configuration)
    : configuration_(std::move(configuration)) {
    if (configuration_.host.empty()) {
        configuration_.host = machineName();
    }
    if (!configuration_.fullSchema.empty()) {
        repository_.load(configuration_.fullSchema);
        repository_.keepDeclared();
    }
    for (const auto& directory : configuration_.schemaDirectories) {
        repository_.loadDirectory(directory);
    }
    repository_.complete();
    for (const auto& file : configuration_.registrationFiles) {
        auto read = readRegistrations(file);
        std::move(read.begin(), read.end(), std::back_inserter(registrations_));
    }
    providers_.emplace(configuration_.providerDirectories, repository_, &manager, &filters_);
    for (const Registration& registration : registrations_) {
        serve(registration);
    }
    orderAssociations();
}

void ObjectManager::Implementation::orderAssociations() {
    associations_.clear();
    for (const ClassDeclaration* const declaration : repository_.classes()) {
        if (const auto entry = servedByName_.find(declaration->name);
            entry != servedByName_.end()) {
            for (const std::size_t index : entry->second) {
                if (served_[index].association) {
                    associations_.push_back(&served_[index]);
                }
            }
        }
    }
}

ObjectManager::Implementation::~Implementation() {
    static_cast<void>(end());
}

bool ObjectManager::Implementation::end() {
    if (!std::exchange(ending_, true)) {
        filters_.close();
        return !providers_ || providers_->end();
    }
    return true;
}

void ObjectManager::Implementation::leave(std::unique_ptr<Implementation> left) {
    static std::mutex mutex;
    static Implementation* latest = nullptr;
    const std::lock_guard lock(mutex);
    left->leftBefore_ = latest;
    latest = left.release();
}

void ObjectManager::Implementation::serve(const Registration& registration) {
    const std::string who =
        "class " + registration.className + " of provider " + registration.provider;
    const ClassDeclaration* const declaration = repository_.find(registration.className);
    if (declaration == nullptr) {
        throw LoadError(who + " is in none of the schema's files");
    }
    Provider& provider = providers_->provider(registration.location, registration.provider);
    if (registration.indication) {
        filters_.serve(*declaration, provider, registration.nameSpaces);
    }
    serve({declaration, &provider, nullptr, registration.instance, registration.association, {}},
          registration.nameSpaces, who);
}

void ObjectManager::Implementation::serve(std::unique_ptr<OwnClass> own) {
    const std::string who = "own class " + own->className();
    if (repository_.find(own->className()) == nullptr && !own->declaration().empty()) {
        repository_.loadText(own->declaration(), who);
    }
    const ClassDeclaration* const declaration = repository_.find(own->className());
    if (declaration == nullptr) {
        throw LoadError(who + " is in none of the schema's files");
    }
    serve({declaration, nullptr, own.get(), true, declaration->isAssociation(), {}},
          own->nameSpaces(), who);
    own_.push_back(std::move(own));
    orderAssociations();
}

void ObjectManager::Implementation::serve(ServedClass served,
                                          const std::vector<std::string>& nameSpaces,
                                          const std::string& who) {
    const ClassDeclaration* const declaration = served.declaration;
    for (const std::string& nameSpace : nameSpaces) {
        const auto known = std::find_if(nameSpaces_.begin(), nameSpaces_.end(),
                                        [&](const auto& one) { return sameName(one, nameSpace); });
        if (known == nameSpaces_.end()) {
            nameSpaces_.push_back(nameSpace);
        }
        for (const std::size_t index : servedByName_[declaration->name]) {
            const ServedClass& other = served_[index];
            if (other.isIn(nameSpace) && ((other.instance && served.instance) ||
                                          (other.association && served.association))) {
                throw LoadError(std::string(who)
                                    .append(" is registered twice for namespace ")
                                    .append(nameSpace));
            }
        }
        served.nameSpaces.push_back(nameSpace);
    }
    served_.push_back(std::move(served));
    servedByName_[declaration->name].push_back(served_.size() - 1);
}

Status ObjectManager::Implementation::canonical(ObjectPath& path) const {
    return canonicalize(path, repository_, nameSpaces_);
}

const std::string& ObjectManager::Implementation::canonicalClass(
    const std::string& className) const {
    const ClassDeclaration* const declaration = repository_.find(className);
    return declaration == nullptr ? className : declaration->name;
}

template <typename Serves>
ObjectManager::Implementation::ServedClasses ObjectManager::Implementation::served(
    const std::string& className, const std::string& nameSpace, Serves&& serves) const {
    ServedClasses found;
    for (const ClassDeclaration* const declaration : repository_.withSubclasses(className)) {
        const auto entry = servedByName_.find(declaration->name);
        if (entry == servedByName_.end()) {
            continue;
        }
        for (const std::size_t index : entry->second) {
            if (serves(served_[index]) && served_[index].isIn(nameSpace)) {
                found.push_back(&served_[index]);
            }
        }
    }
    return found;
}

ObjectManager::Implementation::ServedClasses ObjectManager::Implementation::servedInstances(
    const std::string& className, const std::string& nameSpace) const {
    return served(className, nameSpace, [](const ServedClass& one) { return one.instance; });
}

ObjectManager::Implementation::ServedClasses ObjectManager::Implementation::servedAssociations(
    const std::string& className, const std::string& nameSpace) const {
    return served(className, nameSpace, [](const ServedClass& one) { return one.association; });
}

CallSettings ObjectManager::Implementation::settings(const std::string& principal,
                                                     CMPIFlags flags) const {
    return {&repository_, principal, flags};
}

ObjectManager::ObjectManager(Configuration configuration)
    : implementation_(std::make_unique<Implementation>(*this, std::move(configuration))) {}

ObjectManager::~ObjectManager() {
    if (!implementation_->end()) {
        Implementation::leave(std::move(implementation_));
    }
}

const ClassRepository& ObjectManager::repository() const noexcept {
    return implementation_->repository();
}

const std::vector<Registration>& ObjectManager::registrations() const noexcept {
    return implementation_->registrations();
}

const std::vector<std::string>& ObjectManager::nameSpaces() const noexcept {
    return implementation_->nameSpaces();
}

const std::string* ObjectManager::findNameSpace(const std::string& wanted) const {
    return knownNameSpace(wanted, implementation_->nameSpaces());
}

void ObjectManager::serve(std::unique_ptr<OwnClass> own) {
    implementation_->serve(std::move(own));
}

const std::string& ObjectManager::host() const noexcept {
    return implementation_->host();
}

namespace {

/// The result of a request that `ask` carries out with a receiver.
template <typename Result, typename Object, typename Ask>
Result collected(Ask&& ask) {
    CollectedObjects<Object> collection;
    RequestEnd end = std::forward<Ask>(ask)(collection);
    if (!end.status.ok()) {
        collection.objects.clear();
    }
    return {std::move(end.status), std::move(collection.objects), end.returnDoneCalls};
}

}  // namespace

IndicationHub& ObjectManager::indications() noexcept {
    return implementation_->indications();
}

PathsResult ObjectManager::enumerateInstanceNames(const ObjectPath& path,
                                                  const InstanceRequest& request) {
    return collected<PathsResult, ObjectPath>(
        [&](auto& receiver) { return enumerateInstanceNames(path, request, receiver); });
}

RequestEnd ObjectManager::enumerateInstanceNames(const ObjectPath& path,
                                                 const InstanceRequest& request,
                                                 ResultReceiver<ObjectPath>& receiver) {
    return implementation_->enumerateInstanceNames(path, request, receiver);
}

InstancesResult ObjectManager::enumerateInstances(const ObjectPath& path,
                                                  const InstanceRequest& request) {
    return collected<InstancesResult, Instance>(
        [&](auto& receiver) { return enumerateInstances(path, request, receiver); });
}

RequestEnd ObjectManager::enumerateInstances(const ObjectPath& path, const InstanceRequest& request,
                                             ResultReceiver<Instance>& receiver) {
    return implementation_->enumerateInstances(path, request, receiver);
}

PathsResult ObjectManager::associatorNames(const ObjectPath& path,
                                           const AssociationRequest& request) {
    return collected<PathsResult, ObjectPath>(
        [&](auto& receiver) { return associatorNames(path, request, receiver); });
}

RequestEnd ObjectManager::associatorNames(const ObjectPath& path, const AssociationRequest& request,
                                          ResultReceiver<ObjectPath>& receiver) {
    return implementation_->associatorNames(path, request, receiver);
}

InstancesResult ObjectManager::associators(const ObjectPath& path,
                                           const AssociationRequest& request) {
    return collected<InstancesResult, Instance>(
        [&](auto& receiver) { return associators(path, request, receiver); });
}

RequestEnd ObjectManager::associators(const ObjectPath& path, const AssociationRequest& request,
                                      ResultReceiver<Instance>& receiver) {
    return implementation_->associators(path, request, receiver);
}

PathsResult ObjectManager::referenceNames(const ObjectPath& path,
                                          const AssociationRequest& request) {
    return collected<PathsResult, ObjectPath>(
        [&](auto& receiver) { return referenceNames(path, request, receiver); });
}

RequestEnd ObjectManager::referenceNames(const ObjectPath& path, const AssociationRequest& request,
                                         ResultReceiver<ObjectPath>& receiver) {
    return implementation_->referenceNames(path, request, receiver);
}

InstancesResult ObjectManager::references(const ObjectPath& path,
                                          const AssociationRequest& request) {
    return collected<InstancesResult, Instance>(
        [&](auto& receiver) { return references(path, request, receiver); });
}

RequestEnd ObjectManager::references(const ObjectPath& path, const AssociationRequest& request,
                                     ResultReceiver<Instance>& receiver) {
    return implementation_->references(path, request, receiver);
}

InstancesResult ObjectManager::getInstance(const ObjectPath& path, const InstanceRequest& request) {
    return implementation_->getInstance(path, request);
}

InstancesResult ObjectManager::modifyInstance(const Instance& instance,
                                              const InstanceRequest& request) {
    return implementation_->modifyInstance(instance, request);
}

PathsResult ObjectManager::createInstance(const Instance& instance,
                                          const InstanceRequest& request) {
    return implementation_->createInstance(instance, request);
}

Status ObjectManager::deleteInstance(const ObjectPath& path, const InstanceRequest& request) {
    return implementation_->deleteInstance(path, request);
}

RequestEnd ObjectManager::execQuery(const std::string& nameSpace, const Query& query,
                                    const InstanceRequest& request,
                                    ResultReceiver<Instance>& receiver) {
    return implementation_->execQuery(nameSpace, query, request, receiver);
}

}  // namespace cimom
