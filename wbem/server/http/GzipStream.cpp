#include "http/GzipStream.h"

// What is compressed is constant to zlib only if it is told so.
#define ZLIB_CONST
#include <zlib.h>

#include <array>
#include <atomic>
#include <new>
#include <utility>

namespace cimom::wbem {

namespace {

// The fastest level takes what counts, since objects of one class resemble each other. The
// window reaches over several of them.
constexpr int compressionLevel = 1;
constexpr int gzipWindow = 12 + 16;  // 16: with gzip's head and end around it
constexpr int compressionMemory = 6;

/// One of the streams that there may be.
class StreamSlot {
  public:
    StreamSlot() noexcept : taken_(used.fetch_add(1) < GzipStream::most) {}
    ~StreamSlot() { used.fetch_sub(1); }
    StreamSlot(const StreamSlot&) = delete;
    StreamSlot& operator=(const StreamSlot&) = delete;

    [[nodiscard]] bool taken() const noexcept { return taken_; }

  private:
    static inline std::atomic<int> used{0};
    bool taken_;
};

}  // namespace

struct GzipStream::State {
    StreamSlot slot;
    z_stream stream{};
    bool begun = false;

    State() = default;
    ~State() {
        if (begun) {
            // It only tells whether there was more to come.
            static_cast<void>(deflateEnd(&stream));
        }
    }
    State(const State&) = delete;
    State& operator=(const State&) = delete;
};

GzipStream::GzipStream(std::unique_ptr<State> state) noexcept : state_(std::move(state)) {}
GzipStream::~GzipStream() = default;

std::unique_ptr<GzipStream> GzipStream::begin() {
    auto state = std::make_unique<State>();
    if (!state->slot.taken()) {
        return nullptr;
    }
    state->begun = deflateInit2(&state->stream, compressionLevel, Z_DEFLATED, gzipWindow,
                                compressionMemory, Z_DEFAULT_STRATEGY) == Z_OK;
    return state->begun ? std::make_unique<GzipStream>(std::move(state)) : nullptr;
}

void GzipStream::add(std::string_view piece, bool last, std::string& out) {
    z_stream& stream = state_->stream;
    stream.next_in = reinterpret_cast<const Bytef*>(piece.data());
    stream.avail_in = static_cast<uInt>(piece.size());
    std::array<char, 16384> made;  // NOLINT(cppcoreguidelines-pro-type-member-init): written first
    do {
        stream.next_out = reinterpret_cast<Bytef*>(made.data());
        stream.avail_out = static_cast<uInt>(made.size());
        if (deflate(&stream, last ? Z_FINISH : Z_NO_FLUSH) == Z_STREAM_ERROR) {
            throw std::bad_alloc();
        }
        out.append(made.data(), made.size() - stream.avail_out);
    } while (stream.avail_out == 0);
}

}  // namespace cimom::wbem
