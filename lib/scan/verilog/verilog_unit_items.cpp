// The declarations every scope may hold (parameters, typedefs, imports, functions), shared by
// units, packages and the compilation-unit scope.
#include "scan/verilog/verilog_unit_items.h"
#include "scan/verilog/verilog_parser.h"
#include "scan/verilog/verilog_text.h"

namespace scan::verilog {

namespace {

// A name as it must be written back: an escaped name needs the blank that ends it.
std::string nameText(std::string_view name) {
  std::string text(name);
  if (!text.empty() && text.front() == '\\') text += ' ';
  return text;
}

}  // namespace

void readImports(Parser& parser, Scope& scope, std::vector<std::string>* written) {
  TokenStream& tokens = parser.tokens();
  if (tokens.peek().kind == TokenKind::String) {  // DPI import
    parser.skipStatement();
    return;
  }
  std::string text = "import ";
  do {
    if (tokens.peek().kind != TokenKind::Identifier) {
      parser.fail("expected a package name after 'import'");
      return;
    }
    std::string package(tokens.take().text);
    if (!parser.expectSymbol("::")) return;
    if (text.size() > 7) text += ", ";
    text += nameText(package) + "::";
    if (tokens.acceptSymbol("*")) {
      scope.wildcardImports.push_back(package);
      text += '*';
    } else if (tokens.peek().kind == TokenKind::Identifier) {
      std::string name(tokens.take().text);
      text += nameText(name);
      scope.namedImports.emplace(std::move(name), package);
    } else {
      parser.fail("expected a name or '*' after '::'");
      return;
    }
  } while (tokens.acceptSymbol(","));
  if (parser.expectSymbol(";") && written) written->push_back(text + ";");
}

bool typeValue(Parser& parser, TypeSpec& type) {
  TokenStream& tokens = parser.tokens();
  if (parser.dataType(type)) return true;
  if (parser.failed() || tokens.peek().kind != TokenKind::Identifier ||
      classify(tokens.peek().text) != Word::None)
    return false;
  type.base = TypeSpec::Base::Named;
  type.name.assign(tokens.take().text);
  if (tokens.acceptSymbol("::")) {
    if (tokens.peek().kind != TokenKind::Identifier) return false;
    type.scope = type.name;
    type.name.assign(tokens.take().text);
  }
  type.written = type.name;
  parser.dimensions(type.packed);
  return !parser.failed();
}

void readParameters(Parser& parser, Scope& scope, bool local,
                    std::vector<ParameterDeclaration>* declared) {
  TokenStream& tokens = parser.tokens();
  std::shared_ptr<TypeSpec> type;
  std::string typeText;
  bool isType = false;
  for (;;) {
    Word word = tokens.peekWord();
    if (word == Word::Parameter || word == Word::Localparam) {
      tokens.take();
      local = word == Word::Localparam;
      type.reset();
      typeText.clear();
      isType = false;
    }
    Token typeStart = tokens.peek();
    if (tokens.acceptWord(Word::Type)) {
      isType = true;
      type.reset();
      typeText = "type";
    } else {
      TypeSpec written;
      if (parser.dataType(written)) {
        typeText = writtenBetween(typeStart, tokens.peek());
        if (typeText.empty()) typeText = written.written;
        type = std::make_shared<TypeSpec>(std::move(written));
        isType = false;
      }
    }
    if (parser.failed()) return;
    if (tokens.peek().kind != TokenKind::Identifier) {
      parser.fail("expected a parameter name");
      return;
    }
    Token nameToken = tokens.take();
    std::string name(nameToken.text);
    Parameter parameter;
    size_t firstNode = parser.arena().size();
    parser.dimensions(parameter.unpacked);
    parameter.type = type;
    parameter.isType = isType;
    std::string defaultText;
    if (tokens.acceptSymbol("=")) {
      Token valueStart = tokens.peek();
      if (isType) {
        auto value = std::make_shared<TypeSpec>();
        if (!typeValue(parser, *value)) {
          parser.fail("expected a type after '='");
          return;
        }
        parameter.typeValue = value;
        defaultText = writtenBetween(valueStart, tokens.peek());
        if (defaultText.empty()) defaultText = value->written;
      } else {
        parameter.value = parser.expression();
        if (parameter.value == kNoExpr) return;
        defaultText = writtenBetween(valueStart, tokens.peek());
      }
    }
    if (declared && !local)
      declared->push_back(
          {name, isType, typeText, std::move(defaultText), nameToken.source, nameToken.offset});
    // The first declaration of a name wins; the nodes of a later one are nobody's.
    if (!scope.parameters.emplace(std::move(name), std::move(parameter)).second)
      parser.arena().resize(firstNode);
    if (!tokens.acceptSymbol(",")) return;
  }
}

namespace {

void readTypedef(Parser& parser, Scope& scope) {
  TokenStream& tokens = parser.tokens();
  auto type = std::make_shared<TypeSpec>();
  if (!parser.dataType(*type) || tokens.peek().kind != TokenKind::Identifier) {
    parser.skipStatement();
    return;
  }
  std::string name(tokens.take().text);
  std::vector<Dimension> unpacked;
  parser.dimensions(unpacked);
  if (!parser.expectSymbol(";")) return;
  if (!unpacked.empty()) scope.unpackedTypedefs.insert(name);
  scope.typedefs.emplace(std::move(name), std::move(type));
}

}  // namespace

bool readScopeItem(Parser& parser, Scope& scope) {
  TokenStream& tokens = parser.tokens();
  switch (tokens.peekWord()) {
    case Word::Parameter:
    case Word::Localparam:
      readParameters(parser, scope);
      if (!parser.failed()) parser.expectSymbol(";");
      return true;
    case Word::Typedef:
      tokens.take();
      readTypedef(parser, scope);
      return true;
    case Word::Import:
      tokens.take();
      readImports(parser, scope);
      return true;
    case Word::Function:
      if (std::shared_ptr<Function> function = parser.function())
        scope.functions.emplace(function->name, function);
      return true;
    default:
      return false;
  }
}

}  // namespace scan::verilog
