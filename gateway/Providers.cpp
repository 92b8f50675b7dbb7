#include "Providers.h"

#include <atomic>
#include <utility>

#include "providerutilities/ProviderUtilities.h"
#include "providerutilities/Refusal.h"
#include "zrcommon/Strings.h"

namespace ZR::DHCPClientGateway {

namespace {

std::atomic<CMPIInstanceMI*> exactProvider = nullptr;

void requireSuccess(const CMPIStatus& status, const char* className) {
    if (status.rc != CMPI_RC_OK) {
        throw Refusal(status.rc, std::string("the provider of ") + className + " refuses");
    }
}

const CMPIObjectPath* pathOf(const CMPIInstance* instance) {
    return instance == nullptr ? nullptr : instance->ft->getObjectPath(instance, nullptr);
}

/// An object of another provider by a path of the request's own: one that comes from the
/// object manager may name a host, and references do not.
std::optional<Object> withOwnPath(const Request& request, const CMPIObjectPath* path,
                                  const CMPIInstance* instance) {
    if (path == nullptr) {
        return std::nullopt;
    }
    Keys keys(path);
    KeyTexts texts;
    for (const Key& key : keys) {
        if (!key.isText) {
            return Object{path, instance, std::move(keys)};
        }
        texts.emplace_back(key.name.c_str(), key.text);
    }
    path = makePath(request, classNameOf(path).c_str(), texts);
    return Object{path, instance, std::move(keys)};
}

}  // namespace

void useExactProvider(CMPIInstanceMI* provider) noexcept {
    exactProvider = provider;
}

void askEach(const Request& request, const ServedClass& served, Form form,
             const KeyTexts& narrowing, Collector::Take take) {
    const Collector collector(std::move(take));
    CMPIInstanceMI* provider = exactProvider;
    KeyTexts keys;
    for (const auto& key : narrowing) {
        if (served.narrowsBy != nullptr && equalNames(key.first, served.narrowsBy)) {
            keys.push_back(key);
        }
    }
    const CMPIObjectPath* path = makePath(request, served.name, keys);
    const CMPIStatus status =
        form == Form::names ? provider->ft->enumerateInstanceNames(provider, request.context,
                                                                   collector.record(), path)
                            : provider->ft->enumerateInstances(provider, request.context,
                                                               collector.record(), path, nullptr);
    collector.rethrow();
    requireSuccess(status, served.name);
}

std::vector<Object> ask(const Request& request, const ServedClass& served, Form form,
                        const KeyTexts& narrowing) {
    std::vector<Object> objects;
    askEach(request, served, form, narrowing,
            [&objects](const CMPIObjectPath* path, const CMPIInstance* instance) {
                if (path == nullptr) {
                    path = pathOf(instance);
                }
                if (path != nullptr) {
                    objects.push_back({path, instance, Keys(path)});
                }
            });
    return objects;
}

std::vector<Object> askOthers(const Request& request, const ServedClass& served, Form form) {
    std::vector<Object> objects;
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const CMPIBroker* broker = request.broker;
    const CMPIObjectPath* wanted = makePath(request, served.name);
    // Not every object manager has this function.
    const bool names = form == Form::names && broker->bft->enumerateInstanceNames != nullptr;
    CMPIEnumeration* found =
        names ? broker->bft->enumerateInstanceNames(broker, request.context, wanted, &status)
              : broker->bft->enumerateInstances(broker, request.context, wanted, nullptr, &status);
    // Without a provider of the class there are no associations with its objects.
    while (status.rc == CMPI_RC_OK && found != nullptr && found->ft->hasNext(found, nullptr) != 0) {
        const CMPIData next = found->ft->getNext(found, &status);
        if (status.rc != CMPI_RC_OK) {
            continue;
        }
        const CMPIInstance* instance = names ? nullptr : next.value.inst;
        auto object =
            withOwnPath(request, instance == nullptr ? next.value.ref : pathOf(instance), instance);
        if (object) {
            objects.push_back(*std::move(object));
        }
    }
    return objects;
}

std::optional<Object> askOthersFor(const Request& request, const ServedClass& served,
                                   const KeyTexts& keys) {
    const CMPIObjectPath* path = makePath(request, served.name, keys);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIInstance* instance =
        request.broker->bft->getInstance(request.broker, request.context, path, nullptr, &status);
    auto found =
        status.rc == CMPI_RC_OK ? withOwnPath(request, pathOf(instance), instance) : std::nullopt;
    // Some object managers give what the provider delivers, whatever its keys.
    return found && found->keys == Keys(path) ? std::move(found) : std::nullopt;
}

void modify(const Request& request, const CMPIObjectPath* path, const CMPIInstance* instance) {
    // It hands nothing over.
    const Collector collector([](const CMPIObjectPath*, const CMPIInstance*) {});
    CMPIInstanceMI* provider = exactProvider;
    requireSuccess(provider->ft->modifyInstance(provider, request.context, collector.record(), path,
                                                instance, nullptr),
                   classNameOf(path).c_str());
}

CMPIObjectPath* makePath(const Request& request, const char* className, const KeyTexts& keys) {
    CMPIObjectPath* path =
        ProviderUtilities::createObjectPath(request.broker, className, request.nameSpace);
    bool complete = path != nullptr;
    for (const auto& [name, value] : keys) {
        complete = complete && ProviderUtilities::setKeyProperty(path, name, value);
    }
    if (!complete) {
        throw Refusal(CMPI_RC_ERR_FAILED,
                      std::string("the object manager makes no path of ") + className);
    }
    return path;
}

CMPIInstance* makeInstance(const Request& request, const CMPIObjectPath* path) {
    CMPIInstance* instance = ProviderUtilities::createInstance(request.broker, path);
    if (instance == nullptr) {
        throw Refusal(CMPI_RC_ERR_FAILED,
                      "the object manager makes no instance of " + classNameOf(path));
    }
    return instance;
}

}  // namespace ZR::DHCPClientGateway
