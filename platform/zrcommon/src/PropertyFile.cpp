#include "zrcommon/PropertyFile.h"

#include <algorithm>

#include "zrcommon/Strings.h"

namespace ZR {

std::vector<PropertyLine> parsePropertyLines(std::string_view text) {
    std::vector<PropertyLine> lines;
    for (unsigned number = 1; !text.empty(); ++number) {
        const std::size_t end = text.find('\n');
        const std::string_view line = trim(text.substr(0, end));
        text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
        if (line.empty() || line.front() == '#') {
            continue;
        }
        const std::size_t equals = line.find('=');
        const std::string_view key =
            equals == std::string_view::npos ? std::string_view{} : trim(line.substr(0, equals));
        if (key.empty()) {
            lines.push_back({"", std::string(line), number});
            continue;
        }
        std::string_view value = trim(line.substr(equals + 1));
        const bool quoted = value.size() >= 2 && value.front() == value.back() &&
                            (value.front() == '"' || value.front() == '\'');
        if (quoted) {
            value = value.substr(1, value.size() - 2);
        }
        lines.push_back({std::string(key), std::string(value), number});
    }
    return lines;
}

bool PropertyFile::open(int mode) {
    values_.clear();
    if (mode != readMode) {
        return false;
    }
    const auto content = File::read(path_.bytes());
    if (!content) {
        return false;
    }
    for (PropertyLine& line : parsePropertyLines(*content)) {
        values_.emplace_back(std::move(line.key), std::move(line.value));
    }
    return true;
}

std::wstring PropertyFile::getValue(const std::wstring& key) const {
    const std::string wanted = make_string(key);
    const auto found = std::find_if(values_.rbegin(), values_.rend(),
                                    [&wanted](const auto& pair) { return pair.first == wanted; });
    return found == values_.rend() || wanted.empty() ? std::wstring() : make_wstring(found->second);
}

}  // namespace ZR
