#pragma once

#include <cmpidt.h>

#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Instance.h"

namespace cimom {

/// A request that a class of the object manager refuses: with a CIM status and a reason for
/// the client.
class RequestRefused : public std::runtime_error {
  public:
    RequestRefused(CMPIrc statusCode, const std::string& reason)
        : std::runtime_error(reason), code(statusCode) {}

    const CMPIrc code;
};

/// A class that the object manager serves itself, without a provider behind it (see
/// ObjectManager::serve). A class of associations needs no more than its instances: the
/// object manager finds out of their references what is associated.
///
/// Namespaces and class names come in their canonical spelling, key values in the types that
/// the class declares. Any thread calls, several at once. What a function throws fails the
/// request that it was called for: RequestRefused with its status, any other exception with
/// CMPI_RC_ERR_FAILED.
class OwnClass {
  public:
    /// Namespaces as the client is to see them, without a slash before or behind them.
    OwnClass(std::string className, std::vector<std::string> nameSpaces);
    virtual ~OwnClass();
    OwnClass(const OwnClass&) = delete;
    OwnClass& operator=(const OwnClass&) = delete;

    [[nodiscard]] const std::string& className() const noexcept { return className_; }
    [[nodiscard]] const std::vector<std::string>& nameSpaces() const noexcept {
        return nameSpaces_;
    }
    /// The declaration of a class that no schema has; empty where schemas have it.
    [[nodiscard]] virtual std::string_view declaration() const noexcept;

    /// All instances in one of the namespaces, with all keys in their paths; host and
    /// namespace may be left out there.
    [[nodiscard]] virtual std::vector<Instance> instances(const std::string& nameSpace) const = 0;
    /// The instance with that path, if there is one. Here: the first of instances() with
    /// these keys.
    [[nodiscard]] virtual std::optional<Instance> find(const ObjectPath& path) const;

    /// Makes an instance and gives its path, with all keys. Properties are known and of their
    /// types; the path of `instance` has the namespace and the class. Here: not supported.
    [[nodiscard]] virtual ObjectPath create(const Instance& instance, const std::string& principal);
    /// Changes properties of an instance; with a list, those that it names, where one that
    /// `instance` lacks means null. Here: not supported.
    virtual void modify(const Instance& instance,
                        const std::optional<std::vector<std::string>>& propertyList,
                        const std::string& principal);
    /// Ends an instance that there is. Here: not supported.
    virtual void remove(const ObjectPath& path, const std::string& principal);

  private:
    const std::string className_;
    const std::vector<std::string> nameSpaces_;
};

}  // namespace cimom
