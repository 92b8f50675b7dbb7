#pragma once

#include <cstddef>
#include <cstdint>
#include <set>

namespace ZR::Live {

/// Which links, by index, may no longer be as they were read: they or their addresses.
struct NetworkChanges {
    /// More are not told apart.
    static constexpr std::size_t most = 1024;

    bool all = true;  ///< it is not known which
    std::set<std::uint32_t> links{};

    /// Adds a link.
    void add(std::uint32_t ifindex) {
        if (!all && links.insert(ifindex).second && links.size() > most) {
            addAll();
        }
    }

    void addAll() {
        all = true;
        links.clear();
    }
};

}  // namespace ZR::Live
