#include "kit/Host.h"

#include "broker/objects/BrokerRecords.h"
#include "cimom/Instance.h"

namespace test {

namespace {

cimom::ClassRepository loadSchema() {
    cimom::ClassRepository repository;
    repository.loadDirectory(ZR_SOURCE_DIR "/schema");
    repository.complete();
    return repository;
}

std::unique_ptr<cimom::ObjectManager> manageNeighbours() {
    cimom::Configuration configuration;
    configuration.schemaDirectories = {ZR_SOURCE_DIR "/schema"};
    configuration.registrationFiles = {ZR_SOURCE_DIR
                                       "/schema/exact/DHCPClientNeighbours.registration"};
    configuration.providerDirectories = {ZR_BINARY_DIR "/lib/cmpi"};
    return std::make_unique<cimom::ObjectManager>(configuration);
}

}  // namespace

Host::Host(Neighbours neighbours, Calls calls)
    : manager_(neighbours == Neighbours::served ? manageNeighbours() : nullptr),
      repository_(loadSchema()),
      real_(repository_, manager_.get()) {
    if (calls == Calls::counted) {
        counted_.emplace(real_.record());
    }
    CMPIStatus status{CMPI_RC_OK, nullptr};
    instanceMI_ = DHCPClientProvider_Create_InstanceMI(broker(), nullptr, &status);
    associationMI_ = DHCPClientProvider_Create_AssociationMI(broker(), nullptr, &status);
}

Host::~Host() {
    instanceMI_->ft->cleanup(instanceMI_, nullptr, 1);
    associationMI_->ft->cleanup(associationMI_, nullptr, 1);
}

Host::Response Host::enumerateNames(const cimom::ObjectPath& path) {
    return request(Kind::paths, path, [&](auto* context, auto* result, auto* record) {
        return instanceTable().enumerateInstanceNames(instanceMI_, context, result, record);
    });
}

Host::Response Host::enumerate(const cimom::ObjectPath& path, const char** properties) {
    return request(Kind::instances, path, [&](auto* context, auto* result, auto* record) {
        return instanceTable().enumerateInstances(instanceMI_, context, result, record, properties);
    });
}

Host::Response Host::get(const cimom::ObjectPath& path) {
    return request(Kind::instances, path, [&](auto* context, auto* result, auto* record) {
        return instanceTable().getInstance(instanceMI_, context, result, record, nullptr);
    });
}

Host::Response Host::modify(const cimom::ObjectPath& path, const cimom::Instance* instance) {
    return request(Kind::instances, path, [&](auto* context, auto* result, auto* record) {
        const CMPIInstance* newInstanceRecord =
            instance == nullptr
                ? nullptr
                : cimom::broker::toRecord(cimom::broker::RequestScope::current().arena(),
                                          &repository_, *instance);
        if (counted_) {
            newInstanceRecord = counted_->standIn(newInstanceRecord);
        }
        return instanceTable().modifyInstance(instanceMI_, context, result, record,
                                              newInstanceRecord, nullptr);
    });
}

Host::Response Host::associatorNames(const cimom::ObjectPath& path, const char* assocClass,
                                     const char* resultClass) {
    return request(Kind::paths, path, [&](auto* context, auto* result, auto* record) {
        return associationTable().associatorNames(associationMI_, context, result, record,
                                                  assocClass, resultClass, nullptr, nullptr);
    });
}

Host::Response Host::associators(const cimom::ObjectPath& path, const char* assocClass,
                                 const char* resultClass) {
    return request(Kind::instances, path, [&](auto* context, auto* result, auto* record) {
        return associationTable().associators(associationMI_, context, result, record, assocClass,
                                              resultClass, nullptr, nullptr, nullptr);
    });
}

Host::Response Host::referenceNames(const cimom::ObjectPath& path, const char* resultClass) {
    return request(Kind::paths, path, [&](auto* context, auto* result, auto* record) {
        return associationTable().referenceNames(associationMI_, context, result, record,
                                                 resultClass, nullptr);
    });
}

Host::Response Host::references(const cimom::ObjectPath& path, const char* resultClass) {
    return request(Kind::instances, path, [&](auto* context, auto* result, auto* record) {
        return associationTable().references(associationMI_, context, result, record, resultClass,
                                             nullptr, nullptr);
    });
}

cimom::ObjectPath pathOf(const std::string& className,
                         const std::vector<std::pair<std::string, std::string>>& keys) {
    cimom::ObjectPath path;
    path.nameSpace = "root/cimv2";
    path.className = className;
    for (const auto& [name, value] : keys) {
        path.keys.push_back({name, cimom::Value::ofString(value)});
    }
    return path;
}

namespace {

template <typename Kind>
std::optional<Kind> read(const cimom::Value* value) {
    const cimom::Scalar* scalar = value == nullptr ? nullptr : value->scalar();
    const Kind* content = scalar == nullptr ? nullptr : std::get_if<Kind>(scalar);
    return content == nullptr ? std::nullopt : std::optional(*content);
}

}  // namespace

std::optional<std::string> keyOf(const cimom::ObjectPath& path, const std::string& name) {
    return read<std::string>(path.key(name));
}

std::optional<std::string> textOf(const cimom::Instance& instance, const std::string& name) {
    return read<std::string>(instance.property(name));
}

std::optional<std::uint64_t> numberOf(const cimom::Instance& instance, const std::string& name) {
    return read<std::uint64_t>(instance.property(name));
}

std::vector<std::string> keysOf(const Host::Response& response, const std::string& name) {
    std::vector<std::string> values;
    for (const auto& path : response.paths) {
        values.push_back(path ? keyOf(*path, name).value_or("(none)") : "(null)");
    }
    return values;
}

}  // namespace test
