#pragma once

#include <array>
#include <vector>

#include "kit/Sanitizers.h"

namespace strict {

/// What some object managers do and others do not: a provider must bear each.
struct Traits {
    /// A path counts the keys that its class declares. Those that are not set come first,
    /// with the null state; asked for one of them by name, the path reads out of bounds.
    bool declaredKeys = false;
    /// `= NULL` in a MOF is no initialiser: a property that stays unset shows the default
    /// that the topmost superclass with one declares.
    bool parentsDefaults = false;
    /// An instance to modify shows those defaults for what the client did not send, unless
    /// it sent a property list.
    bool filledModifications = false;
    /// The response to GetInstance is the first instance that the provider hands over.
    bool firstInstance = false;
    /// The broker tells the version of the standard, where others tell 0.
    bool tellsItsVersion = false;
    /// Symbols are bound when they are used, not when a library is opened.
    bool lateBinding = false;
    /// Contexts have no entries.
    bool emptyContexts = false;
};

struct NamedTraits {
    const char* name;
    Traits traits;
    /// Whether providers are handed something else, and so run other code. The other
    /// traits show in what is made of a provider's results, or in what none of them reads.
    bool changesRequests = false;
};

/// A host without any of them, and one with each.
inline constexpr std::array namedTraits{
    NamedTraits{"Plain", {}, true},
    NamedTraits{"DeclaredKeys", {.declaredKeys = true}, true},
    NamedTraits{"ParentsDefaults", {.parentsDefaults = true}},
    NamedTraits{"FilledModifications", {.filledModifications = true}, true},
    NamedTraits{"FirstInstance", {.firstInstance = true}},
    NamedTraits{"TellsItsVersion", {.tellsItsVersion = true}},
    NamedTraits{"LateBinding", {.lateBinding = true}},
    NamedTraits{"EmptyContexts", {.emptyContexts = true}},
};

/// Those that the tests of this build try. A sanitizer looks at the code that runs and not
/// at what comes of it, and makes each test ten times as long: it is given each code once.
inline std::vector<NamedTraits> testedTraits() {
    std::vector<NamedTraits> tested;
    for (const NamedTraits& each : namedTraits) {
        if (each.changesRequests || !ZR::Testing::sanitized) {
            tested.push_back(each);
        }
    }
    return tested;
}

}  // namespace strict
