#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <filesystem>
#include <functional>
#include <string>
#include <string_view>

#include "zrcommon/UniqueFd.h"

namespace cimom::wbem {

/// The indications that wait for one destination, the oldest first, each with a number. They
/// are in memory and in a file to which lines are only added, so that a killed process leaves
/// what it had not delivered; the file is written anew when most of it is history.
///
/// What an earlier process left gets new numbers, from 0 on: the process that numbered it is
/// gone, and with it the context of its numbers. To be used by one thread at a time.
class IndicationQueue {
  public:
    /// Gets a line about each file that does not work as it should.
    using Log = std::function<void(const std::string& line)>;
    struct Bounds {
        std::size_t count = 1000;
        std::size_t bytes = 4U << 20U;
    };
    struct Entry {
        std::uint64_t id = 0;  ///< within the file
        std::int64_t number = 0;
        std::string text;
    };

    /// Reads the file if there is one; one that cannot be read is kept as FILE.bad. A queue
    /// whose file cannot be written works without it, as does one without the name of a file.
    IndicationQueue(std::filesystem::path file, Bounds bounds, Log log);

    /// Adds an indication, for which the oldest ones may have to go, but not the first if it
    /// is `held`. The number of those that went, the new one among them if it is too large.
    std::size_t push(std::string text, bool held);
    /// Null when the queue is empty.
    [[nodiscard]] const Entry* front() const noexcept;
    /// The oldest one is done with.
    void pop();
    [[nodiscard]] std::size_t size() const noexcept { return entries_.size(); }

    /// Ends the queue and its file. The number of those that waited.
    std::size_t discard();

  private:
    void load();
    void read(std::string_view content);
    void note(std::string_view line);
    void writeAnew();
    void erase(std::size_t index);
    void fail(const std::string& reason);

    const std::filesystem::path file_;
    const Bounds bounds_;
    const Log log_;
    ZR::UniqueFd fd_;
    std::deque<Entry> entries_;
    std::size_t bytes_ = 0;    ///< of the texts
    std::size_t written_ = 0;  ///< bytes of the file
    std::uint64_t nextId_ = 0;
    std::int64_t nextNumber_ = 0;
    bool failed_ = false;
    std::chrono::steady_clock::time_point nextTry_{};
};

}  // namespace cimom::wbem
