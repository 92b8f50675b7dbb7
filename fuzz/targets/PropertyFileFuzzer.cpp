// A file of KEY=value lines, against a reader of its own that goes byte by byte.
#include "zrcommon/PropertyFile.h"

#include <map>

#include "Input.h"
#include "support/MemoryFile.h"
#include "zrcommon/Strings.h"

namespace {

bool isBlank(char letter) {
    return letter == ' ' || letter == '\t' || letter == '\r';
}

std::string stripped(std::string text) {
    while (!text.empty() && isBlank(text.back())) {
        text.pop_back();
    }
    std::size_t first = 0;
    while (first < text.size() && isBlank(text[first])) {
        ++first;
    }
    return text.substr(first);
}

void take(const std::string& whole, unsigned number, std::vector<ZR::PropertyLine>& lines) {
    const std::string line = stripped(whole);
    if (line.empty() || line[0] == '#') {
        return;
    }
    std::string key;
    std::size_t at = 0;
    while (at < line.size() && line[at] != '=') {
        key += line[at++];
    }
    key = stripped(key);
    if (at == line.size() || key.empty()) {
        lines.push_back({"", line, number});
        return;
    }
    std::string value = stripped(line.substr(at + 1));
    const std::size_t last = value.empty() ? 0 : value.size() - 1;
    if (last > 0 && value[0] == value[last] && (value[0] == '"' || value[0] == '\'')) {
        value = value.substr(1, last - 1);
    }
    lines.push_back({key, value, number});
}

std::vector<ZR::PropertyLine> expected(std::string_view text) {
    std::vector<ZR::PropertyLine> lines;
    std::string line;
    unsigned number = 1;
    for (const char letter : text) {
        if (letter == '\n') {
            take(line, number++, lines);
            line.clear();
        } else {
            line += letter;
        }
    }
    take(line, number, lines);
    return lines;
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text = fuzz::text(data, size);
    const auto lines = ZR::parsePropertyLines(text);
    fuzz::require(lines == expected(text), "the lines are those of the text");
    fuzz::require(ZR::make_string(ZR::make_wstring(text)) == text,
                  "any bytes survive being wide text");

    static const fuzz::MemoryFile memory;
    memory.put(text);
    ZR::PropertyFile file{ZR::File::Path{memory.path()}};
    fuzz::require(file.open(ZR::PropertyFile::readMode), "a file can be opened");
    std::map<std::string, std::string> last;
    for (const ZR::PropertyLine& line : lines) {
        last[line.key] = line.key.empty() ? "" : line.value;
    }
    for (const auto& [key, value] : last) {
        fuzz::require(ZR::make_string(file.getValue(ZR::make_wstring(key))) == value,
                      "the last of equal keys counts");
    }
    return 0;
}
