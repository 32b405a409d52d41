// Texts are rebuilt from tokens rather than cut from the source, so comments inside a
// declaration vanish and line breaks become blanks. Only the list structure is read here:
// the parser has already judged the header and reported its errors.
#include "scan/vhdl/vhdl_header_text.h"

#include <algorithm>

#include "scan/vhdl/vhdl_lexer.h"

namespace scan::vhdl {
namespace {

bool isWord(const Token& t, std::string_view lowerWord) {
  return t.kind == TokenKind::Identifier && equalsWord(t.text, lowerWord);
}

// The next valid token; invalid ones were reported by the index pass.
Token nextToken(Lexer& lexer) {
  Token t = lexer.next();
  while (t.kind == TokenKind::Invalid) t = lexer.next();
  return t;
}

std::string join(const std::vector<Token>& tokens, size_t from, size_t to) {
  std::string out;
  for (size_t i = from; i < to && i < tokens.size(); ++i) {
    if (i > from && tokens[i].offset > tokens[i - 1].offset + tokens[i - 1].text.size()) out += ' ';
    out += tokens[i].text;
  }
  return out;
}

// First index in [from, tokens.size()) outside parentheses where `stop` holds.
template <typename Stop>
size_t findOutside(const std::vector<Token>& tokens, size_t from, Stop stop) {
  long depth = 0;
  for (size_t i = from; i < tokens.size(); ++i) {
    if (tokens[i].is('('))
      ++depth;
    else if (tokens[i].is(')'))
      --depth;
    else if (depth == 0 && stop(tokens[i]))
      return i;
  }
  return tokens.size();
}

void addSubprogram(const std::vector<Token>& tokens, std::vector<InterfaceText>& out) {
  size_t keyword = isWord(tokens[0], "pure") || isWord(tokens[0], "impure") ? 1 : 0;
  if (keyword + 1 >= tokens.size()) return;
  size_t is = findOutside(tokens, keyword + 2, [](const Token& t) { return isWord(t, "is"); });
  InterfaceText item;
  item.kind = InterfaceText::Kind::Subprogram;
  item.name = tokens[keyword + 1].text;
  item.offset = tokens[keyword + 1].offset;
  item.typeText = join(tokens, 0, is);
  item.defaultText = join(tokens, is + 1, tokens.size());
  out.push_back(std::move(item));
}

void addObjects(const std::vector<Token>& tokens, std::vector<InterfaceText>& out) {
  size_t i = 0;
  if (isWord(tokens[0], "constant") || isWord(tokens[0], "signal") ||
      isWord(tokens[0], "variable") || isWord(tokens[0], "file"))
    i = 1;
  size_t first = out.size();
  for (; i < tokens.size() && !tokens[i].is(':'); ++i) {
    if (tokens[i].kind != TokenKind::Identifier && tokens[i].kind != TokenKind::Extended) continue;
    InterfaceText item;
    item.name = tokens[i].text;
    item.offset = tokens[i].offset;
    out.push_back(std::move(item));
  }
  if (i < tokens.size()) ++i;
  if (i < tokens.size() &&
      (isWord(tokens[i], "in") || isWord(tokens[i], "out") || isWord(tokens[i], "inout") ||
       isWord(tokens[i], "buffer") || isWord(tokens[i], "linkage")))
    ++i;
  size_t assign = findOutside(tokens, i, [](const Token& t) { return t.isSymbol(":="); });
  size_t typeEnd = findOutside(tokens, i, [](const Token& t) { return isWord(t, "bus"); });
  std::string type = join(tokens, i, std::min(assign, typeEnd));
  std::string value = join(tokens, assign + 1, tokens.size());
  for (size_t k = first; k < out.size(); ++k) {
    out[k].typeText = type;
    out[k].defaultText = value;
  }
}

// One interface declaration, given as its tokens without the closing ';' or ')'.
void addElement(const std::vector<Token>& tokens, std::vector<InterfaceText>& out) {
  if (tokens.empty()) return;
  const Token& first = tokens[0];
  bool isType = isWord(first, "type");
  if (isType || isWord(first, "package")) {
    if (tokens.size() < 2) return;
    size_t from = 2;
    if (!isType && from < tokens.size() && isWord(tokens[from], "is")) ++from;
    InterfaceText item;
    item.kind = isType ? InterfaceText::Kind::Type : InterfaceText::Kind::Package;
    item.name = tokens[1].text;
    item.offset = tokens[1].offset;
    item.typeText = join(tokens, from, tokens.size());
    out.push_back(std::move(item));
    return;
  }
  if (isWord(first, "function") || isWord(first, "procedure") || isWord(first, "pure") ||
      isWord(first, "impure"))
    return addSubprogram(tokens, out);
  addObjects(tokens, out);
}

// Reads the elements of a list whose '(' was just read; false when the text ended first.
bool readList(Lexer& lexer, std::vector<InterfaceText>& out) {
  std::vector<Token> element;
  long depth = 0;
  for (;;) {
    Token t = nextToken(lexer);
    if (t.kind == TokenKind::End) {
      addElement(element, out);
      return false;
    }
    if (depth == 0 && (t.is(';') || t.is(')'))) {
      addElement(element, out);
      element.clear();
      if (t.is(')')) return true;
      continue;
    }
    if (t.is('('))
      ++depth;
    else if (t.is(')'))
      --depth;
    element.push_back(t);
  }
}

}  // namespace

HeaderText readHeaderText(std::string_view text, size_t offset) {
  HeaderText header;
  Lexer lexer(text, offset);
  if (!isWord(nextToken(lexer), "entity")) return header;
  nextToken(lexer);  // the name
  if (!isWord(nextToken(lexer), "is")) return header;
  Token t = nextToken(lexer);
  if (isWord(t, "generic")) {
    if (!nextToken(lexer).is('(') || !readList(lexer, header.generics)) return header;
    t = nextToken(lexer);
    if (t.is(';')) t = nextToken(lexer);
  }
  if (isWord(t, "port") && nextToken(lexer).is('(')) readList(lexer, header.ports);
  return header;
}

std::string contextClauseText(std::string_view text, size_t begin, size_t end) {
  Lexer lexer(text, begin);
  std::vector<std::string> clauses;
  for (;;) {
    Token t = lexer.nextAtStatementStart();
    if (t.kind == TokenKind::End || t.offset >= end) break;
    if (isWord(t, "end")) {
      clauses.clear();
      continue;
    }
    if (!isWord(t, "library") && !isWord(t, "use") && !isWord(t, "context")) continue;
    std::vector<Token> tokens{t};
    while (!tokens.back().is(';')) {
      Token u = nextToken(lexer);
      if (u.kind == TokenKind::End || u.offset >= end) break;
      tokens.push_back(u);
    }
    clauses.push_back(join(tokens, 0, tokens.size()));
    lexer.seek(lexer.position(), true);
  }
  std::string out;
  for (const std::string& clause : clauses) {
    if (!out.empty()) out += '\n';
    out += clause;
  }
  return out;
}

std::string_view unitNameAt(std::string_view text, size_t offset) {
  Lexer lexer(text, offset);
  nextToken(lexer);
  Token t = nextToken(lexer);
  if (isWord(t, "body")) t = nextToken(lexer);
  return t.text;
}

std::string normalizedText(std::string_view text, size_t begin, size_t end) {
  Lexer lexer(text, begin);
  std::vector<Token> tokens;
  for (Token t = nextToken(lexer); t.kind != TokenKind::End && t.offset < end; t = nextToken(lexer))
    tokens.push_back(t);
  return join(tokens, 0, tokens.size());
}

}  // namespace scan::vhdl
