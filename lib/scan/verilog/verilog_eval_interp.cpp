// The interpreter for constant function bodies: statements run against local variables with
// the evaluator's step and nesting limits.
#include "scan/verilog/verilog_eval.h"
#include "scan/verilog/verilog_eval_support.h"

namespace scan::verilog {

bool Evaluator::assignSelect(const Stmt& stmt, const Value& v, Scope& scope, Locals& locals) {
  auto target = locals.find(stmt.target);
  if (target == locals.end()) return fail("unknown variable '" + stmt.target + "'");
  int64_t old = 0, value = 0, i = 0, j = 0;
  Value index;
  if (!toInteger(target->second, old) || !toInteger(v, value)) return false;
  if (!eval(stmt.index, scope, &locals, index) || !toInteger(index, i)) return false;
  bool part = stmt.indexEnd != kNoExpr;
  if (part && (!eval(stmt.indexEnd, scope, &locals, index) || !toInteger(index, j))) return false;
  int64_t low = 0, width = 0;
  selectBits(stmt.selectOp, i, j, part, low, width);
  if (low < 0 || low >= 64 || width <= 0) return fail("bit select out of range");
  uint64_t mask = lowMask(width) << low;
  uint64_t bits =
      (static_cast<uint64_t>(old) & ~mask) | ((static_cast<uint64_t>(value) << low) & mask);
  int w = target->second.unsignedWidth();
  target->second = w ? unsignedValue(bits, w) : Value::integer(static_cast<int64_t>(bits));
  return true;
}

bool Evaluator::run(const std::vector<Stmt>& body, Scope& scope, Locals& locals, Flow& flow) {
  for (const Stmt& stmt : body) {
    if (!runOne(stmt, scope, locals, flow)) return false;
    if (flow == Flow::Return) return true;
  }
  return true;
}

bool Evaluator::runOne(const Stmt& stmt, Scope& scope, Locals& locals, Flow& flow) {
  if (++m_Steps > limits::kVerilogEvalSteps)
    return fail("constant function did not finish within " +
                std::to_string(limits::kVerilogEvalSteps) + " steps");
  DepthGuard nesting(m_Nesting, limits::kVerilogEvalNesting);
  if (nesting.tooDeep()) return fail("evaluation is nested too deeply");
  auto truth = [&](ExprId condition, bool& result) {
    Value v;
    int64_t i = 0;
    if (!eval(condition, scope, &locals, v)) return false;
    if (v.isReal()) {
      result = v.asReal() != 0;
      return true;
    }
    if (!toInteger(v, i)) return false;
    result = i != 0;
    return true;
  };
  switch (stmt.kind) {
    case Stmt::Kind::Nothing:
      return true;
    case Stmt::Kind::Block:
      return run(stmt.body, scope, locals, flow);
    case Stmt::Kind::Declare: {
      Value v = Value::integer(0);
      if (stmt.value != kNoExpr && !eval(stmt.value, scope, &locals, v)) return false;
      locals[stmt.target] = v;
      return true;
    }
    case Stmt::Kind::Assign: {
      Value v;
      if (!eval(stmt.value, scope, &locals, v)) return false;
      if (stmt.index != kNoExpr) return assignSelect(stmt, v, scope, locals);
      if (stmt.update != kNoExpr) {
        if (!locals.count(stmt.target)) return fail("unknown variable '" + stmt.target + "'");
        if (!eval(stmt.update, scope, &locals, v)) return false;
      } else if (!locals.count(stmt.target)) {
        return fail("unknown variable '" + stmt.target + "'");
      }
      locals[stmt.target] = v;
      return true;
    }
    case Stmt::Kind::If: {
      bool yes = false;
      if (!truth(stmt.value, yes)) return false;
      return runOne(stmt.body[yes ? 0 : 1], scope, locals, flow);
    }
    case Stmt::Kind::For: {
      if (!runOne(stmt.body[0], scope, locals, flow)) return false;
      for (;;) {
        bool more = false;
        if (!truth(stmt.value, more)) return false;
        if (!more) return true;
        if (!runOne(stmt.body[2], scope, locals, flow)) return false;
        if (flow == Flow::Return) return true;
        if (!runOne(stmt.body[1], scope, locals, flow)) return false;
      }
    }
    case Stmt::Kind::While:
      for (;;) {
        bool more = false;
        if (!truth(stmt.value, more)) return false;
        if (!more) return true;
        if (!runOne(stmt.body[0], scope, locals, flow)) return false;
        if (flow == Flow::Return) return true;
      }
    case Stmt::Kind::Repeat: {
      Value v;
      int64_t count = 0;
      if (!eval(stmt.value, scope, &locals, v) || !toInteger(v, count)) return false;
      for (int64_t i = 0; i < count; ++i) {
        if (!runOne(stmt.body[0], scope, locals, flow)) return false;
        if (flow == Flow::Return) return true;
      }
      return true;
    }
    case Stmt::Kind::Return:
      if (stmt.value != kNoExpr) {
        Value v;
        if (!eval(stmt.value, scope, &locals, v)) return false;
        locals[m_ReturnName] = v;
      }
      flow = Flow::Return;
      return true;
    case Stmt::Kind::Case: {
      Value subject;
      int64_t key = 0;
      if (!eval(stmt.value, scope, &locals, subject) || !toInteger(subject, key)) return false;
      for (size_t i = 0; i < stmt.body.size(); ++i) {
        for (ExprId label : stmt.labels[i]) {
          Value v;
          int64_t candidate = 0;
          if (!eval(label, scope, &locals, v) || !toInteger(v, candidate)) return false;
          if (candidate == key) return runOne(stmt.body[i], scope, locals, flow);
        }
      }
      if (stmt.hasDefault) return runOne(stmt.body.back(), scope, locals, flow);
      return true;
    }
  }
  return true;
}
}  // namespace scan::verilog
