#pragma once

#include <array>
#include <cstddef>
#include <cstring>
#include <string>
#include <string_view>

#include "tklogger/TKMessageBuffer.h"

/// The vocabulary in which the provider tells the logging service what it does:
/// line formats, levels, and the marks that frame each request.
namespace ZR {

/// Levels of the lines.
inline constexpr int parameterLevel = 3000;  ///< entering and exiting lines with parameters
inline constexpr int flowLevel = 4000;       ///< all other flow and variable lines
inline constexpr int failureLevel = 6000;    ///< failures

/// The kinds of lines that trace and tracepara format. Any other value formats nothing.
enum MessageType : unsigned int {
    entering = 0,
    exiting = 1,
    method = 2,
    message = 3,
};

/// Size of each helper's text buffer; longer lines end after one character less.
inline constexpr std::size_t traceBufferSize = 512;

// Each of these formats one line into a buffer of its own, one per thread, and
// returns the buffer: the text is valid until the same helper is called again on
// the same thread. Numbers are written as signed decimals of 32 bits.

/// VARIABLE: 'variable' has Value 'value' at line N in file
const char* trace(const char* variable, const char* file, unsigned line, const char* value);
const char* trace(const char* variable, const char* file, unsigned line, unsigned value);

/// The entering, exiting or method line of a function; for `message`, the message
/// line with `function` standing where the message goes.
const char* trace(const char* file, const char* function, unsigned line, MessageType type);

/// The same with a list of parameters behind it.
const char* tracepara(const char* file, const char* function, unsigned line, const char* parameters,
                      MessageType type);

/// A line number with its digits, which are known when the program is compiled.
class LineNumber {
  public:
    // Every place that knows a line hands it over as the number that it is.
    // NOLINTNEXTLINE(google-explicit-constructor,hicpp-explicit-conversions)
    constexpr LineNumber(unsigned number) noexcept : number_(number) {
        const bool negative = static_cast<int>(number) < 0;
        std::size_t begin = digits_.size();
        for (unsigned rest = negative ? 0 - number : number; begin == digits_.size() || rest != 0;
             rest /= 10) {
            digits_[--begin] = static_cast<char>('0' + rest % 10);
        }
        if (negative) {
            digits_[--begin] = '-';
        }
        begin_ = static_cast<unsigned char>(begin);
    }

    [[nodiscard]] constexpr unsigned number() const noexcept { return number_; }
    /// As a signed decimal of 32 bits.
    [[nodiscard]] constexpr std::string_view digits() const noexcept {
        return {digits_.data() + begin_, digits_.size() - begin_};
    }

  private:
    unsigned number_;
    std::array<char, 11> digits_{};
    unsigned char begin_ = 0;
};

/// The same texts for callers that know their lengths; they share the helpers' buffers.
namespace TraceText {

/// The text of one helper. Behind it the buffer is all zero, so that zeroing it for a new
/// text means zeroing what of the old one is longer.
class Buffer {
  public:
    [[nodiscard]] std::string_view text() const noexcept { return {text_.data(), size_}; }

    /// Makes the pieces, one behind the other, the whole content, up to the last byte, which
    /// stays zero. None may be of this buffer.
    template <typename... Pieces>
    void set(const Pieces&... pieces) noexcept {
        std::size_t size = 0;
        (put(size, pieces), ...);
        if (size < size_) {
            std::memset(text_.data() + size, 0, size_ - size);
        }
        size_ = size;
    }

  private:
    void put(std::size_t& size, std::string_view piece) noexcept {
        const std::size_t room = text_.size() - 1 - size;
        // The usual case apart: the size of a literal is then known to the compiler.
        if (piece.size() <= room) [[likely]] {
            TKLog::copyPiece(text_.data() + size, piece.data(), piece.size());
            size += piece.size();
        } else {
            size += piece.copy(text_.data() + size, room);
        }
    }

    std::array<char, traceBufferSize> text_;
    std::size_t size_;
};

/// A text that may be null, which is written as formatted printing writes it.
inline std::string_view of(const char* text) {
    return text == nullptr ? "(null)" : text;
}

/// What the entering and the exiting line of a function have in common, up to the value of its
/// parameters if it has any.
void describe(TKLog::TKMessageBuffer& rest, std::string_view file, std::string_view function,
              const LineNumber& line);
void describeWithParameters(TKLog::TKMessageBuffer& rest, std::string_view file,
                            std::string_view function, const LineNumber& line);

// Each fills the buffer of one of the helpers above, and gives it.

/// `rest` as the two above make it; `type` is entering or exiting.
Buffer& plain(MessageType type, std::string_view rest);
Buffer& withParameters(MessageType type, std::string_view rest);

Buffer& invoked(std::string_view file, std::string_view function, const LineNumber& line);
Buffer& failure(std::string_view file, const LineNumber& line, std::string_view text);
Buffer& variable(std::string_view name, std::string_view file, const LineNumber& line,
                 std::string_view value);
Buffer& variable(std::string_view name, std::string_view file, const LineNumber& line,
                 unsigned value);

}  // namespace TraceText

/// Frame a request: a separator and the entering line; the exiting line and a
/// separator. Their source location is that of the mark itself.
void markProviderEntry(const std::string& logger, const char* file, const char* function,
                       unsigned line);
void markProviderExit(const std::string& logger, const char* file, const char* function,
                      unsigned line);

}  // namespace ZR
