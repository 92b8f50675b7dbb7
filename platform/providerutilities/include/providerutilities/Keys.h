#pragma once

#include <cmpift.h>

#include <cstddef>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

/// What a path names, read without asking it for a key by name: some object managers count
/// the keys that a class declares, and read out of bounds when one without a value is asked
/// for.
namespace ZR {

struct Key {
    std::string name;
    /// The value of a text key; empty for others.
    std::string text;
    /// The value of a reference key, which belongs to the path; null for others.
    const CMPIObjectPath* reference = nullptr;
    bool isText = false;
};

/// Names and values of text keys, to make a path with.
using KeyTexts = std::vector<std::pair<const char*, std::string>>;

/// The keys of a path that have a value, in its order.
class Keys {
  public:
    Keys() = default;
    /// A null path has none.
    explicit Keys(const CMPIObjectPath* path);

    [[nodiscard]] std::size_t size() const noexcept { return keys_.size(); }
    [[nodiscard]] auto begin() const noexcept { return keys_.begin(); }
    [[nodiscard]] auto end() const noexcept { return keys_.end(); }
    /// Null when there is no such key. Names compare without regard to case.
    [[nodiscard]] const Key* find(std::string_view name) const noexcept;
    /// The text of a key; empty when there is no such text key.
    [[nodiscard]] std::string_view text(std::string_view name) const noexcept;

    /// Whether the keys are the same: names without regard to case, in any order, texts
    /// exactly, references by what they name.
    [[nodiscard]] bool operator==(const Keys& other) const;

  private:
    std::vector<Key> keys_;
};

/// Empty for a null path, and where the host tells none.
[[nodiscard]] std::string classNameOf(const CMPIObjectPath* path);

/// Whether two paths name the same object. A path that tells no namespace names one of any.
[[nodiscard]] bool sameObject(const CMPIObjectPath* one, const CMPIObjectPath* other);

}  // namespace ZR
