#pragma once

#include <memory>
#include <string>
#include <vector>

#include "cimom/ObjectManager.h"
#include "client/Client.h"
#include "client/Installation.h"

namespace cimdhcp {

/// The object manager of this process with the providers that are installed.
class EmbeddedClient : public Client {
  public:
    /// Reads schema and registrations. Throws Failure with ExitStatus::notLoaded.
    EmbeddedClient(const Directories& directories, std::string nameSpace);

    [[nodiscard]] const cimom::ClassRepository& repository() const noexcept;
    [[nodiscard]] const std::vector<cimom::Registration>& registrations() const noexcept;
    [[nodiscard]] cimom::ObjectManager& manager() noexcept { return *manager_; }

    [[nodiscard]] ClassLookup classes() override { return repository(); }
    [[nodiscard]] std::vector<ClassEntry> servedClasses() override;
    [[nodiscard]] bool mayServe(std::string_view className) const override;
    [[nodiscard]] std::optional<std::string> dataDir() const override;

    Response enumerateNames(const cimom::ObjectPath& path) override;
    Response enumerate(const cimom::ObjectPath& path) override;
    Response get(const cimom::ObjectPath& path) override;
    Response enumerateWith(const cimom::ObjectPath& path,
                           const std::vector<std::string>& properties) override;
    Response getWith(const cimom::ObjectPath& path,
                     const std::vector<std::string>& properties) override;
    Response modify(const cimom::Instance& instance,
                    const std::vector<std::string>& properties) override;
    Response associatorNames(const cimom::ObjectPath& path,
                             const cimom::AssociationRequest& request) override;
    Response associators(const cimom::ObjectPath& path,
                         const cimom::AssociationRequest& request) override;
    Response referenceNames(const cimom::ObjectPath& path,
                            const cimom::AssociationRequest& request) override;
    Response references(const cimom::ObjectPath& path,
                        const cimom::AssociationRequest& request) override;

    /// With notLoaded when the provider's library is the reason, else notDone.
    [[nodiscard]] Failure failure(const Response& response,
                                  const cimom::ObjectPath& asked) const override;

  private:
    std::unique_ptr<cimom::ObjectManager> manager_;  // never null
};

}  // namespace cimdhcp
