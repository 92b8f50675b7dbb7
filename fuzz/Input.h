#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <span>
#include <string_view>

/// What the fuzz targets share. Each target file defines one function of libFuzzer's
/// interface, which is called with one input after the other.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

namespace fuzz {

inline std::string_view text(const std::uint8_t* data, std::size_t size) {
    return {reinterpret_cast<const char*>(data), size};
}

inline std::span<const std::byte> bytes(const std::uint8_t* data, std::size_t size) {
    return std::as_bytes(std::span(data, size));
}

/// Ends the run, with the input kept, when what must hold does not.
inline void require(bool holds) {
    if (!holds) {
        std::abort();
    }
}

}  // namespace fuzz
