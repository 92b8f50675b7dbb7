#include "kit/StrictHost.h"

#include <dlfcn.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <exception>
#include <filesystem>
#include <utility>

#include "cimom/Names.h"
#include "kit/StrictObjects.h"

namespace strict {

namespace {

using Kind = ResultObject::Kind;

cimom::ClassRepository loadSchema(const std::string& schema) {
    cimom::ClassRepository repository;
    if (std::filesystem::is_directory(schema)) {
        repository.loadDirectory(schema);
    } else {
        repository.load(schema);
        repository.keepDeclared();
        repository.loadDirectory(ZR_SOURCE_DIR "/schema");
    }
    repository.complete();
    return repository;
}

std::vector<cimom::Registration> readAll(const std::vector<std::string>& files) {
    std::vector<cimom::Registration> all;
    for (const std::string& file : files) {
        const auto read = cimom::readRegistrations(file);
        all.insert(all.end(), read.begin(), read.end());
    }
    return all;
}

/// A provider's function; null and exceptions end a real object manager.
template <typename Slot, typename... Arguments>
CMPIStatus callSlot(const char* name, Slot slot, Arguments... arguments) {
    if (slot == nullptr) {
        violations().add(std::string("The provider's table has no ") + name);
        return {CMPI_RC_ERR_FAILED, nullptr};
    }
    try {
        return slot(arguments...);
    } catch (const std::exception& exception) {
        violations().add(std::string(name) + " threw: " + exception.what());
    }
    return {CMPI_RC_ERR_FAILED, nullptr};
}

void append(StrictHost::Response& all, StrictHost::Response one) {
    // The first error is the result, and what was handed over before it is discarded.
    if (all.code != CMPI_RC_OK || one.code != CMPI_RC_OK) {
        const StrictHost::Response& failed = all.code == CMPI_RC_OK ? one : all;
        all = {failed.code, failed.message, {}, {}};
        return;
    }
    all.paths.insert(all.paths.end(), one.paths.begin(), one.paths.end());
    all.instances.insert(all.instances.end(), one.instances.begin(), one.instances.end());
}

}  // namespace

StrictHost::StrictHost(const std::string& schema, const std::vector<std::string>& registrations,
                       std::string libraryDirectory, const Traits& traits)
    : repository_(loadSchema(schema)),
      registrations_(readAll(registrations)),
      directory_(std::move(libraryDirectory)),
      traits_(traits),
      broker_(strictBroker(*this, traits)) {
    load();
}

StrictHost::~StrictHost() {
    EXPECT_TRUE(unload(true)) << "a library stays in the process";
}

StrictHost& StrictHost::of(const CMPIBroker* broker) {
    return *static_cast<StrictHost*>(broker->hdl);
}

const CMPIContext* StrictHost::context(const std::string& nameSpace) const {
    std::vector<cimom::NamedValue> entries;
    if (!traits_.emptyContexts) {
        cimom::Value flags;
        flags.type = cimom::Type::uint32;
        flags.content = cimom::Scalar(std::uint64_t{0});
        entries = {{"CMPIInitNameSpace", cimom::Value::ofString(nameSpace)},
                   {"CMPIPrincipal", cimom::Value::ofString("root")},
                   {"CMPIInvocationFlags", flags}};
    }
    return RequestObjects::make<ContextObject>(repository_, std::move(entries));
}

template <typename Record>
void StrictHost::create(Provider& provider, const std::string& providerName, const char* kind,
                        Record*& record) {
    using Factory = Record* (*)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
    const std::string name = providerName + "_Create_" + kind + "MI";
    const auto factory = reinterpret_cast<Factory>(::dlsym(provider.handle, name.c_str()));
    ASSERT_NE(factory, nullptr) << name;
    const RequestObjects objects(traits_);
    CMPIStatus status{CMPI_RC_OK, nullptr};
    Record* made = factory(&broker_, context("root/cimv2"), &status);
    ASSERT_NE(made, nullptr) << name;
    ASSERT_NE(made->ft, nullptr) << name;
    EXPECT_LE(made->ft->ftVersion, 200);
    EXPECT_TRUE(record == nullptr || record == made) << name << " gave another record";
    record = made;
}

void StrictHost::load() {
    for (const cimom::Registration& registration : registrations_) {
        Provider& provider = providers_[registration.provider];
        if (provider.handle == nullptr) {
            provider.location = registration.location;
            const std::string file = directory_ + "/lib" + registration.location + ".so";
            provider.handle =
                ::dlopen(file.c_str(), RTLD_GLOBAL | (traits_.lateBinding ? RTLD_LAZY : RTLD_NOW));
            ASSERT_NE(provider.handle, nullptr) << ::dlerror();
        }
        if (registration.instance) {
            create(provider, registration.provider, "Instance", provider.instance);
        }
        if (registration.association) {
            create(provider, registration.provider, "Association", provider.association);
        }
    }
}

bool StrictHost::unload(bool terminating) {
    for (auto& [name, provider] : providers_) {
        const RequestObjects objects(traits_);
        const auto cleanUp = [&](auto* record) {
            if (record != nullptr) {
                const CMPIStatus status =
                    callSlot("cleanup", record->ft->cleanup, record, context("root/cimv2"),
                             static_cast<CMPIBoolean>(terminating ? 1 : 0));
                EXPECT_EQ(status.rc, CMPI_RC_OK);
            }
        };
        cleanUp(provider.instance);
        cleanUp(provider.association);
    }
    for (auto& [name, provider] : providers_) {
        EXPECT_EQ(::dlclose(provider.handle), 0);
    }
    bool gone = true;
    for (auto& [name, provider] : providers_) {
        const std::string file = directory_ + "/lib" + provider.location + ".so";
        if (void* still = ::dlopen(file.c_str(), RTLD_NOW | RTLD_NOLOAD)) {
            ::dlclose(still);
            gone = false;
        }
    }
    providers_.clear();
    return gone;
}

void* StrictHost::symbol(const std::string& location, const std::string& name) const {
    const auto found = std::find_if(providers_.begin(), providers_.end(), [&](const auto& entry) {
        return entry.second.location == location;
    });
    return found == providers_.end() ? nullptr : ::dlsym(found->second.handle, name.c_str());
}

StrictHost::Response StrictHost::request(Kind kind, const cimom::ObjectPath& path,
                                         const Call& call) {
    const RequestObjects objects(traits_);
    auto* result = RequestObjects::make<ResultObject>(repository_, kind);
    const CMPIStatus status =
        call(context(path.nameSpace), result, RequestObjects::make<PathObject>(repository_, path));
    std::string message;
    if (status.msg != nullptr) {
        if (const auto* text = RequestObjects::get<StringObject>(status.msg, "The status")) {
            message = text->text;
        }
    }
    if (status.rc != CMPI_RC_OK) {
        return {status.rc, std::move(message), {}, {}};
    }
    return {CMPI_RC_OK, std::move(message), std::move(result->paths), std::move(result->instances)};
}

const StrictHost::Provider* StrictHost::serving(const std::string& className) const {
    for (const cimom::Registration& registration : registrations_) {
        if (cimom::sameName(registration.className, className)) {
            return &providers_.at(registration.provider);
        }
    }
    return nullptr;
}

StrictHost::Response StrictHost::eachClass(
    Kind kind, const cimom::ObjectPath& path,
    const std::function<CMPIStatus(const Provider&, const CMPIContext*, const CMPIResult*,
                                   const CMPIObjectPath*)>& call) {
    Response all;
    for (const cimom::Registration& registration : registrations_) {
        // A path that names no namespace is let through, as all that a client sends.
        const auto& spaces = registration.nameSpaces;
        const bool elsewhere =
            !path.nameSpace.empty() &&
            std::none_of(spaces.begin(), spaces.end(), [&path](const std::string& each) {
                return cimom::sameName(each, path.nameSpace);
            });
        if (!registration.instance || elsewhere ||
            !repository_.isA(registration.className, path.className)) {
            continue;
        }
        cimom::ObjectPath ofSubclass = path;
        ofSubclass.className = registration.className;
        const Provider& provider = providers_.at(registration.provider);
        append(all, request(kind, ofSubclass, [&](auto* context, auto* result, auto* record) {
                   return call(provider, context, result, record);
               }));
    }
    return all;
}

StrictHost::Response StrictHost::enumerateNames(const cimom::ObjectPath& path) {
    return eachClass(Kind::paths, path, [](auto& provider, auto* context, auto* result, auto* op) {
        return callSlot("enumerateInstanceNames", provider.instance->ft->enumerateInstanceNames,
                        provider.instance, context, result, op);
    });
}

StrictHost::Response StrictHost::enumerate(const cimom::ObjectPath& path, const char** properties) {
    return eachClass(
        Kind::instances, path, [=](auto& provider, auto* context, auto* result, auto* op) {
            return callSlot("enumerateInstances", provider.instance->ft->enumerateInstances,
                            provider.instance, context, result, op, properties);
        });
}

StrictHost::Response StrictHost::ofClass(
    Kind kind, const cimom::ObjectPath& path,
    const std::function<CMPIStatus(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                                   const CMPIObjectPath*)>& call) {
    const Provider* provider = serving(path.className);
    if (provider == nullptr) {
        return {CMPI_RC_ERR_NOT_SUPPORTED, "", {}, {}};
    }
    return request(kind, path, [&](auto* context, auto* result, auto* op) {
        return call(provider->instance, context, result, op);
    });
}

StrictHost::Response StrictHost::get(const cimom::ObjectPath& path, const char** properties) {
    Response response =
        ofClass(Kind::instances, path, [=](auto* mi, auto* context, auto* result, auto* op) {
            return callSlot("getInstance", mi->ft->getInstance, mi, context, result, op,
                            properties);
        });
    if (traits_.firstInstance && response.instances.size() > 1) {
        response.instances.erase(response.instances.begin() + 1, response.instances.end());
    }
    return response;
}

StrictHost::Response StrictHost::create(const cimom::Instance& instance) {
    return ofClass(Kind::paths, instance.path,
                   [&](auto* mi, auto* context, auto* result, auto* op) {
                       return callSlot("createInstance", mi->ft->createInstance, mi, context,
                                       result, op, newInstance(instance));
                   });
}

StrictHost::Response StrictHost::modify(const cimom::Instance& modified, const char** properties) {
    cimom::Instance instance = modified;
    if (traits_.filledModifications && properties == nullptr) {
        instance = withDefaults(repository_, std::move(instance), Defaults::inherited);
    }
    return ofClass(Kind::nothing, instance.path,
                   [&](auto* mi, auto* context, auto* result, auto* op) {
                       return callSlot("modifyInstance", mi->ft->modifyInstance, mi, context,
                                       result, op, newInstance(instance), properties);
                   });
}

const CMPIInstance* StrictHost::newInstance(const cimom::Instance& instance) const {
    return RequestObjects::make<InstanceObject>(repository_, instance);
}

StrictHost::Response StrictHost::remove(const cimom::ObjectPath& path) {
    return ofClass(Kind::nothing, path, [](auto* mi, auto* context, auto* result, auto* op) {
        return callSlot("deleteInstance", mi->ft->deleteInstance, mi, context, result, op);
    });
}

StrictHost::Response StrictHost::query(const cimom::ObjectPath& path, const char* text,
                                       const char* language) {
    return ofClass(Kind::instances, path, [=](auto* mi, auto* context, auto* result, auto* op) {
        return callSlot("execQuery", mi->ft->execQuery, mi, context, result, op, text, language);
    });
}

StrictHost::Response StrictHost::eachAssociator(
    Kind kind, const cimom::ObjectPath& path,
    const std::function<CMPIStatus(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*,
                                   const CMPIObjectPath*)>& call) {
    Response all;
    for (const auto& entry : providers_) {
        CMPIAssociationMI* mi = entry.second.association;
        if (mi != nullptr) {
            append(all, request(kind, path, [&](auto* context, auto* result, auto* op) {
                       return call(mi, context, result, op);
                   }));
        }
    }
    return all;
}

StrictHost::Response StrictHost::associatorNames(const cimom::ObjectPath& path,
                                                 const Filter& filter) {
    return eachAssociator(Kind::paths, path, [&](auto* mi, auto* context, auto* result, auto* op) {
        return callSlot("associatorNames", mi->ft->associatorNames, mi, context, result, op,
                        filter.association, filter.resultClass, filter.role, filter.resultRole);
    });
}

StrictHost::Response StrictHost::associators(const cimom::ObjectPath& path, const Filter& filter,
                                             const char** properties) {
    return eachAssociator(Kind::instances, path,
                          [&](auto* mi, auto* context, auto* result, auto* op) {
                              return callSlot("associators", mi->ft->associators, mi, context,
                                              result, op, filter.association, filter.resultClass,
                                              filter.role, filter.resultRole, properties);
                          });
}

StrictHost::Response StrictHost::referenceNames(const cimom::ObjectPath& path,
                                                const Filter& filter) {
    return eachAssociator(Kind::paths, path, [&](auto* mi, auto* context, auto* result, auto* op) {
        return callSlot("referenceNames", mi->ft->referenceNames, mi, context, result, op,
                        filter.association, filter.role);
    });
}

StrictHost::Response StrictHost::references(const cimom::ObjectPath& path, const Filter& filter,
                                            const char** properties) {
    return eachAssociator(Kind::instances, path,
                          [&](auto* mi, auto* context, auto* result, auto* op) {
                              return callSlot("references", mi->ft->references, mi, context, result,
                                              op, filter.association, filter.role, properties);
                          });
}

}  // namespace strict
