#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <utility>

namespace cimom::wbem {

/// The body of a response, which is written piece by piece: the XML of a long
/// result is never held as a whole. Used by one thread at a time.
class ResponseBody {
  public:
    /// Appends the next piece; false, without appending, when there is none.
    using Items = std::function<bool(std::string&)>;

    /// A body that is at hand.
    explicit ResponseBody(std::string whole, unsigned status = 0)
        : head_(std::move(whole)), status_(status) {}
    ResponseBody(std::string head, Items items, std::string tail)
        : head_(std::move(head)), items_(std::move(items)), tail_(std::move(tail)) {}

    /// Appends to `out` until that has at least `size` bytes or the body ends.
    void write(std::string& out, std::size_t size);
    /// Whether the whole body has been written.
    [[nodiscard]] bool ended() const noexcept { return ended_; }
    /// The CIM status that the body tells.
    [[nodiscard]] unsigned status() const noexcept { return status_; }

  private:
    std::string head_;
    Items items_;
    std::string tail_;
    unsigned status_ = 0;
    bool begun_ = false;
    bool ended_ = false;
};

}  // namespace cimom::wbem
