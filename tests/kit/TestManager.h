#pragma once

#include <dlfcn.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "cimom/Instance.h"
#include "cimom/ObjectManager.h"
#include "cimom/ObjectPathText.h"
#include "cimom/Results.h"

namespace cimom::test {

inline Configuration configuration(const std::string& registrations) {
    const std::filesystem::path here = BROKER_TEST_DIR;
    return {{here / "schema"}, {here / registrations}, {BROKER_PROVIDER_DIR}, "testhost"};
}

inline constexpr const char* testLibrary = BROKER_PROVIDER_DIR "/libTestProvider.so";

/// An open library; empty when it could not be opened.
using Library = std::unique_ptr<void, int (*)(void*)>;

/// The library of the well-behaved providers; `flags` as dlopen takes them.
inline Library openTestLibrary(int flags) {
    return {dlopen(testLibrary, flags), dlclose};
}

/// Calls one of the library's functions that tell about it.
template <typename Fact>
Fact ask(const Library& library, const char* function) {
    return reinterpret_cast<Fact (*)()>(dlsym(library.get(), function))();
}

/// An object manager with the well-behaved test providers.
class TestManager : public testing::Test {
  protected:
    TestManager() { takeLog(); }

    ObjectManager manager{configuration("test.reg")};

    static ObjectPath path(const std::string& text) { return parseObjectPath("root/test:" + text); }

    /// The calls that the test provider got since the last time.
    static std::string takeLog() {
        const Library library = openTestLibrary(RTLD_NOW | RTLD_NOLOAD);
        return library ? ask<const char*>(library, "testTakeLog") : "not loaded";
    }
};

/// The texts of paths, without the namespace; "absent" for an absent one.
inline std::vector<std::string> names(const std::vector<std::optional<ObjectPath>>& paths) {
    std::vector<std::string> texts;
    for (const auto& path : paths) {
        if (path) {
            const std::string text = toText(*path);
            texts.push_back(text.substr(text.find(':') + 1));
        } else {
            texts.emplace_back("absent");
        }
    }
    return texts;
}

inline std::vector<std::string> names(const std::vector<std::optional<Instance>>& instances) {
    std::vector<std::optional<ObjectPath>> paths;
    for (const auto& instance : instances) {
        paths.push_back(instance ? std::optional(instance->path) : std::nullopt);
    }
    return names(paths);
}

/// The scalar of a value that must be there; fails the test otherwise.
inline const Scalar& scalarOf(const Value* value) {
    if (value == nullptr || value->scalar() == nullptr) {
        throw std::runtime_error("no such value, or no scalar");
    }
    return std::get<Scalar>(value->content);
}

inline std::string textOf(const Value* value) {
    const auto* const text = std::get_if<std::string>(&scalarOf(value));
    return text == nullptr ? "no text" : *text;
}

inline std::string textOf(const Instance& instance, const std::string& property) {
    return textOf(instance.property(property));
}

inline const ObjectPath& referenceOf(const Value* value) {
    return *std::get<std::shared_ptr<const ObjectPath>>(scalarOf(value));
}

}  // namespace cimom::test
