// Macro uses: the argument list, the body with formals, `` and `" rewritten, and the
// expansion pushed as a frame of its own, under limits on count and size.
#include "scan/verilog/verilog_preprocessor.h"

#include <algorithm>

#include "scan/verilog/verilog_preprocessor_support.h"

namespace scan::verilog {
namespace {

// Per use of a macro outside any macro text. Real macros (UVM's included) stay far below these;
// a recursive definition reaches them in microseconds instead of flooding the index pass.
constexpr size_t kMaxExpansions = 20000;
constexpr size_t kMaxExpansionBytes = 1u << 20;

}  // namespace

bool Preprocessor::collectArguments(const Token& at, const Macro& macro,
                                    std::vector<std::string>& args) {
  const char* p = lexer().position();
  const char* end = lexer().end();
  while (p < end && isBlank(*p)) ++p;
  if (*p != '(') {
    error(at, "macro `" + macro.name + " needs an argument list");
    return false;
  }
  ++p;
  int depth = 0;
  const char* start = p;
  for (; p < end; ++p) {
    char c = *p;
    if (c == '"') {
      ++p;
      while (p < end && *p != '"' && *p != '\n') p += *p == '\\' && p + 1 < end ? 2 : 1;
      if (p >= end) break;
    } else if (c == '/' && p[1] == '/') {
      while (p < end && *p != '\n') ++p;
      if (p >= end) break;
    } else if (c == '(' || c == '[' || c == '{') {
      ++depth;
    } else if ((c == ')' || c == ']' || c == '}') && depth > 0) {
      --depth;
    } else if ((c == ',' || c == ')') && depth == 0) {
      args.emplace_back(trim({start, static_cast<size_t>(p - start)}));
      start = p + 1;
      if (c == ')') break;
    }
  }
  if (p >= end) {
    error(at, "unterminated argument list of macro `" + macro.name);
    lexer().setPosition(end);
    return false;
  }
  lexer().setPosition(p + 1);
  if (args.size() == 1 && args[0].empty() && macro.formals.empty()) args.clear();
  if (args.size() > macro.formals.size()) {
    error(at, "too many arguments for macro `" + macro.name);
    return false;
  }
  args.resize(macro.formals.size());
  for (size_t i = 0; i < args.size(); ++i) {
    if (!args[i].empty() || i >= macro.defaults.size() || !macro.defaults[i]) continue;
    args[i] = *macro.defaults[i];
  }
  return true;
}

std::string Preprocessor::rewrite(const Macro& macro, const std::vector<std::string>& args) {
  const std::string& body = macro.body;
  std::string out;
  out.reserve(body.size());
  bool inString = false;  // an ordinary string: no substitution inside
  for (size_t i = 0; i < body.size();) {
    char c = body[i];
    if (inString) {
      out += c;
      if (c == '\\' && i + 1 < body.size()) {
        out += body[i + 1];
        i += 2;
        continue;
      }
      if (c == '"') inString = false;
      ++i;
    } else if (c == '`' && body.compare(i, 2, "``") == 0) {
      i += 2;
    } else if (c == '`' && body.compare(i, 2, "`\"") == 0) {
      out += '"';
      i += 2;
    } else if (c == '`' && body.compare(i, 4, "`\\`\"") == 0) {
      out += "\\\"";
      i += 4;
    } else if (c == '"') {
      inString = true;
      out += c;
      ++i;
    } else if (c == '\\') {
      size_t stop = i + 1;
      while (stop < body.size() && !isBlank(body[stop])) ++stop;
      out.append(body, i, stop - i);
      i = stop;
    } else if (isIdentifierStart(c)) {
      size_t stop = i + 1;
      while (stop < body.size() && isIdentifierChar(body[stop])) ++stop;
      std::string_view word(body.data() + i, stop - i);
      auto formal = std::find(macro.formals.begin(), macro.formals.end(), word);
      bool directiveName = i > 0 && body[i - 1] == '`' && !(i > 1 && body[i - 2] == '`');
      if (formal != macro.formals.end() && !directiveName)
        out += args[static_cast<size_t>(formal - macro.formals.begin())];
      else
        out += word;
      i = stop;
    } else {
      out += c;
      ++i;
    }
  }
  return out;
}

void Preprocessor::expand(const Token& token) {
  std::shared_ptr<const Macro> macro = m_Macros.find(token.text);
  if (!macro) {
    error(token, "undefined macro `" + std::string(token.text));
    return;
  }
  if (!lexer().inMacroText()) {
    m_Expansions = 0;
    m_ExpansionBytes = 0;
    m_BudgetReported = false;
    m_OutermostMacro = macro->name;
  }
  if (m_Frames.size() >= kMaxFrames) {
    if (!m_BudgetReported)
      error(token, "macro `" + macro->name + " expands too deeply (recursive definition?)");
    m_BudgetReported = true;
    return;
  }
  std::vector<std::string> args;
  if (macro->functionLike && !collectArguments(token, *macro, args)) return;
  if (++m_Expansions > kMaxExpansions || m_ExpansionBytes > kMaxExpansionBytes) {
    if (!m_BudgetReported)
      error(token, "expansion of macro `" + m_OutermostMacro + " is too large");
    m_BudgetReported = true;
    return;
  }
  if (!macro->functionLike && !macro->needsRewrite) {
    m_ExpansionBytes += macro->body.size();
    const char* begin = macro->body.data();
    Lexer lexer(begin, begin + macro->body.size(), token.source, token.offset, m_Diagnostics);
    lexer.setCoarse(m_Coarse);
    m_Frames.push_back(Frame{lexer, nullptr, 0, std::move(macro), nullptr});
    return;
  }
  std::string text = rewrite(*macro, args);
  m_ExpansionBytes += text.size();
  pushText(token, std::move(text), std::move(macro));
}

}  // namespace scan::verilog
