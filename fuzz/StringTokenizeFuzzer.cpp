#include "include/StringTokenize.h"

#include <string>
#include <vector>

#include "Input.h"

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string text(fuzz::text(data, size));
    std::vector<std::string> tokens;
    ZR::stringTokenize(text, tokens, ",;");
    for (const std::string& token : tokens) {
        fuzz::require(!token.empty() && token.find_first_of(",;") == std::string::npos);
    }
    return 0;
}
