#include "client/EmbeddedClient.h"

#include <algorithm>
#include <utility>

#include "cimom/MofError.h"
#include "cimom/Names.h"
#include "cimom/Results.h"
#include "client/Response.h"
#include "text/DisplayText.h"
#include "tklogger/TKLogger.h"
#include "zrcommon/LogLevel.h"
#include "zrcommon/PlatformUtilities.h"

namespace cimdhcp {

namespace {

Response responseOf(const char* operation, cimom::PathsResult result) {
    return {
        operation, std::move(result.status), result.returnDoneCalls, std::move(result.paths), {}};
}

Response responseOf(const char* operation, cimom::InstancesResult result) {
    for (auto& instance : result.instances) {
        if (instance) {
            leaveOutNulls(*instance);
        }
    }
    return {operation,
            std::move(result.status),
            result.returnDoneCalls,
            {},
            std::move(result.instances)};
}

/// At the level of what is lost without it, for nothing else may tell it.
void logFailure(const std::string& line) {
    static const std::string category = "ZR.CIMOM";
    TKLog::TKLogger::logLevelMessage("cimdhcp/EmbeddedClient", "logFailure", __LINE__, category,
                                     ZR::LogLevel::failure, nullptr, 0, 0, printable(line));
}

}  // namespace

EmbeddedClient::EmbeddedClient(const Directories& directories, std::string nameSpace)
    : Client(std::move(nameSpace)) {
    cimom::Configuration configuration;
    configuration.schemaDirectories = {directories.schema};
    configuration.registrationFiles = registrationFiles(directories.registrations);
    configuration.providerDirectories = directories.providers;
    configuration.fullSchema = directories.cimSchema;
    configuration.log = logFailure;
    try {
        manager_ = std::make_unique<cimom::ObjectManager>(std::move(configuration));
    } catch (const cimom::MofError& error) {
        throw Failure(ExitStatus::notLoaded, printable(error.what()));
    } catch (const cimom::LoadError& error) {
        throw Failure(ExitStatus::notLoaded, printable(error.what()));
    }
}

const cimom::ClassRepository& EmbeddedClient::repository() const noexcept {
    return manager_->repository();
}

const std::vector<cimom::Registration>& EmbeddedClient::registrations() const noexcept {
    return manager_->registrations();
}

std::vector<ClassEntry> EmbeddedClient::servedClasses() {
    return cimdhcp::servedClasses(registrations(), repository());
}

bool EmbeddedClient::mayServe(std::string_view className) const {
    return std::any_of(registrations().begin(), registrations().end(),
                       [className](const cimom::Registration& registration) {
                           return registration.instance &&
                                  cimom::sameName(registration.className, className);
                       });
}

std::optional<std::string> EmbeddedClient::dataDir() const {
    return ZR::PlatformUtilities::getKestraDataDir();
}

Response EmbeddedClient::enumerateNames(const cimom::ObjectPath& path) {
    return responseOf("EnumerateInstanceNames", manager_->enumerateInstanceNames(path));
}

Response EmbeddedClient::enumerate(const cimom::ObjectPath& path) {
    return responseOf("EnumerateInstances", manager_->enumerateInstances(path));
}

Response EmbeddedClient::get(const cimom::ObjectPath& path) {
    return responseOf("GetInstance", manager_->getInstance(path));
}

Response EmbeddedClient::enumerateWith(const cimom::ObjectPath& path,
                                       const std::vector<std::string>& properties) {
    return responseOf("EnumerateInstances", manager_->enumerateInstances(path, {properties, {}}));
}

Response EmbeddedClient::getWith(const cimom::ObjectPath& path,
                                 const std::vector<std::string>& properties) {
    return responseOf("GetInstance", manager_->getInstance(path, {properties, {}}));
}

Response EmbeddedClient::modify(const cimom::Instance& instance,
                                const std::vector<std::string>& properties) {
    cimom::InstanceRequest request;
    request.propertyList = properties;
    return responseOf("ModifyInstance", manager_->modifyInstance(instance, request));
}

Response EmbeddedClient::associatorNames(const cimom::ObjectPath& path,
                                         const cimom::AssociationRequest& request) {
    return responseOf("AssociatorNames", manager_->associatorNames(path, request));
}

Response EmbeddedClient::associators(const cimom::ObjectPath& path,
                                     const cimom::AssociationRequest& request) {
    return responseOf("Associators", manager_->associators(path, request));
}

Response EmbeddedClient::referenceNames(const cimom::ObjectPath& path,
                                        const cimom::AssociationRequest& request) {
    return responseOf("ReferenceNames", manager_->referenceNames(path, request));
}

Response EmbeddedClient::references(const cimom::ObjectPath& path,
                                    const cimom::AssociationRequest& request) {
    return responseOf("References", manager_->references(path, request));
}

Failure EmbeddedClient::failure(const Response& response, const cimom::ObjectPath& asked) const {
    return {response.status.noProvider ? ExitStatus::notLoaded : ExitStatus::notDone,
            statusMessage(response, asked)};
}

}  // namespace cimdhcp
