#pragma once

#include <cstddef>
#include <optional>
#include <utility>
#include <vector>

namespace cimom {

/// Gets the objects (paths or instances) of a result one after the other, while
/// providers hand them over: the whole of a result is held only by a receiver that
/// needs it. One thread at a time calls it. What it throws leaves the request, once
/// the provider has returned.
template <typename Object>
class ResultReceiver {
  public:
    ResultReceiver() = default;
    virtual ~ResultReceiver() = default;
    ResultReceiver(const ResultReceiver&) = delete;
    ResultReceiver& operator=(const ResultReceiver&) = delete;

    /// A call of a provider begins: a request may become several.
    virtual void beginCall() = 0;
    /// Absent: the provider handed over null.
    virtual void take(std::optional<Object> object) = 0;
    /// The call that began last has failed: what it brought does not count.
    virtual void dropCall() = 0;
};

/// Holds a whole result, for those who need it at once.
template <typename Object>
class CollectedObjects final : public ResultReceiver<Object> {
  public:
    void beginCall() override { call_ = objects.size(); }
    void take(std::optional<Object> object) override { objects.push_back(std::move(object)); }
    void dropCall() override {
        objects.erase(objects.begin() + static_cast<std::ptrdiff_t>(call_), objects.end());
    }

    std::vector<std::optional<Object>> objects;

  private:
    std::size_t call_ = 0;  ///< where the objects of the last call begin
};

}  // namespace cimom
