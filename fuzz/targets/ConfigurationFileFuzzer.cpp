// Key, value and content of an interface's configuration file, with zero bytes
// between. What becomes of the file is told by a model that goes byte by byte.
#include "Lindows/ConfigurationFile.h"
#include "Lindows/DHCPSettingData.h"

#include "Input.h"
#include "support/FuzzMachine.h"
#include "support/MemoryFile.h"

namespace {

bool occurs(const std::string& key, const std::string& piece) {
    for (std::size_t start = 0; start + key.size() <= piece.size(); ++start) {
        std::size_t same = 0;
        while (same < key.size() && piece[start + same] == key[same] &&
               piece[start + same] != '\0') {
            ++same;
        }
        if (same == key.size()) {
            return true;
        }
        if (start < piece.size() && piece[start] == '\0') {
            return false;
        }
    }
    return false;
}

/// The content after the change: each line, or each 511 bytes of a longer one, that has
/// the key in front of its first zero byte is replaced, and every other byte kept.
std::string expected(std::string_view content, const std::string& key, const std::string& value) {
    for (const char letter : value) {
        if (letter == '\n' || letter == '\r' || letter == '\0') {
            return std::string(content);
        }
    }
    constexpr std::size_t longest = 511;
    std::string result;
    std::string piece;
    bool found = false;
    for (std::size_t at = 0; at < content.size(); ++at) {
        piece += content[at];
        if (content[at] == '\n' || piece.size() == longest || at + 1 == content.size()) {
            if (occurs(key, piece)) {
                found = true;
                piece = key + '=' + value + '\n';
            }
            result += piece;
            piece.clear();
        }
    }
    return found ? result : result + key + '=' + value + '\n';
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const bool silent = (fuzz::silence(), true);
    static const fuzz::MemoryFile file;
    static_cast<void>(silent);
    const std::string_view input = fuzz::text(data, size);
    const auto parts = fuzz::fields(input);
    if (parts.size() < 3) {
        return 0;
    }
    const std::string key(parts[0]);
    // A value with a zero byte, which must change nothing, is written as \0 here.
    std::string value(parts[1]);
    if (const std::size_t escape = value.find("\\0"); escape != std::string::npos) {
        value.replace(escape, 2, 1, '\0');
    }
    const std::string_view content = input.substr(parts[0].size() + parts[1].size() + 2);
    file.put(content);
    ZR::DHCPClientProvider::modifyValue(file.path(), key, value);
    fuzz::require(file.content() == expected(content, key, value),
                  "one setting changes and every other byte is kept");

    const std::string path = ZR::DHCPClientProvider::configurationFilePath("/directory/", key);
    fuzz::require(path.empty() || (path == "/directory/ifcfg-" + key &&
                                   path.find('/', sizeof "/directory") == std::string::npos),
                  "a file is in its directory");
    return 0;
}
