#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "cimom/Names.h"
#include "mof/MofSyntax.h"

namespace cimom {

enum class MofTokenKind : std::uint8_t {
    end,
    identifier,
    string,
    character,
    integer,
    real,
    symbol,  ///< one character of #(){}[];:,=$
};

struct MofToken {
    MofTokenKind kind = MofTokenKind::end;
    std::string_view text;  ///< as written; lives as long as the text read
    MofConstant value;      ///< of strings, characters, integers and reals
    MofPosition position;

    [[nodiscard]] bool isSymbol(char symbol) const noexcept {
        return kind == MofTokenKind::symbol && text.front() == symbol;
    }
    /// Keywords compare without regard to case.
    [[nodiscard]] bool isWord(std::string_view word) const noexcept {
        return kind == MofTokenKind::identifier && sameName(text, word);
    }
};

/// Cuts MOF text into tokens; white space and comments lie between them.
class MofLexer {
  public:
    /// `text` must outlive the lexer and its tokens; `file` is the name that errors give.
    MofLexer(std::string_view text, std::string file);

    /// The next token; `end` for ever after the last. Throws MofError.
    MofToken next();

    [[nodiscard]] const std::string& file() const noexcept { return file_; }

  private:
    [[nodiscard]] char peek(std::size_t ahead = 0) const noexcept;
    [[nodiscard]] MofPosition here() const noexcept;
    void skipBlanks();
    void skipBlockComment();
    MofToken identifier();
    MofToken number();
    MofToken string();
    MofToken character();
    /// One character of a string or character literal in UTF-8, escapes resolved.
    void appendLiteralCharacter(std::string& content, std::string_view literal, MofPosition start);
    void appendEscape(std::string& content);
    char32_t hexadecimalEscape(MofPosition start);
    [[noreturn]] void fail(MofPosition position, const std::string& reason) const;

    std::string_view text_;
    std::string file_;
    std::size_t offset_ = 0;
    std::size_t line_ = 1;
    std::size_t lineStart_ = 0;
};

}  // namespace cimom
