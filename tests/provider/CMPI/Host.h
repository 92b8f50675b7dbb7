#pragma once

#include <cmpift.h>

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "Broker.h"
#include "BrokerContext.h"
#include "BrokerResult.h"
#include "Conversion.h"
#include "DHCPClientProvider.h"
#include "RequestScope.h"
#include "Schema.h"
#include "cimom/Cim.h"
#include "cimom/ClassRepository.h"
#include "cimom/ObjectManager.h"

namespace test {

/// What a function of the broker does in place of its work.
enum class Fault {
    none,
    null,       ///< answers null, with status OK
    status,     ///< answers null, with an error status
    exception,  ///< throws ZR::ProviderException, as the provider's own code might
};

/// The real broker of the object manager around the provider's own function tables:
/// requests go straight to the slots, so that a test sees what the provider did and
/// not what an object manager makes of it. Two functions of the broker can be made
/// to fail, at a call that the test names.
class Host {
  public:
    struct Answer {
        CMPIrc code = CMPI_RC_OK;
        bool hasMessage = false;
        std::vector<std::optional<cimom::ObjectPath>> paths;
        std::vector<std::optional<cimom::Instance>> instances;
        unsigned returnDoneCalls = 0;
    };

    /// Whether the object manager behind the broker serves the classes at the far
    /// ends, with the neighbours' library; without, it refuses to be asked.
    enum class Neighbours { absent, served };

    explicit Host(Neighbours neighbours = Neighbours::absent);
    ~Host();
    Host(const Host&) = delete;
    Host& operator=(const Host&) = delete;

    [[nodiscard]] const CMPIBroker* broker() const { return &record_; }
    [[nodiscard]] const CMPIInstanceMIFT& instanceTable() const { return *instanceMI_->ft; }
    [[nodiscard]] const CMPIAssociationMIFT& associationTable() const {
        return *associationMI_->ft;
    }

    Answer enumerateNames(const cimom::ObjectPath& path);
    Answer enumerate(const cimom::ObjectPath& path, const char** properties = nullptr);
    Answer get(const cimom::ObjectPath& path);
    Answer modify(const cimom::ObjectPath& path, const cimom::Instance* instance);
    Answer associatorNames(const cimom::ObjectPath& path, const char* assocClass,
                           const char* resultClass = nullptr);
    Answer associators(const cimom::ObjectPath& path, const char* assocClass,
                       const char* resultClass = nullptr);
    Answer referenceNames(const cimom::ObjectPath& path, const char* resultClass);
    Answer references(const cimom::ObjectPath& path, const char* resultClass);

    /// Runs something in a request of its own: `call(context, result, path)`.
    template <typename Call>
    Answer request(cimom::broker::ResultCollector::Kind kind, const cimom::ObjectPath& path,
                   const Call& call) {
        const cimom::broker::RequestScope scope;
        cimom::broker::ResultCollector collector(kind);
        cimom::broker::Arena& arena = cimom::broker::RequestScope::current().arena();
        const CMPIContext* context = cimom::broker::makeContext(arena, path.nameSpace, "", 0, 1);
        const CMPIObjectPath* record = cimom::broker::toRecord(arena, &schema_, path);
        const CMPIStatus status = call(context, collector.record(), record);
        cimom::broker::Delivery delivery = collector.take();
        return {status.rc, status.msg != nullptr, std::move(delivery.paths),
                std::move(delivery.instances), delivery.returnDoneCalls};
    }

    /// The call of newObjectPath (or newInstance) with this number, from 1, fails.
    void failNewObjectPath(unsigned call, Fault fault);
    void failNewInstance(unsigned call, Fault fault);

    /// How often classPathIsA was asked.
    [[nodiscard]] unsigned classQuestions() const;

    const cimom::ClassRepository& repository() const { return repository_; }

  private:
    std::unique_ptr<cimom::ObjectManager> manager_;
    cimom::ClassRepository repository_;
    cimom::broker::Schema schema_;
    cimom::broker::Broker real_;
    CMPIBroker record_;
    CMPIInstanceMI* instanceMI_;
    CMPIAssociationMI* associationMI_;
};

/// A path of the default namespace with text keys.
cimom::ObjectPath pathOf(const std::string& className,
                         const std::vector<std::pair<std::string, std::string>>& keys = {});

/// The value of a text key or property; nothing when it is absent or no text.
std::optional<std::string> keyOf(const cimom::ObjectPath& path, const std::string& name);
std::optional<std::string> textOf(const cimom::Instance& instance, const std::string& name);

/// A number property; nothing when it is absent or no unsigned number.
std::optional<std::uint64_t> numberOf(const cimom::Instance& instance, const std::string& name);

/// The values of one text key, of each path in its order.
std::vector<std::string> keysOf(const Host::Answer& answer, const std::string& name);

}  // namespace test
