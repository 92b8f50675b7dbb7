#pragma once

#include <cmpift.h>

#include <optional>
#include <string>
#include <vector>

#include "Classes.h"
#include "Collector.h"
#include "providerutilities/Keys.h"

namespace ZR::DHCPClientGateway {

/// What a request is made with. All of it belongs to the object manager.
struct Request {
    const CMPIBroker* broker = nullptr;
    const CMPIContext* context = nullptr;
    const CMPIResult* result = nullptr;
    const CMPIObjectPath* path = nullptr;  ///< what the client names
    std::string nameSpace;                 ///< that of the path
};

/// The provider behind the gateway; null before its factory was called. Factories may run
/// while requests do.
void useExactProvider(CMPIInstanceMI* provider) noexcept;

/// An object of a provider. It belongs to the object manager, and lives as long as the
/// request.
struct Object {
    const CMPIObjectPath* path = nullptr;    ///< never null
    const CMPIInstance* instance = nullptr;  ///< null where names are enough
    Keys keys;
};

/// Whether requests want names or whole instances.
enum class Form { names, instances };

/// Hands on what the exact provider has of a class, in its order, one after the other; with
/// keys at least what they name, and less than all where it narrows by one of them. Throws Refusal
/// when it refuses, and what `take` throws.
void askEach(const Request& request, const ServedClass& served, Form form,
             const KeyTexts& narrowing, Collector::Take take);

/// The same, all of it.
[[nodiscard]] std::vector<Object> ask(const Request& request, const ServedClass& served, Form form,
                                      const KeyTexts& narrowing = {});

/// What other providers have of a class. Nothing where the object manager knows no provider
/// for it, or the provider refuses.
[[nodiscard]] std::vector<Object> askOthers(const Request& request, const ServedClass& served,
                                            Form form);

/// The one object of another provider that has these keys, with its instance; none where it
/// does not exist, or the object manager knows no provider.
[[nodiscard]] std::optional<Object> askOthersFor(const Request& request, const ServedClass& served,
                                                 const KeyTexts& keys);

/// Writes a changed instance through the exact provider. Throws Refusal when it refuses.
void modify(const Request& request, const CMPIObjectPath* path, const CMPIInstance* instance);

/// A path in the request's namespace. Throws Refusal when the object manager makes none.
[[nodiscard]] CMPIObjectPath* makePath(const Request& request, const char* className,
                                       const KeyTexts& keys = {});

/// An instance without properties. Throws Refusal when the object manager makes none.
[[nodiscard]] CMPIInstance* makeInstance(const Request& request, const CMPIObjectPath* path);

}  // namespace ZR::DHCPClientGateway
