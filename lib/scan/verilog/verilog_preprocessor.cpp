// Directives are rare next to ordinary tokens, so the common path of next() is one lexer call
// and two tests; everything else lives in the directive handlers.
#include "scan/verilog/verilog_preprocessor.h"

#include <algorithm>
#include <array>

#include "scan/common/diagnostics.h"
#include "scan/common/reader_limits.h"
#include "scan/common/source_buffer.h"
#include "scan/verilog/verilog_preprocessor_support.h"
#include "scan/verilog/verilog_sources.h"

namespace scan::verilog {
namespace {

// Directives with no effect on ports: the rest of their line is ignored.
constexpr std::array<std::string_view, 31> kLineDirectives = {
    "timescale",
    "default_nettype",
    "resetall",
    "celldefine",
    "endcelldefine",
    "unconnected_drive",
    "nounconnected_drive",
    "line",
    "begin_keywords",
    "end_keywords",
    "default_decay_time",
    "default_trireg_strength",
    "delay_mode_distributed",
    "delay_mode_path",
    "delay_mode_unit",
    "delay_mode_zero",
    "accelerate",
    "noaccelerate",
    "protect",
    "endprotect",
    "expand_vectornets",
    "noexpand_vectornets",
    "suppress_faults",
    "nosuppress_faults",
    "enable_portfaults",
    "disable_portfaults",
    "remove_gatenames",
    "noremove_gatenames",
    "remove_netnames",
    "noremove_netnames",
    "uselib",
};

bool isConditional(std::string_view name) {
  return name == "ifdef" || name == "ifndef" || name == "elsif" || name == "else" ||
         name == "endif";
}

// "`name" followed by `tail`, built step by step (GCC 12 misreads the chained form).
std::string directiveText(std::string_view name, std::string_view tail) {
  std::string text = "`";
  text.append(name);
  text.append(tail);
  return text;
}

}  // namespace

Preprocessor::Preprocessor(Diagnostics* diagnostics, MacroTable& macros, SourceStore& sources)
    : m_Diagnostics(diagnostics ? diagnostics : &m_Quiet), m_Macros(macros), m_Sources(sources) {}

Preprocessor::~Preprocessor() = default;

void Preprocessor::start(const SourceBuffer& file, size_t offset, size_t openConditionals) {
  m_Frames.clear();
  m_Conditionals.assign(openConditionals, Conditional{});
  m_Skipping = false;
  const char* begin = file.begin();
  Frame frame{Lexer(begin, file.end(), &file, Lexer::npos, m_Diagnostics), &file, openConditionals,
              nullptr, nullptr};
  frame.lexer.setPosition(begin + std::min(offset, file.text().size()));
  frame.lexer.setCoarse(m_Coarse);
  m_Frames.push_back(std::move(frame));
}

void Preprocessor::setCoarse(bool coarse) {
  m_Coarse = coarse;
  for (Frame& frame : m_Frames) frame.lexer.setCoarse(coarse);
}

void Preprocessor::error(const Token& at, std::string_view text) {
  if (at.source) m_Diagnostics->error(*at.source, at.offset, text);
}

bool Preprocessor::next(Token& token) {
  while (!m_Frames.empty()) {
    m_Frames.back().lexer.next(token);
    if (token.kind == TokenKind::Directive) {
      directive(token);
    } else if (token.kind == TokenKind::End) {
      popFrame();
    } else if (!m_Skipping) {
      return true;
    }
  }
  token = Token{};
  return false;
}

void Preprocessor::updateSkipping() {
  m_Skipping = !m_Conditionals.empty() && !m_Conditionals.back().active;
}

void Preprocessor::popFrame() {
  Frame& frame = m_Frames.back();
  if (frame.file) {
    while (m_Conditionals.size() > frame.conditionalBase) {
      const Conditional& open = m_Conditionals.back();
      if (open.source)
        m_Diagnostics->error(*open.source, open.offset,
                             "unterminated `" + std::string(open.directive) +
                                 ": no `endif before the end of the file");
      m_Conditionals.pop_back();
    }
    updateSkipping();
  }
  if (frame.text) m_FinishedText.push_back(std::move(frame.text));
  if (frame.macro) m_FinishedMacros.push_back(std::move(frame.macro));
  m_Frames.pop_back();
}

void Preprocessor::releaseAll() {
  m_FinishedText.clear();
  m_FinishedMacros.clear();
}

void Preprocessor::skipInlineBlanks() {
  const char* p = lexer().position();
  while (*p == ' ' || *p == '\t' || *p == '\r') ++p;
  lexer().setPosition(p);
}

std::string_view Preprocessor::readName() {
  const char* p = lexer().position();
  const char* end = lexer().end();
  while (p < end && isBlank(*p)) ++p;
  const char* start = p;
  if (p < end && *p == '\\') {
    while (p < end && !isBlank(*p)) ++p;
  } else if (isIdentifierStart(*p)) {
    while (isIdentifierChar(*p)) ++p;
  }
  lexer().setPosition(p);
  return {start, static_cast<size_t>(p - start)};
}

std::string_view Preprocessor::restOfLine() {
  const char* p = lexer().position();
  const char* end = lexer().end();
  const char* start = p;
  while (p < end && *p != '\n') ++p;
  lexer().setPosition(p < end ? p + 1 : end);
  return {start, static_cast<size_t>(p - start)};
}

void Preprocessor::directive(const Token& token) {
  std::string_view name = token.text;
  if (isConditional(name)) {
    conditional(token);
    return;
  }
  if (m_Skipping) return;
  if (name == "define") {
    defineMacro(token);
  } else if (name == "undef") {
    std::string_view target = readName();
    if (target.empty()) error(token, "expected a macro name after `undef");
    m_Macros.undefine(target);
  } else if (name == "undefineall") {
    m_Macros.undefineAll();
  } else if (name == "include") {
    include(token);
  } else if (name == "pragma") {
    std::string_view line = restOfLine();
    if (line.find("protect") != std::string_view::npos &&
        line.find("begin_protected") != std::string_view::npos)
      skipProtected(token, "end_protected");
  } else if (name == "protected") {
    skipProtected(token, "`endprotected");
  } else if (name == "endprotected") {
    restOfLine();
  } else if (name == "__FILE__") {
    std::string path = token.source ? token.source->path() : std::string();
    std::string quoted = "\"";
    for (char c : path) {
      if (c == '"' || c == '\\') quoted += '\\';
      quoted += c;
    }
    pushText(token, quoted + "\"", nullptr);
  } else if (name == "__LINE__") {
    size_t line = token.source ? token.source->locate(token.offset).line : 0;
    pushText(token, std::to_string(line), nullptr);
  } else if (std::find(kLineDirectives.begin(), kLineDirectives.end(), name) !=
             kLineDirectives.end()) {
    restOfLine();
  } else {
    expand(token);
  }
}

void Preprocessor::conditional(const Token& token) {
  std::string_view name = token.text;
  size_t base = 0;
  for (const Frame& frame : m_Frames)
    if (frame.file) base = frame.conditionalBase;
  if (name == "ifdef" || name == "ifndef") {
    std::string_view macro = readName();
    if (macro.empty()) error(token, "expected a macro name after `" + std::string(name));
    Conditional open;
    open.parentActive = !m_Skipping;
    bool defined = m_Macros.find(macro) != nullptr;
    open.active = open.parentActive && (name == "ifdef" ? defined : !defined);
    open.taken = open.active;
    open.source = token.source;
    open.offset = token.offset;
    // Literals, not the token's text: a conditional opened inside macro text outlives that
    // text, and its name is still needed to report it unterminated at the end of the file.
    open.directive = name == "ifdef" ? std::string_view("ifdef") : std::string_view("ifndef");
    m_Conditionals.push_back(open);
  } else if (m_Conditionals.size() <= base) {
    if (name == "elsif") readName();
    error(token, directiveText(name, " without a matching `ifdef"));
    return;
  } else if (name == "endif") {
    m_Conditionals.pop_back();
  } else {
    Conditional& open = m_Conditionals.back();
    if (open.sawElse) error(token, directiveText(name, " after `else"));
    if (name == "elsif") {
      std::string_view macro = readName();
      if (macro.empty()) error(token, "expected a macro name after `elsif");
      bool defined = m_Macros.find(macro) != nullptr;
      open.active = open.parentActive && !open.taken && defined;
    } else {
      open.active = open.parentActive && !open.taken;
      open.sawElse = true;
    }
    open.taken = open.taken || open.active;
  }
  updateSkipping();
}

std::string Preprocessor::readBody() {
  const char* p = lexer().position();
  const char* end = lexer().end();
  std::string body;
  while (p < end && *p != '\n') {
    char c = *p;
    if (c == '\\' && (p[1] == '\n' || (p[1] == '\r' && p[2] == '\n'))) {
      p += p[1] == '\n' ? 2 : 3;
      body += '\n';
    } else if (c == '/' && p[1] == '/') {
      while (p < end && *p != '\n') ++p;
    } else if (c == '/' && p[1] == '*') {
      std::string_view rest(p, static_cast<size_t>(end - p));
      size_t close = rest.find("*/", 2);
      p = close == std::string_view::npos ? end : p + close + 2;
      body += ' ';
    } else if (c == '"') {
      const char* start = p++;
      while (p < end && *p != '"' && *p != '\n') p += *p == '\\' && p + 1 < end ? 2 : 1;
      if (p < end && *p == '"') ++p;
      body.append(start, static_cast<size_t>(p - start));
    } else {
      body += c;
      ++p;
    }
  }
  lexer().setPosition(p < end ? p + 1 : end);
  body.assign(trim(body));
  return body;
}

void Preprocessor::defineMacro(const Token& token) {
  skipInlineBlanks();
  std::string_view name = readName();
  if (name.empty() || name.front() == '\\') {
    error(token, "expected a macro name after `define");
    restOfLine();
    return;
  }
  auto macro = std::make_shared<Macro>();
  macro->name.assign(name);
  const char* p = lexer().position();
  const char* end = lexer().end();
  if (*p == '(') {
    macro->functionLike = true;
    ++p;
    for (;;) {
      while (p < end && isBlank(*p)) ++p;
      if (*p == ')' && macro->formals.empty()) {
        ++p;
        break;
      }
      const char* start = p;
      while (isIdentifierChar(*p)) ++p;
      if (p == start) {
        error(token, "malformed argument list of macro `" + macro->name);
        lexer().setPosition(p);
        restOfLine();
        return;
      }
      macro->formals.emplace_back(start, static_cast<size_t>(p - start));
      while (p < end && isBlank(*p)) ++p;
      std::optional<std::string> value;
      if (*p == '=') {
        const char* valueStart = ++p;
        int depth = 0;
        while (p < end && *p != '\n' && (depth > 0 || (*p != ',' && *p != ')'))) {
          if (*p == '(' || *p == '[' || *p == '{') ++depth;
          if (*p == ')' || *p == ']' || *p == '}') --depth;
          ++p;
        }
        value = std::string(trim({valueStart, static_cast<size_t>(p - valueStart)}));
      }
      macro->defaults.push_back(std::move(value));
      if (*p == ',') {
        ++p;
        continue;
      }
      if (*p == ')') {
        ++p;
        break;
      }
      error(token, "malformed argument list of macro `" + macro->name);
      lexer().setPosition(p);
      restOfLine();
      return;
    }
    lexer().setPosition(p);
  }
  macro->body = readBody();
  macro->needsRewrite = macro->body.find("``") != std::string::npos ||
                        macro->body.find("`\"") != std::string::npos ||
                        macro->body.find("`\\`\"") != std::string::npos;
  m_Macros.define(std::move(macro));
}

void Preprocessor::include(const Token& token) {
  skipInlineBlanks();
  const char* p = lexer().position();
  const char* end = lexer().end();
  char close = *p == '"' ? '"' : *p == '<' ? '>' : '\0';
  if (close == '\0') {
    error(token, "expected \"file name\" after `include");
    restOfLine();
    return;
  }
  const char* start = ++p;
  while (p < end && *p != close && *p != '\n') ++p;
  std::string name(start, static_cast<size_t>(p - start));
  lexer().setPosition(p < end && *p == close ? p + 1 : p);
  restOfLine();
  std::string reason;
  const SourceBuffer* file = m_Sources.findInclude(name, lexer().file(), reason);
  if (!file) {
    error(token, reason.empty() ? "cannot find include file \"" + name + "\""
                                : "cannot read include file \"" + name + "\": " + reason);
    return;
  }
  size_t depth = 0;
  for (const Frame& frame : m_Frames) {
    if (frame.file == file) {
      error(token, "include cycle: \"" + name + "\" is already being read");
      return;
    }
    if (frame.file) ++depth;
  }
  if (depth >= limits::kVerilogIncludeNesting || m_Frames.size() >= kMaxFrames) {
    error(token, "includes nested too deeply at \"" + name + "\"");
    return;
  }
  m_Frames.push_back(Frame{Lexer(file->begin(), file->end(), file, Lexer::npos, m_Diagnostics),
                           file, m_Conditionals.size(), nullptr, nullptr});
  m_Frames.back().lexer.setCoarse(m_Coarse);
}

void Preprocessor::skipProtected(const Token& token, std::string_view endMarker) {
  const char* p = lexer().position();
  std::string_view rest(p, static_cast<size_t>(lexer().end() - p));
  size_t found = rest.find(endMarker);
  if (found == std::string_view::npos) {
    error(token, "unterminated protected envelope");
    lexer().setPosition(lexer().end());
    return;
  }
  lexer().setPosition(p + found + endMarker.size());
  restOfLine();
}

void Preprocessor::pushText(const Token& at, std::string text, std::shared_ptr<const Macro> macro) {
  auto owned = std::make_unique<std::string>(std::move(text));
  const char* begin = owned->data();
  const char* end = begin + owned->size();
  m_Frames.push_back(Frame{Lexer(begin, end, at.source, at.offset, m_Diagnostics), nullptr, 0,
                           std::move(macro), std::move(owned)});
  m_Frames.back().lexer.setCoarse(m_Coarse);
}

}  // namespace scan::verilog
