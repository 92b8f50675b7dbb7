#include "include/StringTokenize.h"

namespace ZR {

void stringTokenize(const std::string& text, std::vector<std::string>& tokens,
                    const std::string& delimiters) {
    std::size_t start = text.find_first_not_of(delimiters);
    while (start != std::string::npos) {
        const std::size_t end = text.find_first_of(delimiters, start);
        tokens.push_back(text.substr(start, end - start));
        start = text.find_first_not_of(delimiters, end);
    }
}

}  // namespace ZR
