// What the parser's files share: a node built before it joins the arena, and the nesting guard
// every recursive entry takes. Internal to the parser; only verilog_parser*.cpp include it.
#pragma once

#include <string_view>

#include "scan/common/reader_limits.h"
#include "scan/verilog/verilog_expr.h"

namespace scan::verilog {

/// A node of `kind` for the parser to complete before adding it to the arena.
inline Expr node(Expr::Kind kind, Op op = Op::None, std::string_view name = {}) {
  Expr expr;
  expr.kind = kind;
  expr.op = op;
  expr.name.assign(name);
  return expr;
}

}  // namespace scan::verilog
