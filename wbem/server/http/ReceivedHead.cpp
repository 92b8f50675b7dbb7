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
/// to, and four behind the last one. A line that continues the one before is copied
/// elsewhere, and fails the same way: RFC 9112, 5.2, has it refused. What cannot be seen stands
/// at the very end: a header with neither name nor value, behind which the library takes the
/// rest for the body, and null bytes at the end of the last value.
class LineEnds {
  public:
    explicit LineEnds(const char* version)
        : visible_(!libraryRefuses()), end_(version + std::strlen(version)) {}

    void expect(const char* name, const char* value) {
        constexpr std::size_t lineEnd = 2;
        right_ = right_ && addressOf(name) == addressOf(end_) + lineEnd;
        end_ = value + std::strlen(value);
    }

    [[nodiscard]] bool right() const {
        // The last header and the empty line behind it. The library has read at least two
        // bytes there, and its memory of a connection goes on for longer than a head may be.
        constexpr std::size_t headEnd = 4;
        return !visible_ || (right_ && std::memcmp(end_, "\0\0\0\0", headEnd) == 0);
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
    head.ambiguous = head.ambiguous || !ends.right();
    // A query would have been taken off the target.
    if (MHD_get_connection_values(connection, MHD_GET_ARGUMENT_KIND, nullptr, nullptr) > 0) {
        head.target += '?';
    }
    return head;
}

}  // namespace cimom::wbem
