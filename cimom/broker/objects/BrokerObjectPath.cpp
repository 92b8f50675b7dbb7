#include "broker/objects/BrokerRecords.h"

#include "broker/BrokerText.h"
#include "broker/BrokerTypes.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerStatus.h"

namespace cimom::broker {

namespace {

CMPIStatus release(CMPIObjectPath* self) {
    PathRecord* const path = pathOf(self);
    if (path == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (path->arena->isRoot(path)) {
        const std::unique_ptr<Arena> ended(path->arena);
    }
    return statusOf(CMPI_RC_OK);
}

CMPIObjectPath* clone(const CMPIObjectPath* self, CMPIStatus* rc) {
    return guarded<CMPIObjectPath*>(rc, nullptr, [self](CMPIrc& code) -> CMPIObjectPath* {
        const PathRecord* const path = pathOf(self);
        if (path == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        auto arena = Arena::forClone();
        PathRecord* const copy = copyPath(*arena, *path);
        arena.release()->setRoot(copy);
        return copy;
    });
}

using Component = StringRecord* PathRecord::*;

template <Component component>
CMPIStatus setComponent(const CMPIObjectPath* self, const char* text) {
    return guarded([=] {
        PathRecord* const path = pathOf(self);
        if (path == nullptr) {
            return CMPI_RC_ERR_INVALID_HANDLE;
        }
        path->*component = text == nullptr ? emptyString() : makeString(*path->arena, text);
        ++path->changes;
        return CMPI_RC_OK;
    });
}

template <Component component>
CMPIString* getComponent(const CMPIObjectPath* self, CMPIStatus* rc) {
    const PathRecord* const path = pathOf(self);
    setStatus(rc, path == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return path == nullptr ? nullptr : path->*component;
}

CMPIStatus addKey(const CMPIObjectPath* self, const char* key, const CMPIValue* value,
                  CMPIType type) {
    return guarded([=] {
        PathRecord* const path = pathOf(self);
        if (path == nullptr) {
            return CMPI_RC_ERR_INVALID_HANDLE;
        }
        if (key == nullptr || value == nullptr || isArrayType(type)) {
            return CMPI_RC_ERR_INVALID_PARAMETER;
        }
        CMPIData data{};
        if (const CMPIrc code = copyValue(*path->arena, value, type, data); code != CMPI_RC_OK) {
            return code;
        }
        if ((data.state & CMPI_nullValue) != 0) {
            return CMPI_RC_ERR_INVALID_PARAMETER;  // keys cannot be null
        }
        path->keys.set(*path->arena, key, data);
        ++path->changes;
        return CMPI_RC_OK;
    });
}

CMPIData getKey(const CMPIObjectPath* self, const char* key, CMPIStatus* rc) {
    const PathRecord* const path = pathOf(self);
    if (path == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return badData();
    }
    return dataByName(path->keys, key, CMPI_keyValue, rc);
}

CMPIData getKeyAt(const CMPIObjectPath* self, CMPICount index, CMPIString** name, CMPIStatus* rc) {
    const PathRecord* const path = pathOf(self);
    if (path == nullptr) {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return badData();
    }
    return dataAt(path->keys, index, CMPI_keyValue, name, rc);
}

CMPICount getKeyCount(const CMPIObjectPath* self, CMPIStatus* rc) {
    const PathRecord* const path = pathOf(self);
    setStatus(rc, path == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return path == nullptr ? 0 : path->keys.size();
}

CMPIrc takeNameSpaceAndClass(PathRecord* path, const PathRecord* source) {
    if (path == nullptr) {
        return CMPI_RC_ERR_INVALID_HANDLE;
    }
    if (source == nullptr) {
        return CMPI_RC_ERR_INVALID_PARAMETER;
    }
    path->nameSpace = stringIn(*path->arena, *source->nameSpace);
    path->className = stringIn(*path->arena, *source->className);
    ++path->changes;
    return CMPI_RC_OK;
}

/// The class name goes along, although the name of the function does not say so.
CMPIStatus setNameSpaceFromObjectPath(const CMPIObjectPath* self, const CMPIObjectPath* source) {
    return guarded([=] { return takeNameSpaceAndClass(pathOf(self), pathOf(source)); });
}

CMPIStatus setHostAndNameSpaceFromObjectPath(const CMPIObjectPath* self,
                                             const CMPIObjectPath* source) {
    return guarded([=] {
        PathRecord* const path = pathOf(self);
        const PathRecord* const from = pathOf(source);
        const CMPIrc code = takeNameSpaceAndClass(path, from);
        if (code == CMPI_RC_OK && path != nullptr && from != nullptr) {
            path->host = stringIn(*path->arena, *from->host);
        }
        return code;
    });
}

CMPIData getClassQualifier(const CMPIObjectPath* self, const char* name, CMPIStatus* rc) {
    return classQualifier(pathOf(self), name, rc);
}

CMPIData getPropertyQualifier(const CMPIObjectPath* self, const char* property, const char* name,
                              CMPIStatus* rc) {
    return propertyQualifier(pathOf(self), property, name, rc);
}

/// Methods are not part of the repository.
CMPIData getMethodQualifier(const CMPIObjectPath*, const char*, const char*, CMPIStatus* rc) {
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return missingData();
}

CMPIData getParameterQualifier(const CMPIObjectPath*, const char*, const char*, const char*,
                               CMPIStatus* rc) {
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return missingData();
}

CMPIString* toString(const CMPIObjectPath* self, CMPIStatus* rc) {
    return guarded<CMPIString*>(rc, nullptr, [self](CMPIrc& code) -> CMPIString* {
        const PathRecord* const path = pathOf(self);
        if (path == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        return makeString(RequestScope::current().arena(), textOf(*path));
    });
}

}  // namespace

const CMPIObjectPathFT objectPathTable{CMPIVersion200,
                                       release,
                                       clone,
                                       setComponent<&PathRecord::nameSpace>,
                                       getComponent<&PathRecord::nameSpace>,
                                       setComponent<&PathRecord::host>,
                                       getComponent<&PathRecord::host>,
                                       setComponent<&PathRecord::className>,
                                       getComponent<&PathRecord::className>,
                                       addKey,
                                       getKey,
                                       getKeyAt,
                                       getKeyCount,
                                       setNameSpaceFromObjectPath,
                                       setHostAndNameSpaceFromObjectPath,
                                       getClassQualifier,
                                       getPropertyQualifier,
                                       getMethodQualifier,
                                       getParameterQualifier,
                                       toString};

PathRecord* pathOf(const CMPIObjectPath* path) noexcept {
    return path != nullptr && path->ft == &objectPathTable ? static_cast<PathRecord*>(path->hdl)
                                                           : nullptr;
}

PathRecord* makePath(Arena& arena, const ClassRepository* classes, std::string_view nameSpace,
                     std::string_view className) {
    auto* const path = arena.make<PathRecord>();
    *path = PathRecord{{path, &objectPathTable},
                       &arena,
                       classes,
                       emptyString(),
                       nameSpace.empty() ? emptyString() : nameIn(arena, NameKey(nameSpace)),
                       className.empty() ? emptyString() : nameIn(arena, NameKey(className)),
                       EntryList{},
                       0};
    return path;
}

PathRecord* copyPath(Arena& arena, const PathRecord& path) {
    auto* const copy = arena.make<PathRecord>();
    *copy = PathRecord{{copy, &objectPathTable},
                       &arena,
                       path.classes,
                       stringIn(arena, *path.host),
                       stringIn(arena, *path.nameSpace),
                       stringIn(arena, *path.className),
                       path.keys.copyInto(arena),
                       0};
    return copy;
}

}  // namespace cimom::broker
