#pragma once

#include <cmpift.h>

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "cimom/ClassRepository.h"
#include "cimom/ObjectManager.h"
#include "kit/StrictObjects.h"
#include "kit/StrictTraits.h"

namespace strict {

/// The standard schema with all superclasses, their properties and their defaults, as object
/// managers bring it.
inline const std::string wholeSchema = ZR_SOURCE_DIR "/tests/schema/cim-2.41/cim_schema_2.41.0.mof";

/// An object manager for tests that treats providers as the least forgiving of the
/// real ones do. Its libraries are opened with RTLD_GLOBAL; its broker tells version 0
/// and has slots that are null; requests for a superclass become one call per
/// registered class; association requests without a known class reach each provider
/// once; nothing that a client sends is checked or filtered on its way; properties that
/// stay unset show the default that the schema declares. What a provider may not do is
/// a violation.
///
/// Requests may come from many threads; loading and unloading may not.
class StrictHost {
  public:
    struct Response {
        CMPIrc code = CMPI_RC_OK;
        std::string message;  ///< of the status; empty when it has none
        std::vector<cimom::ObjectPath> paths;
        std::vector<cimom::Instance> instances;
    };

    /// `schema` is a directory of MOF files, or the file of a whole standard schema, over
    /// which the classes of this project are loaded.
    StrictHost(const std::string& schema, const std::vector<std::string>& registrations,
               std::string libraryDirectory, const Traits& traits = {});
    ~StrictHost();
    StrictHost(const StrictHost&) = delete;
    StrictHost& operator=(const StrictHost&) = delete;

    [[nodiscard]] const cimom::ClassRepository& repository() const { return repository_; }
    [[nodiscard]] const std::vector<cimom::Registration>& registrations() const {
        return registrations_;
    }

    /// Opens each registered library and calls its factories, once per class.
    void load();
    /// Cleans up each kind of each library once, and closes the libraries. False when
    /// one of them is still in the process afterwards.
    bool unload(bool terminating = false);

    Response enumerateNames(const cimom::ObjectPath& path);
    Response enumerate(const cimom::ObjectPath& path, const char** properties = nullptr);
    Response get(const cimom::ObjectPath& path, const char** properties = nullptr);
    Response create(const cimom::Instance& instance);
    Response modify(const cimom::Instance& instance, const char** properties = nullptr);
    Response remove(const cimom::ObjectPath& path);
    Response query(const cimom::ObjectPath& path, const char* text, const char* language);

    /// What association requests may name, or not.
    struct Filter {
        const char* association = nullptr;  ///< the result class of references
        const char* resultClass = nullptr;
        const char* role = nullptr;
        const char* resultRole = nullptr;
    };
    Response associatorNames(const cimom::ObjectPath& path, const Filter& filter);
    Response associators(const cimom::ObjectPath& path, const Filter& filter,
                         const char** properties = nullptr);
    Response referenceNames(const cimom::ObjectPath& path, const Filter& filter);
    Response references(const cimom::ObjectPath& path, const Filter& filter,
                        const char** properties = nullptr);

    /// A symbol of a registered library; null when it does not export it.
    [[nodiscard]] void* symbol(const std::string& location, const std::string& name) const;

    /// Runs something as a request: `call(context, result, path)`.
    using Call =
        std::function<CMPIStatus(const CMPIContext*, const CMPIResult*, const CMPIObjectPath*)>;
    Response request(ResultObject::Kind kind, const cimom::ObjectPath& path, const Call& call);

    /// The host of a broker record.
    static StrictHost& of(const CMPIBroker* broker);
    [[nodiscard]] const CMPIBroker* broker() const { return &broker_; }

  private:
    /// A provider, in a library that may hold others, too.
    struct Provider {
        std::string location;
        void* handle = nullptr;
        CMPIInstanceMI* instance = nullptr;
        CMPIAssociationMI* association = nullptr;
    };

    template <typename Record>
    void create(Provider& provider, const std::string& name, const char* kind, Record*& record);
    /// The provider of a class that is registered itself.
    const Provider* serving(const std::string& className) const;
    /// Calls the provider of each registered class at or below the path's, with that class.
    Response eachClass(
        ResultObject::Kind kind, const cimom::ObjectPath& path,
        const std::function<CMPIStatus(const Provider&, const CMPIContext*, const CMPIResult*,
                                       const CMPIObjectPath*)>& call);
    /// Calls each provider of associations once.
    Response eachAssociator(
        ResultObject::Kind kind, const cimom::ObjectPath& path,
        const std::function<CMPIStatus(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*,
                                       const CMPIObjectPath*)>& call);
    Response ofClass(
        ResultObject::Kind kind, const cimom::ObjectPath& path,
        const std::function<CMPIStatus(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,
                                       const CMPIObjectPath*)>& call);
    const CMPIContext* context(const std::string& nameSpace) const;
    [[nodiscard]] const CMPIInstance* newInstance(const cimom::Instance& instance) const;

    cimom::ClassRepository repository_;
    std::vector<cimom::Registration> registrations_;
    std::string directory_;
    Traits traits_;
    CMPIBroker broker_;
    std::map<std::string, Provider> providers_;  ///< by name
};

}  // namespace strict
