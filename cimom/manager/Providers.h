#pragma once

#include <cmpift.h>

#include <atomic>
#include <filesystem>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "broker/Broker.h"
#include "cimom/Forward.h"
#include "cimom/Status.h"
#include "manager/ProviderLibrary.h"

namespace cimom {

class Providers;

/// One provider: a name in the factories of one library. Its tables are made
/// when first asked for, once per kind. Safe for concurrent use.
class Provider {
  public:
    Provider(Providers& owner, std::string location, std::string name);

    [[nodiscard]] const std::string& name() const noexcept { return name_; }
    [[nodiscard]] const std::string& location() const noexcept { return location_; }

    /// The provider's record, whose table is there but may lack slots; null with
    /// the status that tells why there is none. A failed attempt is repeated
    /// with the next request. `nameSpace` is one that the provider serves.
    CMPIInstanceMI* instance(const std::string& nameSpace, Status& status);
    CMPIAssociationMI* association(const std::string& nameSpace, Status& status);
    CMPIIndicationMI* indication(const std::string& nameSpace, Status& status);
    /// What its library calls; null before a record was made.
    [[nodiscard]] const broker::Broker* broker() const;

  private:
    friend class Providers;

    template <typename Record>
    Record* record(std::atomic<Record*>& slot, const char* kind, const std::string& nameSpace,
                   Status& status);

    Providers& owner_;
    const std::string location_;
    const std::string name_;
    std::atomic<CMPIInstanceMI*> instance_{nullptr};
    std::atomic<CMPIAssociationMI*> association_{nullptr};
    std::atomic<CMPIIndicationMI*> indication_{nullptr};
    bool creating_ = false;  ///< guarded by the owner's mutex
};

/// The provider libraries. Ending it cleans every provider up and unloads the
/// libraries; no request may run then.
class Providers {
  public:
    /// Classes, handler and sink must outlive the providers. Without a handler, requests of
    /// providers to each other are not supported; without a sink, indications are not.
    Providers(std::vector<std::filesystem::path> directories, const ClassRepository& classes,
              RequestHandler* handler, broker::IndicationSink* sink = nullptr);
    ~Providers();
    Providers(const Providers&) = delete;
    Providers& operator=(const Providers&) = delete;

    /// Cleans every provider up. False when one has left a thread behind, which goes on using
    /// its library and what the providers were made with: then both must stay for ever.
    [[nodiscard]] bool end();

    /// The provider of that name in that library; loads nothing.
    Provider& provider(const std::string& location, const std::string& name);

  private:
    friend class Provider;

    /// The broker first: it must outlive the library's code.
    struct Loaded {
        std::string location;
        std::unique_ptr<broker::Broker> broker;
        std::unique_ptr<ProviderLibrary> library;
    };
    Loaded& load(const std::string& location);
    void cleanUp(Provider& provider);
    static bool threadsEnd(broker::Broker& broker);

    const std::vector<std::filesystem::path> directories_;
    const ClassRepository& classes_;
    RequestHandler* const handler_;
    broker::IndicationSink* const sink_;
    /// Held while a library is loaded and while a factory runs; recursive since
    /// a factory may ask other providers.
    std::recursive_mutex mutex_;
    bool closing_ = false;
    std::vector<const void*> cleaned_;  ///< records that were cleaned up
    std::vector<std::unique_ptr<Provider>> providers_;
    /// Ends first: code that runs when a library is unloaded may still ask.
    std::vector<Loaded> loaded_;
};

}  // namespace cimom
