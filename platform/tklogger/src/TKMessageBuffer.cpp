#include "tklogger/TKMessageBuffer.h"

namespace TKLog {

TKMessageBuffer& TKMessageBuffer::writeAddress(std::uintptr_t address) {
    if (address == 0) {
        return *this << std::string_view("0");
    }
    std::array<char, 2 * sizeof address> digits{};
    const char* const end =
        std::to_chars(digits.data(), digits.data() + digits.size(), address, 16).ptr;
    return *this << std::string_view("0x") << std::string_view(digits.data(), end);
}

void TKMessageBuffer::spill(std::string_view text) {
    if (heap_.empty()) {
        heap_.assign(inline_.data(), size_);
    }
    heap_ += text;
}

}  // namespace TKLog
