#include "http/ReceivedHead.h"

#include <cstdint>
#include <cstring>
#include <string_view>

namespace cimom::wbem {

namespace {

/// Whether the library is of version 1.0 or later, and refuses ambiguous heads by itself if it
/// is told to be strict.
bool libraryRefuses() noexcept {
    return !std::string_view(MHD_get_version()).starts_with("0.");
}

/// Looks at the bytes between the texts of a head.
///
/// Up to its version 1.0, which refuses all of this by itself, the library ends a line at
/// CR LF and at a bare LF alike, a value at its first null byte, and a head at a header
/// without a name, and tells none of it. It hands out pointers into the bytes as they have
/// arrived, decrypted, with null bytes over the ends of lines. So there are two null bytes
/// from the end of one text to the beginning of the next one if the line has ended as it has
/// to, and four from the last one to the end of the head, whose length the library tells. A line
/// that continues the one before is copied elsewhere, and fails the same way: RFC 9112, 5.2, has
/// it refused. What cannot be seen is a null byte in place of the carriage return before a line
/// feed.
class LineEnds {
  public:
    /// `version` is the last text of the request line.
    explicit LineEnds(const char* version)
        : visible_(!libraryRefuses()), end_(version + std::strlen(version)) {}

    void expect(const char* name, const char* value) {
        constexpr std::size_t lineEnd = 2;
        right_ = right_ && addressOf(name) == addressOf(end_) + lineEnd;
        end_ = value + std::strlen(value);
    }

    /// Whether the head ends as it has to, too; it goes from `begin` for `size` bytes.
    [[nodiscard]] bool right(const char* begin, std::size_t size) const {
        // The end of the last line, and the empty line behind it.
        constexpr std::size_t headEnd = 4;
        return !visible_ || (right_ && addressOf(end_) + headEnd == addressOf(begin) + size &&
                             std::memcmp(end_, "\0\0\0\0", headEnd) == 0);
    }

  private:
    static std::uintptr_t addressOf(const char* text) noexcept {
        return reinterpret_cast<std::uintptr_t>(text);
    }

    bool visible_;
    bool right_ = true;
    const char* end_;
};

struct Reading {
    HttpHead& head;
    LineEnds& ends;
};

MHD_Result addHeader(void* self, MHD_ValueKind /*kind*/, const char* name, const char* value) {
    const Reading& reading = *static_cast<Reading*>(self);
    reading.head.headers.emplace_back(name == nullptr ? "" : name, value == nullptr ? "" : value);
    if (name == nullptr || value == nullptr) {
        reading.head.ambiguous = true;
    } else {
        reading.ends.expect(name, value);
    }
    return MHD_YES;
}

}  // namespace

int libraryStrictness() noexcept {
    return libraryRefuses() ? 1 : 0;
}

HttpHead receivedHead(MHD_Connection* connection, const char* target, const char* method,
                      const char* version) {
    HttpHead head{method, target, version, {}};
    LineEnds ends(version);
    Reading reading{head, ends};
    MHD_get_connection_values(connection, MHD_HEADER_KIND, addHeader, &reading);
    const MHD_ConnectionInfo* const size =
        MHD_get_connection_info(connection, MHD_CONNECTION_INFO_REQUEST_HEADER_SIZE);
    head.ambiguous = head.ambiguous || size == nullptr || !ends.right(method, size->header_size);
    // A query would have been taken off the target.
    if (MHD_get_connection_values(connection, MHD_GET_ARGUMENT_KIND, nullptr, nullptr) > 0) {
        head.target += '?';
    }
    return head;
}

}  // namespace cimom::wbem
