#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "mof/MofLexer.h"
#include "mof/MofSyntax.h"

namespace cimom {

/// Reads MOF declarations one by one. It checks the form alone; what a name
/// means is the business of the class repository.
class MofParser {
  public:
    /// `text` must outlive the parser; `file` is the name that errors give.
    MofParser(std::string_view text, std::string file);

    /// The next declaration, or none at the end of the text. Throws MofError.
    std::optional<MofDeclaration> next();

  private:
    MofToken take();
    bool takeSymbol(char symbol);
    void expectSymbol(char symbol, std::string_view after);
    MofToken expectName(std::string_view what);
    [[noreturn]] void failExpecting(std::string_view what) const;
    [[noreturn]] void fail(MofPosition position, const std::string& reason) const;

    MofPragma pragma();
    MofQualifierType qualifierType();
    std::vector<MofScope> scopes();
    MofClass classDeclaration(std::vector<MofQualifier> qualifiers);
    void feature(MofClass& declaration);
    MofMethod method(std::vector<MofQualifier> qualifiers, MofType type, const MofToken& name);
    MofElement element(std::vector<MofQualifier> qualifiers, MofType type, const MofToken& name);
    void arrayForm(MofElement& result);
    MofType type();
    Type dataType(std::string_view what);

    std::vector<MofQualifier> qualifierList();
    MofQualifier qualifier();
    void flavor(MofFlavors& flavors);
    MofInitializer initializer();
    MofLiteral literal();

    MofLexer lexer_;
    MofToken ahead_;
};

}  // namespace cimom
