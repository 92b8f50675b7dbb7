#include "formats/OptionWalk.h"

#include <algorithm>

namespace ZR::Live {

std::string_view OptionWalk::nextArgument() noexcept {
    if (arguments_.empty()) {
        return {};
    }
    const std::string_view argument = arguments_.front();
    arguments_ = arguments_.subspan(1);
    return argument;
}

bool OptionWalk::next(CommandOption& option) noexcept {
    option = {};
    if (letters_.empty()) {
        if (arguments_.empty()) {
            return false;
        }
        const std::string_view argument = nextArgument();
        if (operandsOnly_ || argument.size() < 2 || argument.front() != '-') {
            option.value = argument;
            return true;
        }
        if (argument == "--") {
            operandsOnly_ = true;
            return next(option);
        }
        if (argument.starts_with("--")) {
            const std::size_t equals = argument.find('=');
            option.longName = argument.substr(
                2, equals == std::string_view::npos ? std::string_view::npos : equals - 2);
            if (equals != std::string_view::npos) {
                option.value = argument.substr(equals + 1);
            } else if (std::find(longWithValue_.begin(), longWithValue_.end(), option.longName) !=
                       longWithValue_.end()) {
                option.value = nextArgument();
            }
            // "--=value" has neither a name nor a letter, and is not an operand either.
            option.letter = option.longName.empty() ? '-' : '\0';
            return true;
        }
        letters_ = argument.substr(1);
    }
    option.letter = letters_.front();
    letters_.remove_prefix(1);
    if (withValue_.find(option.letter) != std::string_view::npos) {
        option.value = letters_.empty() ? nextArgument() : letters_;
        letters_ = {};
    }
    return true;
}

}  // namespace ZR::Live
