#pragma once

#include <cmpift.h>

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "DHCPClientProvider.h"
#include "broker/Broker.h"
#include "broker/Conversion.h"
#include "broker/RequestScope.h"
#include "broker/objects/BrokerRecords.h"
#include "broker/objects/BrokerResult.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/ObjectManager.h"
#include "cimom/Results.h"
#include "kit/CountedBroker.h"

namespace test {

/// The real broker of the object manager around the provider's own function tables:
/// requests go straight to the slots, so that a test sees what the provider did and
/// not what an object manager makes of it. One at a time.
class Host {
  public:
    struct Response {
        CMPIrc code = CMPI_RC_OK;
        bool hasMessage = false;
        std::vector<std::optional<cimom::ObjectPath>> paths;
        std::vector<std::optional<cimom::Instance>> instances;
        unsigned returnDoneCalls = 0;
    };

    /// Whether the object manager behind the broker serves the classes at the far
    /// ends, with the neighbours' library; without, it refuses to be asked.
    enum class Neighbours { absent, served };

    /// Whether the provider gets the broker itself or one that counts every call
    /// and can let it fail.
    enum class Calls { direct, counted };

    explicit Host(Neighbours neighbours = Neighbours::absent, Calls calls = Calls::direct);
    ~Host();
    Host(const Host&) = delete;
    Host& operator=(const Host&) = delete;

    /// What the provider gets.
    [[nodiscard]] const CMPIBroker* broker() const {
        return counted_ ? counted_->record() : real_.record();
    }
    /// Only of a host whose calls are counted.
    [[nodiscard]] CountedBroker& counted() { return *counted_; }
    [[nodiscard]] const CMPIInstanceMIFT& instanceTable() const { return *instanceMI_->ft; }
    [[nodiscard]] const CMPIAssociationMIFT& associationTable() const {
        return *associationMI_->ft;
    }

    Response enumerateNames(const cimom::ObjectPath& path);
    Response enumerate(const cimom::ObjectPath& path, const char** properties = nullptr);
    Response get(const cimom::ObjectPath& path);
    Response modify(const cimom::ObjectPath& path, const cimom::Instance* instance);
    Response associatorNames(const cimom::ObjectPath& path, const char* assocClass,
                             const char* resultClass = nullptr);
    Response associators(const cimom::ObjectPath& path, const char* assocClass,
                         const char* resultClass = nullptr);
    Response referenceNames(const cimom::ObjectPath& path, const char* resultClass);
    Response references(const cimom::ObjectPath& path, const char* resultClass);

    enum class Kind { paths, instances };

    /// Runs something in a request of its own: `call(context, result, path)`.
    template <typename Call>
    Response request(Kind kind, const cimom::ObjectPath& path, const Call& call) {
        const cimom::broker::RequestScope scope;
        cimom::CollectedObjects<cimom::ObjectPath> paths;
        cimom::CollectedObjects<cimom::Instance> instances;
        cimom::broker::AnyReceiver receiver = &instances;
        if (kind == Kind::paths) {
            receiver = &paths;
        }
        const cimom::broker::BrokerResult handedOver(receiver);
        cimom::broker::Arena& arena = cimom::broker::RequestScope::current().arena();
        const CMPIContext* context = cimom::broker::makeContext(arena, path.nameSpace, "", 0, 1);
        const CMPIObjectPath* record = cimom::broker::toRecord(arena, &repository_, path);
        const CMPIResult* result = handedOver.record();
        if (counted_) {
            counted_->beginRequest();
            record = counted_->standIn(record);
            result = counted_->standIn(result);
        }
        const CMPIStatus status = call(context, result, record);
        return {status.rc, status.msg != nullptr, std::move(paths.objects),
                std::move(instances.objects), handedOver.returnDoneCalls()};
    }

    const cimom::ClassRepository& repository() const { return repository_; }

  private:
    std::unique_ptr<cimom::ObjectManager> manager_;
    cimom::ClassRepository repository_;
    cimom::broker::Broker real_;
    std::optional<CountedBroker> counted_;
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
std::vector<std::string> keysOf(const Host::Response& response, const std::string& name);

}  // namespace test
