// A list of delimiters, a zero byte, and the text to take apart by them.
#include "Lindows/DHCPSettingData.h"

#include "Input.h"

namespace {

std::vector<std::string> expected(std::string_view text, std::string_view delimiters) {
    std::vector<std::string> tokens;
    std::string token;
    for (const char letter : text) {
        if (delimiters.find(letter) == std::string_view::npos) {
            token += letter;
        } else if (!token.empty()) {
            tokens.push_back(token);
            token.clear();
        }
    }
    if (!token.empty()) {
        tokens.push_back(token);
    }
    return tokens;
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view input = fuzz::text(data, size);
    const std::size_t zero = input.find('\0');
    const std::string_view delimiters = input.substr(0, zero);
    const std::string_view text =
        zero == std::string_view::npos ? std::string_view{} : input.substr(zero + 1);
    std::vector<std::string> tokens{"was there"};
    ZR::stringTokenize(std::string(text), tokens, std::string(delimiters));
    fuzz::require(tokens.front() == "was there", "tokens are put behind those present");
    tokens.erase(tokens.begin());
    fuzz::require(tokens == expected(text, delimiters), "tokens are what delimiters leave");
    return 0;
}
