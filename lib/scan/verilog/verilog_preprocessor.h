// The preprocessor as a token source: it pulls tokens from a stack of lexers (the file, its
// includes, macro expansions), acts on directives inline and hands on the tokens of active
// text. Only macro expansions are ever copied; file text is read in place.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "scan/common/diagnostics.h"
#include "scan/verilog/verilog_lexer.h"
#include "scan/verilog/verilog_macros.h"

namespace scan::verilog {

class SourceStore;

class Preprocessor {
 public:
  /// `diagnostics` may be null to read quietly (a second reading of text already checked);
  /// the errors met are then only counted (see quietErrors).
  Preprocessor(Diagnostics* diagnostics, MacroTable& macros, SourceStore& sources);
  ~Preprocessor();
  Preprocessor(const Preprocessor&) = delete;
  Preprocessor& operator=(const Preprocessor&) = delete;

  /// Starts reading `file` at `offset`, as if `openConditionals` taken `ifdef branches were
  /// open there. Anything still being read is dropped.
  void start(const SourceBuffer& file, size_t offset, size_t openConditionals);

  /// The next token of active text; false at the end of the started file.
  bool next(Token& token);

  /// Switches every lexer, present and future, to coarse mode or back (see Lexer).
  void setCoarse(bool coarse);
  bool coarse() const { return m_Coarse; }

  /// Lexical and directive errors met so far by a quiet preprocessor (0 for one that prints).
  size_t quietErrors() const { return m_Quiet.errorCount(); }

  /// Conditional branches open at the current position.
  size_t openConditionals() const { return m_Conditionals.size(); }

  /// Frees the text of finished expansions. Tokens handed out before become invalid.
  void releaseFinishedText() {
    if (!m_FinishedText.empty() || !m_FinishedMacros.empty()) releaseAll();
  }

 private:
  struct Conditional {
    bool parentActive = true;
    bool active = true;
    bool taken = true;
    bool sawElse = false;
    const SourceBuffer* source = nullptr;
    size_t offset = 0;
    std::string_view directive;
  };
  struct Frame {
    Lexer lexer;
    const SourceBuffer* file = nullptr;  ///< set for file frames
    size_t conditionalBase = 0;
    std::shared_ptr<const Macro> macro;
    std::unique_ptr<std::string> text;
  };

  void error(const Token& at, std::string_view text);
  void releaseAll();
  void popFrame();
  void updateSkipping();
  void directive(const Token& token);
  void conditional(const Token& token);
  void defineMacro(const Token& token);
  void include(const Token& token);
  void expand(const Token& token);
  void pushText(const Token& at, std::string text, std::shared_ptr<const Macro> macro);
  bool collectArguments(const Token& at, const Macro& macro, std::vector<std::string>& args);
  std::string rewrite(const Macro& macro, const std::vector<std::string>& args);
  void skipProtected(const Token& token, std::string_view endMarker);

  // Raw text helpers on the innermost lexer.
  Lexer& lexer() { return m_Frames.back().lexer; }
  void skipInlineBlanks();
  std::string_view readName();
  std::string_view restOfLine();
  std::string readBody();

  Diagnostics m_Quiet{nullptr};
  Diagnostics* m_Diagnostics;  ///< never null: m_Quiet when reading quietly
  MacroTable& m_Macros;
  SourceStore& m_Sources;
  std::vector<Frame> m_Frames;
  std::vector<Conditional> m_Conditionals;
  bool m_Skipping = false;
  bool m_Coarse = false;
  size_t m_Expansions = 0;
  size_t m_ExpansionBytes = 0;
  bool m_BudgetReported = false;
  std::string m_OutermostMacro;
  std::vector<std::unique_ptr<std::string>> m_FinishedText;
  std::vector<std::shared_ptr<const Macro>> m_FinishedMacros;
};

}  // namespace scan::verilog
