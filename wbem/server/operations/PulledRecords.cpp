#include "operations/PulledRecords.h"

#include <array>
#include <cstddef>
#include <cstring>

namespace cimom::wbem {

namespace {

// Only the process that writes a record reads it.
using Header = std::array<std::size_t, 2>;

}  // namespace

void appendRecord(std::string& out, std::string_view path, std::string_view object) {
    const Header header{path.size(), object.size()};
    std::array<char, sizeof header> bytes{};
    std::memcpy(bytes.data(), header.data(), bytes.size());
    out.append(bytes.data(), bytes.size());
    out.append(path);
    out.append(object);
}

RecordReader::Sizes RecordReader::sizes() const {
    Header header{};
    std::string bytes;
    spool_->read(position_, sizeof header, bytes);
    std::memcpy(header.data(), bytes.data(), sizeof header);
    return {header[0], header[1]};
}

std::optional<PulledRecord> RecordReader::next() {
    if (position_ >= end_) {
        return std::nullopt;
    }
    const Sizes size = sizes();
    position_ += sizeof(Header);
    PulledRecord record;
    spool_->read(position_, size.path, record.path);
    spool_->read(position_ + size.path, size.object, record.object);
    position_ += size.path + size.object;
    return record;
}

void RecordReader::skip(std::size_t count) {
    for (; count > 0; --count) {
        const Sizes size = sizes();
        position_ += sizeof(Header) + size.path + size.object;
    }
}

}  // namespace cimom::wbem
