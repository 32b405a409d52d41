// Data types: built-in, user-defined and struct/union/enum types with their packed
// dimensions, as parameters, ports and typedefs declare them.
#include "scan/verilog/verilog_parser.h"

#include "scan/verilog/verilog_parser_support.h"

namespace scan::verilog {
namespace {

int atomWidth(std::string_view word) {
  if (word == "byte") return 8;
  if (word == "shortint") return 16;
  if (word == "longint" || word == "time") return 64;
  return 32;
}

}  // namespace

void Parser::dimensions(std::vector<Dimension>& dims) {
  while (!m_Failed && m_Tokens.peek().isSymbol("[")) {
    m_Tokens.take();
    Dimension dim;
    if (m_Tokens.peek().isSymbol("]") || m_Tokens.peek().isSymbol("$") ||
        m_Tokens.peek().isSymbol("*")) {
      skipStatement();  // dynamic or associative: no bits to count
      fail("unsupported dimension");
      return;
    }
    dim.left = expression();
    if (dim.left == kNoExpr) return;
    if (m_Tokens.acceptSymbol(":")) {
      dim.right = expression();
      if (dim.right == kNoExpr) return;
    }
    if (!expectSymbol("]")) return;
    dims.push_back(dim);
  }
}

bool Parser::userTypeAt(size_t n) {
  if (m_Tokens.peek(n).kind != TokenKind::Identifier) return false;
  if (classify(m_Tokens.peek(n).text) != Word::None) return false;
  const Token& next = m_Tokens.peek(n + 1);
  if (next.isSymbol("::")) return m_Tokens.peek(n + 2).kind == TokenKind::Identifier;
  if (next.isSymbol(".")) return m_Tokens.peek(n + 2).kind == TokenKind::Identifier;
  if (next.kind == TokenKind::Identifier) return classify(next.text) == Word::None;
  if (!next.isSymbol("[")) return false;
  // T [3:0] name, as opposed to name [3:0]: a name must follow the brackets.
  size_t i = n + 1;
  int depth = 0;
  for (size_t guard = 0; guard < 10000; ++guard, ++i) {
    const Token& token = m_Tokens.peek(i);
    if (token.kind == TokenKind::End) return false;
    if (token.isSymbol("[")) ++depth;
    if (token.isSymbol("]")) --depth;
    if (depth == 0 && !token.isSymbol("]") && !token.isSymbol("[")) return false;
    if (depth == 0 && token.isSymbol("]") && !m_Tokens.peek(i + 1).isSymbol("["))
      return m_Tokens.peek(i + 1).kind == TokenKind::Identifier;
  }
  return false;
}

void Parser::structBody(TypeSpec& type) {
  type.base = TypeSpec::Base::Struct;
  m_Tokens.acceptWord(Word::Packed);
  if (!m_Tokens.acceptWord(Word::Signed)) m_Tokens.acceptWord(Word::Unsigned);
  if (!expectSymbol("{")) return;
  while (!m_Failed && !m_Tokens.atEnd() && !m_Tokens.acceptSymbol("}")) {
    TypeSpec member;
    if (!dataType(member)) {
      fail("expected a member type");
      return;
    }
    do {
      if (m_Tokens.peek().kind != TokenKind::Identifier) {
        fail("expected a member name");
        return;
      }
      m_Tokens.take();
      std::vector<Dimension> unpacked;
      dimensions(unpacked);
      if (m_Tokens.acceptSymbol("=") && expression() == kNoExpr) return;
      type.members.push_back(member);
    } while (m_Tokens.acceptSymbol(","));
    if (!expectSymbol(";")) return;
  }
}

void Parser::enumBody(TypeSpec& type) {
  type.base = TypeSpec::Base::Enum;
  TypeSpec base;
  if (!m_Tokens.peek().isSymbol("{")) dataType(base);
  if (base.base == TypeSpec::Base::Implicit && base.packed.empty()) {
    base.base = TypeSpec::Base::Atom;
    base.atomWidth = 32;
  } else if (base.base == TypeSpec::Base::Implicit) {
    base.base = TypeSpec::Base::Bit;
  }
  type.members.push_back(base);
  if (!expectSymbol("{")) return;
  int depth = 1;
  while (depth > 0 && !m_Tokens.atEnd()) {
    Token token = m_Tokens.take();
    if (token.isSymbol("{")) ++depth;
    if (token.isSymbol("}")) --depth;
  }
}

bool Parser::dataType(TypeSpec& type) {
  DepthGuard guard(
      m_Depth, limits::kVerilogSyntaxNesting);  // struct members and enum bases nest types in types
  if (guard.tooDeep()) {
    fail("data type nested too deeply");
    return false;
  }
  bool read = false;
  for (;;) {
    const Token& token = m_Tokens.peek();
    Word word = m_Tokens.peekWord();
    if (token.isSymbol("[")) {
      dimensions(type.packed);
      return true;
    }
    if (token.kind != TokenKind::Identifier) return read;
    switch (word) {
      case Word::NetKind:
      case Word::Var:
        if (type.written.empty() || type.base == TypeSpec::Base::Implicit)
          type.written.assign(token.text);
        break;
      case Word::VariableType:
        type.base = TypeSpec::Base::Bit;
        type.written.assign(token.text);
        break;
      case Word::AtomType:
        type.base = TypeSpec::Base::Atom;
        type.atomWidth = atomWidth(token.text);
        type.written.assign(token.text);
        break;
      case Word::RealType:
        type.base = TypeSpec::Base::Real;
        type.written.assign(token.text);
        break;
      case Word::Signed:
      case Word::Unsigned:
        type.signing = word == Word::Signed ? 1 : -1;
        break;
      case Word::Struct:
      case Word::Union:
        type.isUnion = word == Word::Union;
        type.written.assign(token.text);
        m_Tokens.take();
        structBody(type);
        return true;
      case Word::Enum:
        type.written.assign(token.text);
        m_Tokens.take();
        enumBody(type);
        return true;
      case Word::None:
        if (read && type.base != TypeSpec::Base::Implicit) return true;
        if (!userTypeAt(0)) return read;
        type.base = TypeSpec::Base::Named;
        type.name.assign(m_Tokens.take().text);
        if (m_Tokens.acceptSymbol("::")) {
          type.scope = type.name;
          type.name.assign(m_Tokens.take().text);
        } else if (m_Tokens.peek().isSymbol(".") &&
                   m_Tokens.peek(1).kind == TokenKind::Identifier &&
                   m_Tokens.peek(2).kind == TokenKind::Identifier) {
          m_Tokens.take();
          type.modport.assign(m_Tokens.take().text);
          type.isInterface = true;
          type.written = type.name;
          return true;
        }
        type.written = type.name;
        read = true;
        continue;
      default:
        return read;
    }
    m_Tokens.take();
    read = true;
  }
}
}  // namespace scan::verilog
