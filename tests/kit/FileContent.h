#pragma once

#include <array>
#include <cstddef>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <string>
#include <string_view>

namespace ZR::Testing {

/// All bytes of a file. Throws when it cannot be read.
inline std::string readFile(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    std::string content;
    std::array<char, 4096> piece{};
    while (file.read(piece.data(), piece.size()) || file.gcount() > 0) {
        content.append(piece.data(), static_cast<std::size_t>(file.gcount()));
    }
    if (!file.is_open() || file.bad()) {
        throw std::runtime_error("cannot read " + path);
    }
    return content;
}

/// Makes or overwrites a file with exactly these bytes. Throws when it cannot.
inline void writeFile(const std::string& path, std::string_view content) {
    std::ofstream file(path, std::ios::binary | std::ios::trunc);
    file.write(content.data(), static_cast<std::streamsize>(content.size()));
    file.close();
    if (!file) {
        throw std::runtime_error("cannot write " + path);
    }
}

/// How many descriptors this process has open, with the one that it takes to count them.
inline std::ptrdiff_t openDescriptors() {
    const std::filesystem::directory_iterator all("/proc/self/fd");
    return std::distance(begin(all), end(all));
}

}  // namespace ZR::Testing
