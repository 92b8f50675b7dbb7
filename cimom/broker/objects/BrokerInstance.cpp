#include "broker/objects/BrokerRecords.h"

#include <algorithm>
#include <vector>

#include "broker/BrokerTypes.h"
#include "broker/objects/BrokerStatus.h"
#include "cimom/ClassDeclaration.h"
#include "cimom/ClassRepository.h"
#include "cimom/Names.h"
#include "model/NameKey.h"

namespace cimom::broker {

namespace {

/// Whether a value of the CMPI type can be the property's. An embedded instance
/// fits a text property that is declared to hold one.
bool fits(const PropertyDeclaration& property, CMPIType type) noexcept {
    if (type == CMPI_null) {
        return true;
    }
    if (isArrayType(type) != property.isArray) {
        return false;
    }
    const auto given = cimType(withoutArray(type));
    if (!given) {
        return false;
    }
    if (*given == property.type) {
        return true;
    }
    return *given == Type::instance && property.type == Type::string &&
           (property.qualifier("EmbeddedInstance") != nullptr ||
            property.qualifier("EmbeddedObject") != nullptr);
}

CMPIStatus release(CMPIInstance* self) {
    InstanceRecord* const instance = instanceOf(self);
    if (instance == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (instance->arena->isRoot(instance)) {
        const std::unique_ptr<Arena> ended(instance->arena);
    }
    return statusOf(CMPI_RC_OK);
}

CMPIInstance* clone(const CMPIInstance* self, CMPIStatus* rc) {
    return guarded<CMPIInstance*>(rc, nullptr, [self](CMPIrc& code) -> CMPIInstance* {
        const InstanceRecord* const instance = instanceOf(self);
        if (instance == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        auto arena = Arena::forClone();
        InstanceRecord* const copy = copyInstance(*arena, *instance);
        arena.release()->setRoot(copy);
        return copy;
    });
}

CMPIData getProperty(const CMPIInstance* self, const char* name, CMPIStatus* rc) {
    const InstanceRecord* const instance = instanceOf(self);
    if (instance == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return badData();
    }
    return dataByName(instance->properties, name, CMPI_goodValue, rc);
}

CMPIData getPropertyAt(const CMPIInstance* self, CMPICount index, CMPIString** name,
                       CMPIStatus* rc) {
    const InstanceRecord* const instance = instanceOf(self);
    if (instance == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return badData();
    }
    return dataAt(instance->properties, index, CMPI_goodValue, name, rc);
}

CMPICount getPropertyCount(const CMPIInstance* self, CMPIStatus* rc) {
    const InstanceRecord* const instance = instanceOf(self);
    setStatus(rc, instance == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return instance == nullptr ? 0 : instance->properties.size();
}

bool isKept(const PropertyFilter& filter, std::string_view name) noexcept {
    if (!filter.active) {
        return true;
    }
    for (CMPICount index = 0; index < filter.size; ++index) {
        if (sameName(filter.names[index]->view(), name)) {
            return true;
        }
    }
    return false;
}

bool isKey(const ClassDeclaration& declaration, const PropertyDeclaration& property) noexcept {
    const std::vector<std::size_t>& keys = declaration.index.keys();
    const auto position = static_cast<std::size_t>(&property - declaration.properties.data());
    return std::find(keys.begin(), keys.end(), position) != keys.end();
}

/// Takes the value of a key property into the path, if the path has not had the key from
/// the start. The path shares the value, which is in the same arena.
void setKey(InstanceRecord& instance, const NameKey& name, const PropertyDeclaration& declared,
            const CMPIData& data) {
    EntryList& keys = instance.path->keys;
    const CMPICount position = keys.position(name);
    if (position < instance.ownKeys) {
        return;
    }
    if ((data.state & CMPI_nullValue) == 0) {
        keys.set(*instance.arena, declared.name, data);
    } else if (position < keys.size()) {
        keys.remove(position);  // keys cannot be null
    }
    instance.handedOut->store(nullptr, std::memory_order_release);
}

CMPIrc set(InstanceRecord* instance, const char* name, const CMPIValue* value, CMPIType type) {
    if (instance == nullptr) {
        return CMPI_RC_ERR_INVALID_HANDLE;
    }
    if (name == nullptr) {
        return CMPI_RC_ERR_INVALID_PARAMETER;
    }
    const NameKey key(name);
    const PropertyDeclaration* const declared =
        instance->declaration == nullptr ? nullptr : instance->declaration->property(key);
    if (declared != nullptr && !fits(*declared, type)) {
        return CMPI_RC_ERR_TYPE_MISMATCH;
    }
    const bool isPathKey = declared != nullptr && isKey(*instance->declaration, *declared);
    const bool kept = isKept(instance->filter, key.text());
    if (!kept && !isPathKey) {
        return CMPI_RC_OK;
    }
    CMPIData data{};
    if (const CMPIrc code = copyValue(*instance->arena, value, type, data); code != CMPI_RC_OK) {
        return code == CMPI_RC_ERR_INVALID_DATA_TYPE ? CMPI_RC_ERR_TYPE_MISMATCH : code;
    }
    if (type == CMPI_null && declared != nullptr) {
        data.type = cmpiType(declared->type, declared->isArray);
    }
    if (isPathKey) {
        setKey(*instance, key, *declared, data);
    }
    if (kept) {
        instance->properties.set(*instance->arena, key, data);
    }
    return CMPI_RC_OK;
}

CMPIStatus setProperty(const CMPIInstance* self, const char* name, const CMPIValue* value,
                       CMPIType type) {
    return guarded([=] { return set(instanceOf(self), name, value, type); });
}

/// The origin is not kept: it follows from the class.
CMPIStatus setPropertyWithOrigin(const CMPIInstance* self, const char* name, const CMPIValue* value,
                                 CMPIType type, const char*) {
    return guarded([=] { return set(instanceOf(self), name, value, type); });
}

/// A copy, so that a provider which goes on working with it does not change the
/// instance; it lives as long as the instance.
CMPIObjectPath* getObjectPath(const CMPIInstance* self, CMPIStatus* rc) {
    return guarded<CMPIObjectPath*>(rc, nullptr, [self](CMPIrc& code) -> CMPIObjectPath* {
        const InstanceRecord* const instance = instanceOf(self);
        if (instance == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        PathRecord* const last = instance->handedOut->load(std::memory_order_acquire);
        if (last != nullptr && last->changes == 0) {
            return last;
        }
        PathRecord* const copy = copyPath(*instance->arena, *instance->path);
        instance->handedOut->store(copy, std::memory_order_release);
        return copy;
    });
}

CMPIStatus setObjectPath(const CMPIInstance* self, const CMPIObjectPath* path) {
    return guarded([=] {
        InstanceRecord* const instance = instanceOf(self);
        const PathRecord* const source = pathOf(path);
        if (instance == nullptr) {
            return CMPI_RC_ERR_INVALID_HANDLE;
        }
        if (source == nullptr) {
            return CMPI_RC_ERR_INVALID_PARAMETER;
        }
        const EntryList former = instance->path->keys;
        const CMPICount ownFormer = instance->ownKeys;
        instance->path = copyPath(*instance->arena, *source);
        instance->ownKeys = instance->path->keys.size();
        instance->declaration =
            source->classes == nullptr ? nullptr : source->classes->find(source->className->view());
        instance->handedOut->store(nullptr, std::memory_order_release);
        for (CMPICount index = ownFormer; index < former.size(); ++index) {
            const NameKey name(former[index].name->view());
            const PropertyDeclaration* const declared =
                instance->declaration == nullptr ? nullptr : instance->declaration->property(name);
            if (declared != nullptr && isKey(*instance->declaration, *declared)) {
                setKey(*instance, name, *declared, former[index].data);
            }
        }
        return CMPI_RC_OK;
    });
}

/// Properties that the filter excludes are dropped, those set before too. The names of
/// keys do not matter: keys stay in the path.
CMPIStatus setPropertyFilter(const CMPIInstance* self, const char** names, const char**) {
    return guarded([=] {
        InstanceRecord* const instance = instanceOf(self);
        if (instance == nullptr) {
            return CMPI_RC_ERR_INVALID_HANDLE;
        }
        PropertyFilter filter;
        if (names != nullptr) {
            filter.active = true;
            while (names[filter.size] != nullptr) {
                ++filter.size;
            }
            filter.names = instance->arena->makeMany<StringRecord*>(filter.size);
            for (CMPICount index = 0; index < filter.size; ++index) {
                filter.names[index] = makeString(*instance->arena, names[index]);
            }
        }
        instance->filter = filter;
        for (CMPICount index = instance->properties.size(); index > 0; --index) {
            if (!isKept(filter, instance->properties[index - 1].name->view())) {
                instance->properties.remove(index - 1);
            }
        }
        return CMPI_RC_OK;
    });
}

InstanceRecord* make(Arena& arena, const PathRecord& path) {
    auto* const handedOut = arena.make<std::atomic<PathRecord*>>(nullptr);
    auto* const instance = arena.make<InstanceRecord>();
    *instance = InstanceRecord{
        {instance, &instanceTable},
        &arena,
        copyPath(arena, path),
        path.classes == nullptr ? nullptr : path.classes->find(path.className->view()),
        path.keys.size(),
        EntryList{},
        PropertyFilter{},
        handedOut};
    return instance;
}

}  // namespace

const CMPIInstanceFT instanceTable{
    CMPIVersion200,       release,     clone,         getProperty,       getPropertyAt,
    getPropertyCount,     setProperty, getObjectPath, setPropertyFilter, setObjectPath,
    setPropertyWithOrigin};

InstanceRecord* instanceOf(const CMPIInstance* instance) noexcept {
    return instance != nullptr && instance->ft == &instanceTable
               ? static_cast<InstanceRecord*>(instance->hdl)
               : nullptr;
}

InstanceRecord* makeInstance(Arena& arena, const PathRecord& path) {
    InstanceRecord* const instance = make(arena, path);
    // Most instances of providers have this many; saves growing step by step.
    instance->properties.reserve(arena, 24);
    return instance;
}

InstanceRecord* copyInstance(Arena& arena, const InstanceRecord& instance) {
    InstanceRecord* const copy = make(arena, *instance.path);
    copy->ownKeys = instance.ownKeys;
    copy->properties = instance.properties.copyInto(arena);
    copy->filter = instance.filter;
    if (instance.filter.active) {
        copy->filter.names = arena.makeMany<StringRecord*>(instance.filter.size);
        for (CMPICount index = 0; index < instance.filter.size; ++index) {
            copy->filter.names[index] = stringIn(arena, *instance.filter.names[index]);
        }
    }
    return copy;
}

}  // namespace cimom::broker
