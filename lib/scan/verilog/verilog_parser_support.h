// What the parser's files share: the words that start a data type, and the nesting guard
// every recursive entry takes. Internal to the parser; only verilog_parser*.cpp include it.
#pragma once

#include <string_view>

#include "scan/common/reader_limits.h"
#include "scan/verilog/verilog_expr.h"
#include "scan/verilog/verilog_keywords.h"

namespace scan::verilog {

/// A node of `kind` for the parser to complete before adding it to the arena.
inline Expr node(Expr::Kind kind, Op op = Op::None, std::string_view name = {}) {
  Expr expr;
  expr.kind = kind;
  expr.op = op;
  expr.name.assign(name);
  return expr;
}

inline bool isTypeWord(Word word) {
  switch (word) {
    case Word::NetKind:
    case Word::Var:
    case Word::VariableType:
    case Word::AtomType:
    case Word::RealType:
    case Word::Signed:
    case Word::Unsigned:
    case Word::Struct:
    case Word::Union:
    case Word::Enum:
      return true;
    default:
      return false;
  }
}

}  // namespace scan::verilog
