#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <span>
#include <string>
#include <string_view>
#include <vector>

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

/// Ends the run, with the input kept, when what must hold does not. `what` names it.
inline void require(bool holds, const char* what) {
    if (!holds) {
        static_cast<void>(std::fprintf(stderr, "does not hold: %s\n", what));
        std::abort();
    }
}

/// The parts of an input between the separators. There is one at least.
inline std::vector<std::string_view> fields(std::string_view text, char separator = '\0') {
    std::vector<std::string_view> parts;
    for (;;) {
        const std::size_t end = text.find(separator);
        parts.push_back(text.substr(0, end));
        if (end == std::string_view::npos) {
            return parts;
        }
        text.remove_prefix(end + 1);
    }
}

/// Takes an input apart from its beginning. At the end everything is zero or empty.
class Bytes {
  public:
    Bytes(const std::uint8_t* data, std::size_t size) : rest_(data, size) {}

    [[nodiscard]] bool empty() const noexcept { return rest_.empty(); }

    std::span<const std::uint8_t> take(std::size_t size) {
        const auto taken = rest_.first(size < rest_.size() ? size : rest_.size());
        rest_ = rest_.subspan(taken.size());
        return taken;
    }

    template <typename Number>
    Number number() {
        Number value{};
        const auto taken = take(sizeof value);
        if (!taken.empty()) {
            std::memcpy(&value, taken.data(), taken.size());
        }
        return value;
    }

  private:
    std::span<const std::uint8_t> rest_;
};

}  // namespace fuzz
