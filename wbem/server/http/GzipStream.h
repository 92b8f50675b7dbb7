#pragma once

#include <memory>
#include <string>
#include <string_view>

namespace cimom::wbem {

/// Compresses one text piece by piece (RFC 1952). Used by one thread at a time.
///
/// One stream takes some 50 KiB; there is a fixed number of them in the process at a time.
class GzipStream {
    struct State;

  public:
    /// Null when all streams are in use, or there is no memory: the text then has to be sent
    /// as it is.
    [[nodiscard]] static std::unique_ptr<GzipStream> begin();
    explicit GzipStream(std::unique_ptr<State> state) noexcept;
    ~GzipStream();
    GzipStream(const GzipStream&) = delete;
    GzipStream& operator=(const GzipStream&) = delete;

    /// Appends to `out` what has come of the pieces so far, which may be nothing; after the
    /// `last` piece everything. Throws std::bad_alloc.
    void add(std::string_view piece, bool last, std::string& out);

    /// How many streams there may be at a time.
    static constexpr int most = 32;

  private:
    std::unique_ptr<State> state_;
};

}  // namespace cimom::wbem
