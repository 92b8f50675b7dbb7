#pragma once

#include <memory>
#include <string>
#include <vector>

#include "cimdhcp/Answer.h"
#include "cimdhcp/Directories.h"
#include "cimdhcp/Failure.h"
#include "cimom/ClassRepository.h"
#include "cimom/ObjectManager.h"

namespace cimdhcp {

/// The object manager of this process with the providers that are installed, and
/// the requests that the commands make of it.
class Client {
  public:
    /// Reads schema and registrations. Throws Failure with ExitStatus::notLoaded.
    Client(const Directories& directories, std::string nameSpace);

    [[nodiscard]] const cimom::ClassRepository& repository() const noexcept;
    [[nodiscard]] const std::vector<cimom::Registration>& registrations() const noexcept;

    [[nodiscard]] cimom::ObjectManager& manager() noexcept { return *manager_; }

    /// The namespace of paths that name none.
    [[nodiscard]] const std::string& nameSpace() const noexcept { return nameSpace_; }

    /// The path of a class in that namespace.
    [[nodiscard]] cimom::ObjectPath classPath(const std::string& className) const;

    Answer enumerateNames(const cimom::ObjectPath& path);
    Answer enumerate(const cimom::ObjectPath& path);
    Answer get(const cimom::ObjectPath& path);
    /// Changes the properties that the instance has, and no others.
    Answer modify(const cimom::Instance& instance);
    Answer associatorNames(const cimom::ObjectPath& path, const cimom::AssociationRequest& request);
    Answer associators(const cimom::ObjectPath& path, const cimom::AssociationRequest& request);
    Answer referenceNames(const cimom::ObjectPath& path, const cimom::AssociationRequest& request);
    Answer references(const cimom::ObjectPath& path, const cimom::AssociationRequest& request);

    /// What an answer that is not OK ends the program with: notLoaded when the
    /// provider's library is the reason, else notDone.
    [[nodiscard]] Failure failure(const Answer& answer, const cimom::ObjectPath& asked) const;

  private:
    std::string nameSpace_;
    std::unique_ptr<cimom::ObjectManager> manager_;  // never null
};

}  // namespace cimdhcp
