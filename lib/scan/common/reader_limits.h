// How deep either reader lets hostile input nest before it reports an error instead of
// exhausting the native stack or running forever, and the guard that counts the nesting.
// Each limit keeps the value its reader was tested with; they differ where recursion costs do.
#pragma once

#include <cstddef>
#include <cstdint>

namespace scan {

namespace limits {

/// Verilog parser: expressions, data types, statements and selects in one another.
inline constexpr int kVerilogSyntaxNesting = 400;
/// Verilog evaluator: types defined through types, and constant function calls.
inline constexpr int kVerilogDefinitionNesting = 200;
/// Verilog evaluator: expressions, parameters defined through parameters and statements, all
/// on the native stack; this keeps hostile input well inside it, sanitizers included.
inline constexpr int kVerilogEvalNesting = 1000;
/// Verilog evaluator: steps one evaluation may take, constant function loops included.
inline constexpr size_t kVerilogEvalSteps = 1000000;
/// Verilog preprocessor: files included from included files.
inline constexpr size_t kVerilogIncludeNesting = 64;

/// VHDL parser: parentheses, aggregates and call arguments; real designs stay far below.
inline constexpr int kVhdlSyntaxNesting = 200;
/// VHDL parser: depth of one expression tree; an operator chain a+b+c+... builds one level
/// per operator.
inline constexpr uint16_t kVhdlTreeDepth = 1000;
/// VHDL parser: sequential statements in one another inside a function body.
inline constexpr int kVhdlStatementNesting = 100;
/// VHDL evaluator: nested expressions, constants defined by constants, types in types.
inline constexpr int kVhdlEvalNesting = 400;
/// VHDL evaluator: function calls in progress at once.
inline constexpr int kVhdlCallNesting = 64;
/// VHDL: subtypes defined by subtypes and aliases of aliases; a cycle stops here.
inline constexpr int kVhdlDefinitionChain = 32;

}  // namespace limits

/// Counts one level of nesting for as long as it lives; tooDeep() when this level passes
/// `limit`. The caller reports the error and returns, which unwinds the count.
class DepthGuard {
 public:
  DepthGuard(int& depth, int limit) : m_Depth(depth), m_TooDeep(++depth > limit) {}
  ~DepthGuard() { --m_Depth; }
  DepthGuard(const DepthGuard&) = delete;
  DepthGuard& operator=(const DepthGuard&) = delete;

  bool tooDeep() const { return m_TooDeep; }

 private:
  int& m_Depth;
  bool m_TooDeep;
};

}  // namespace scan
