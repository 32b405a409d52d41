// Expression evaluation: operands, then operators with checked arithmetic, with Verilog's
// unsigned rules where an operand is unsigned.
#include "scan/verilog/verilog_eval.h"

#include <cmath>

#include "scan/verilog/verilog_eval_support.h"

namespace scan::verilog {
namespace {

bool isComparison(Op op) { return op >= Op::Equal && op <= Op::GreaterEqual; }

// !=, !== and !=?: this evaluator has no x or z bits, so all three are plain inequality.
bool isInequality(Op op) {
  return op == Op::NotEqual || op == Op::CaseNotEqual || op == Op::WildNotEqual;
}

bool compare(Op op, double a, double b) {
  if (op == Op::Less) return a < b;
  if (op == Op::LessEqual) return a <= b;
  if (op == Op::Greater) return a > b;
  if (op == Op::GreaterEqual) return a >= b;
  if (isInequality(op)) return a != b;
  return a == b;
}

bool compare(Op op, int64_t a, int64_t b) {
  if (op == Op::Less) return a < b;
  if (op == Op::LessEqual) return a <= b;
  if (op == Op::Greater) return a > b;
  if (op == Op::GreaterEqual) return a >= b;
  if (isInequality(op)) return a != b;
  return a == b;
}

// An operand's width in a Verilog expression: its own when unsigned, else an integer's.
int operandWidth(const Value& v) { return v.unsignedWidth() ? v.unsignedWidth() : 32; }

uint64_t unsignedPower(uint64_t base, uint64_t exponent) {
  uint64_t result = 1;
  for (; exponent; exponent >>= 1, base *= base)
    if (exponent & 1) result *= base;
  return result;
}

}  // namespace

bool Evaluator::eval(ExprId id, Scope& scope, Locals* locals, Value& out) {
  if (++m_Steps > limits::kVerilogEvalSteps)
    return fail("evaluation did not finish within the step limit");
  DepthGuard nesting(m_Nesting, limits::kVerilogEvalNesting);
  if (nesting.tooDeep()) return fail("evaluation is nested too deeply");
  const Expr& expr = scope.expr(id);
  switch (expr.kind) {
    case Expr::Kind::Number:
      if (expr.tooWide) return fail("the literal does not fit in 64 bits");
      if (expr.unknown) return fail("a literal with x or z bits has no numeric value");
      out = expr.width > 0 && !expr.isSigned
                ? unsignedValue(static_cast<uint64_t>(expr.integer), expr.width)
                : Value::integer(expr.integer);
      return true;
    case Expr::Kind::Pattern:
      return fail("an assignment pattern is not a number");
    case Expr::Kind::Real:
      out = Value::real(expr.real);
      return true;
    case Expr::Kind::String:
      out = Value::string(expr.name);
      return true;
    case Expr::Kind::Name:
      return evalName(expr, scope, locals, out);
    case Expr::Kind::System:
      return evalSystem(expr, scope, locals, out);
    case Expr::Kind::Call:
      return evalCall(expr, scope, locals, out);
    case Expr::Kind::TypeName:
      return fail("a type is not a value");
    case Expr::Kind::Concat:
    case Expr::Kind::Replicate: {
      int64_t value = 0, width = 0;
      if (!sizedValue(expr, scope, locals, value, width)) return false;
      out = width > 0 ? unsignedValue(static_cast<uint64_t>(value), width) : Value::integer(value);
      return true;
    }
    case Expr::Kind::Ternary: {
      Value condition;
      if (!eval(expr.args[0], scope, locals, condition)) return false;
      bool yes = condition.isReal() ? condition.asReal() != 0 : false;
      if (!condition.isReal()) {
        int64_t i = 0;
        if (!toInteger(condition, i)) return false;
        yes = i != 0;
      }
      return eval(expr.args[yes ? 1 : 2], scope, locals, out);
    }
    case Expr::Kind::Select: {
      if (const Expr& base = scope.expr(expr.args[0]);
          base.kind == Expr::Kind::Name &&
          !(locals && base.scope.empty() && locals->count(base.name))) {
        Scope* owner = nullptr;
        Parameter* parameter = nullptr;
        if (base.scope.empty()) {
          parameter = findParameter(base.name, scope, owner);
        } else if (Scope* package = m_Scopes.package(base.scope)) {
          auto it = package->parameters.find(base.name);
          if (it != package->parameters.end()) {
            owner = package;
            parameter = &it->second;
          }
        }
        if (parameter && !parameter->unpacked.empty())
          return evalElement(expr, base.name, *parameter, *owner, scope, locals, out);
      }
      Value base, index;
      int64_t b = 0, i = 0, j = 0;
      if (!eval(expr.args[0], scope, locals, base) || !toInteger(base, b)) return false;
      if (!eval(expr.args[1], scope, locals, index) || !toInteger(index, i)) return false;
      if (expr.args.size() == 3) {
        Value second;
        if (!eval(expr.args[2], scope, locals, second) || !toInteger(second, j)) return false;
      }
      int64_t low = 0, width = 0;
      selectBits(expr.op, i, j, expr.args.size() == 3, low, width);
      if (low < 0 || low >= 64 || width <= 0) return fail("bit select out of range");
      out = unsignedValue(static_cast<uint64_t>(b) >> low, width);
      return true;
    }
    case Expr::Kind::Unary: {
      Value operand;
      if (!eval(expr.args[0], scope, locals, operand)) return false;
      Op op = expr.op;
      if (operand.isReal() && (op == Op::Minus || op == Op::Plus)) {
        out = Value::real(op == Op::Minus ? -operand.asReal() : operand.asReal());
        return true;
      }
      int64_t v = 0;
      if (!toInteger(operand, v)) return false;
      uint64_t u = static_cast<uint64_t>(v);
      if (int w = operand.unsignedWidth();
          w && (op == Op::Plus || op == Op::Minus || op == Op::BitNot)) {
        out = unsignedValue(op == Op::Plus ? u : op == Op::Minus ? uint64_t{0} - u : ~u, w);
        return true;
      }
      if (int w = operand.unsignedWidth(); w && (op == Op::BitAnd || op == Op::BitNand)) {
        bool all = u == lowMask(w);
        out = Value::integer(op == Op::BitAnd ? all : !all);
        return true;
      }
      int64_t r = 0;
      if (op == Op::Plus)
        r = v;
      else if (op == Op::Minus) {
        if (!checkedSub(0, v, r)) return fail("arithmetic overflow");
      } else if (op == Op::LogicalNot)
        r = v == 0;
      else if (op == Op::BitNot)
        r = ~v;
      else if (op == Op::BitAnd)
        r = u == ~uint64_t{0};
      else if (op == Op::BitNand)
        r = u != ~uint64_t{0};
      else if (op == Op::BitOr)
        r = u != 0;
      else if (op == Op::BitNor)
        r = u == 0;
      else if (op == Op::BitXor)
        r = std::popcount(u) & 1;
      else
        r = !(std::popcount(u) & 1);
      out = Value::integer(r);
      return true;
    }
    case Expr::Kind::Binary:
      break;
  }
  // A long left-associative chain (a + b + c + ...) is one deep left spine: walk it with a
  // loop and recurse only into the right operands, which the parser keeps shallow.
  std::vector<const Expr*> spine{&expr};
  ExprId leftmost = expr.args[0];
  while (scope.expr(leftmost).kind == Expr::Kind::Binary) {
    spine.push_back(&scope.expr(leftmost));
    leftmost = spine.back()->args[0];
  }
  Value acc;
  if (!eval(leftmost, scope, locals, acc)) return false;
  for (auto node = spine.rbegin(); node != spine.rend(); ++node) {
    Value result;
    if (!binary(**node, acc, scope, locals, result)) return false;
    acc = std::move(result);
  }
  out = std::move(acc);
  return true;
}

// Unsigned operands make the operation unsigned at the wider operand's width (an integer
// counts 32 bits), wrapping as Verilog does: with N = 32'd0, N - 1 is 4294967295.
bool Evaluator::unsignedBinary(Op op, const Value& a, const Value& b, int64_t x, int64_t y,
                               Value& out) {
  bool selfSized = op == Op::ShiftLeft || op == Op::ShiftRight || op == Op::ArithShiftLeft ||
                   op == Op::ArithShiftRight || op == Op::Power;
  int width = selfSized ? a.unsignedWidth() : std::max(operandWidth(a), operandWidth(b));
  uint64_t mask = lowMask(width);
  uint64_t ux = static_cast<uint64_t>(x) & mask, uy = static_cast<uint64_t>(y) & mask;
  if (isComparison(op)) {
    bool result = op == Op::Less           ? ux < uy
                  : op == Op::LessEqual    ? ux <= uy
                  : op == Op::Greater      ? ux > uy
                  : op == Op::GreaterEqual ? ux >= uy
                  : isInequality(op)       ? ux != uy
                                           : ux == uy;
    out = Value::integer(result);
    return true;
  }
  uint64_t r = 0;
  if (op == Op::Plus)
    r = ux + uy;
  else if (op == Op::Minus)
    r = ux - uy;
  else if (op == Op::Times)
    r = ux * uy;
  else if (op == Op::Divide || op == Op::Modulo) {
    if (uy == 0) return fail("division by zero");
    r = op == Op::Divide ? ux / uy : ux % uy;
  } else if (op == Op::Power) {
    if (y < 0 && !b.unsignedWidth())
      r = ux == 1 ? 1 : 0;
    else
      r = unsignedPower(ux, static_cast<uint64_t>(y));
  } else if (op == Op::ShiftLeft || op == Op::ArithShiftLeft)
    r = y < 0 || y >= 64 ? 0 : ux << y;
  else if (op == Op::ShiftRight || op == Op::ArithShiftRight)
    r = y < 0 || y >= 64 ? 0 : ux >> y;
  else if (op == Op::BitAnd)
    r = ux & uy;
  else if (op == Op::BitOr)
    r = ux | uy;
  else if (op == Op::BitXor)
    r = ux ^ uy;
  else if (op == Op::BitXnor || op == Op::BitXnorAlt)
    r = ~(ux ^ uy);
  else
    return fail("unsupported operator '" + std::string(operatorText(op)) + "'");
  out = unsignedValue(r, width);
  return true;
}

bool Evaluator::binary(const Expr& expr, const Value& a, Scope& scope, Locals* locals, Value& out) {
  Op op = expr.op;
  Value b;
  if (op == Op::LogicalAnd ||
      op == Op::LogicalOr) {  // short-circuit, as constant functions rely on it
    int64_t x = 0;
    bool left = a.isReal() ? a.asReal() != 0 : (toInteger(a, x) && x != 0);
    if (!m_Error.empty()) return false;
    if (op == Op::LogicalAnd ? !left : left) {
      out = Value::integer(left ? 1 : 0);
      return true;
    }
    if (!eval(expr.args[1], scope, locals, b)) return false;
    bool right = b.isReal() ? b.asReal() != 0 : (toInteger(b, x) && x != 0);
    if (!m_Error.empty()) return false;
    out = Value::integer(right ? 1 : 0);
    return true;
  }
  if (!eval(expr.args[1], scope, locals, b)) return false;
  if (a.isString() && b.isString() && isComparison(op)) {
    bool equal = a.asString() == b.asString();
    out = Value::integer(isInequality(op) ? !equal : equal);
    return true;
  }
  if (a.isReal() || b.isReal()) {
    std::optional<double> x = a.toReal(), y = b.toReal();
    if (!x || !y) return fail("operator '" + std::string(operatorText(op)) + "' needs numbers");
    if (isComparison(op)) {
      out = Value::integer(compare(op, *x, *y));
      return true;
    }
    if (op == Op::Plus)
      out = Value::real(*x + *y);
    else if (op == Op::Minus)
      out = Value::real(*x - *y);
    else if (op == Op::Times)
      out = Value::real(*x * *y);
    else if (op == Op::Divide) {
      if (*y == 0) return fail("division by zero");
      out = Value::real(*x / *y);
    } else if (op == Op::Power)
      out = Value::real(std::pow(*x, *y));
    else
      return fail("operator '" + std::string(operatorText(op)) + "' needs integers");
    return true;
  }
  int64_t x = 0, y = 0, r = 0;
  if (!toInteger(a, x) || !toInteger(b, y)) return false;
  bool selfSized = op == Op::ShiftLeft || op == Op::ShiftRight || op == Op::ArithShiftLeft ||
                   op == Op::ArithShiftRight || op == Op::Power;
  if (selfSized ? a.unsignedWidth() != 0 : a.unsignedWidth() || b.unsignedWidth())
    return unsignedBinary(op, a, b, x, y, out);
  if (isComparison(op)) {
    out = Value::integer(compare(op, x, y));
    return true;
  }
  uint64_t ux = static_cast<uint64_t>(x);
  bool ok = true;
  if (op == Op::Plus)
    ok = checkedAdd(x, y, r);
  else if (op == Op::Minus)
    ok = checkedSub(x, y, r);
  else if (op == Op::Times)
    ok = checkedMul(x, y, r);
  else if (op == Op::Divide) {
    if (y == 0) return fail("division by zero");
    ok = checkedDiv(x, y, r);
  } else if (op == Op::Modulo) {
    if (y == 0) return fail("division by zero");
    r = y == -1 ? 0 : x % y;
  } else if (op == Op::Power) {
    if (y < 0)
      r = x == 1 ? 1 : x == -1 ? (y % 2 ? -1 : 1) : 0;
    else
      ok = checkedPow(x, y, r);
  } else if (op == Op::ShiftLeft || op == Op::ArithShiftLeft)
    r = y < 0 || y >= 64 ? 0 : static_cast<int64_t>(ux << y);
  else if (op == Op::ShiftRight)
    r = y < 0 || y >= 64 ? 0 : static_cast<int64_t>(ux >> y);
  else if (op == Op::ArithShiftRight)
    r = y < 0 ? 0 : y >= 64 ? (x < 0 ? -1 : 0) : x >> y;
  else if (op == Op::BitAnd)
    r = x & y;
  else if (op == Op::BitOr)
    r = x | y;
  else if (op == Op::BitXor)
    r = x ^ y;
  else if (op == Op::BitXnor || op == Op::BitXnorAlt)
    r = ~(x ^ y);
  else
    return fail("unsupported operator '" + std::string(operatorText(op)) + "'");
  if (!ok) return fail("arithmetic overflow in '" + std::string(operatorText(op)) + "'");
  out = Value::integer(r);
  return true;
}
}  // namespace scan::verilog
