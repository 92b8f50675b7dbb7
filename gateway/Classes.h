#pragma once

#include <cmpidt.h>

#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

/// The classes that requests are about, as a table: what is their own, what object managers
/// may or may not tell a provider of them.
namespace ZR::DHCPClientGateway {

/// How often the provider behind the gateway sets a property.
enum class Presence { always, sometimes, never };

/// A property that a class declares, its keys included.
struct Property {
    const char* name;
    CMPIType type;
    Presence presence;
    /// The default that the first of the standard classes with this property declares. Some
    /// object managers show it for a property that is not set, and send it for one that a
    /// client did not name.
    std::optional<std::uint16_t> standardDefault = std::nullopt;
};

/// Who has the instances of a class.
enum class Server {
    exact,      ///< the provider behind the gateway
    otherwise,  ///< another provider, which the object manager knows
    gateway     ///< no provider: associations follow from what they associate
};

/// A class. Of static lifetime, as is all that it refers to.
struct ServedClass {
    const char* name;
    std::span<const char* const> ancestors;  ///< nearest first
    std::span<const char* const> keys;
    Server server;
    std::span<const Property> properties;  ///< empty for those of other providers
    /// The key by which the exact provider is asked for one object; null: for all of them. When a
    /// path has this key, it gives just what the path names, or more, and not anything else. It
    /// compares each further key with every object that it has.
    const char* narrowsBy = nullptr;
    /// The property that a client can change; null: none.
    const char* writable = nullptr;
};

/// All of them: those at the ends of associations, and the associations.
[[nodiscard]] std::span<const ServedClass> allClasses() noexcept;

/// Null for any other class. Names compare without regard to case.
[[nodiscard]] const ServedClass* findClass(std::string_view name) noexcept;

/// Whether the table says that a class is another one or derives from it.
[[nodiscard]] bool derivesFrom(const ServedClass& served, std::string_view name) noexcept;

}  // namespace ZR::DHCPClientGateway
