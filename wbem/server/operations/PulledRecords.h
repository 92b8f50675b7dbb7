#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "operations/Spool.h"

/// The objects of an enumeration in a spool, each as a record of its path and, of an
/// instance, the instance: a client may pull the one with or without the other.
namespace cimom::wbem {

/// Appends a record.
void appendRecord(std::string& out, std::string_view path, std::string_view object);

struct PulledRecord {
    std::string path;
    std::string object;

    bool operator==(const PulledRecord&) const = default;
};

/// Reads records in their order.
class RecordReader {
  public:
    /// From the record that begins at `position` to `end`.
    RecordReader(std::shared_ptr<const Spool> spool, std::size_t position, std::size_t end)
        : spool_(std::move(spool)), position_(position), end_(end) {}

    /// Nothing at the end.
    std::optional<PulledRecord> next();
    /// Passes over so many records, which must be there.
    void skip(std::size_t count);
    [[nodiscard]] std::size_t position() const noexcept { return position_; }

  private:
    struct Sizes {
        std::size_t path;
        std::size_t object;
    };
    [[nodiscard]] Sizes sizes() const;

    std::shared_ptr<const Spool> spool_;
    std::size_t position_;
    std::size_t end_;
};

}  // namespace cimom::wbem
