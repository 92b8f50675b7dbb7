#pragma once

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

namespace ZR {

/// An ordered list of key names and values that names one object of the
/// instrumentation. Keys are read one at a time: selectKey, then getName and
/// getValue of the key selected.
class Moniker {
  public:
    /// Adds a key behind those present, even if one of that name is there.
    void addKey(std::string name, const std::string& value);

    [[nodiscard]] std::size_t getKeyCount() const noexcept { return keys_.size(); }

    /// Selects the key at a position from 0. False, with the selection left as it
    /// was, when there is none.
    bool selectKey(std::size_t position) noexcept;

    /// Name and value of the selected key; false, with the output left as it was,
    /// when none is selected.
    bool getName(std::string& name) const;
    bool getValue(std::string& value) const;

    /// Equal keys in equal order; what is selected does not matter.
    bool operator==(const Moniker& other) const noexcept { return keys_ == other.keys_; }

  private:
    std::vector<std::pair<std::string, std::string>> keys_;
    std::size_t selected_ = static_cast<std::size_t>(-1);
};

}  // namespace ZR
