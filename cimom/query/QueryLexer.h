#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace cimom {

struct QueryToken {
    enum class Kind : std::uint8_t { name, integer, real, text, symbol, end };

    Kind kind = Kind::end;
    std::string text;       ///< of a text what stands between the quotes, escapes resolved
    std::size_t start = 0;  ///< in bytes

    /// Whether it is that keyword, in any case.
    [[nodiscard]] bool is(std::string_view keyword) const noexcept;
    [[nodiscard]] bool isSymbol(std::string_view symbol) const noexcept;
};

/// Splits the text of a query. Throws QueryError.
class QueryLexer {
  public:
    /// Borrows the text.
    explicit QueryLexer(std::string_view text) noexcept : text_(text) {}

    QueryToken next();

  private:
    QueryToken name();
    QueryToken number();
    QueryToken quoted();
    QueryToken symbol();
    void passDigits() noexcept;
    [[nodiscard]] char at(std::size_t offset) const noexcept;

    std::string_view text_;
    std::size_t position_ = 0;
};

/// Throws QueryError with CMPI_RC_ERR_INVALID_QUERY, which names the place (in bytes, from 1).
[[noreturn]] void failQuery(std::size_t position, const std::string& reason);

}  // namespace cimom
