#include "zrclient/Moniker.h"

namespace ZR {

void Moniker::addKey(std::string name, const std::string& value) {
    keys_.emplace_back(std::move(name), value);
}

bool Moniker::selectKey(std::size_t position) noexcept {
    if (position >= keys_.size()) {
        return false;
    }
    selected_ = position;
    return true;
}

bool Moniker::getName(std::string& name) const {
    if (selected_ >= keys_.size()) {
        return false;
    }
    name = keys_[selected_].first;
    return true;
}

bool Moniker::getValue(std::string& value) const {
    if (selected_ >= keys_.size()) {
        return false;
    }
    value = keys_[selected_].second;
    return true;
}

}  // namespace ZR
