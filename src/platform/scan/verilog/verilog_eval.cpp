// Values are 64-bit signed integers or reals; Verilog's width rules are not modelled because
// bound expressions never depend on them beyond the sized literals handled here.
#include "platform/scan/verilog/verilog_eval.h"

#include <bit>
#include <cmath>

namespace scan::verilog {
namespace {

constexpr size_t kMaxSteps = 1000000;
constexpr int kMaxDepth = 200;
// Expression nesting, parameters defined through parameters and nested statements all use
// the native stack; this bound keeps hostile input well inside it, sanitizers included.
constexpr int kMaxNesting = 1000;

bool isComparison(const std::string& op) {
  return op == "==" || op == "!=" || op == "===" || op == "!==" || op == "==?" || op == "!=?" ||
         op == "<" || op == "<=" || op == ">" || op == ">=";
}

bool compare(const std::string& op, double a, double b) {
  if (op == "<") return a < b;
  if (op == "<=") return a <= b;
  if (op == ">") return a > b;
  if (op == ">=") return a >= b;
  if (op[0] == '!') return a != b;
  return a == b;
}

bool compare(const std::string& op, int64_t a, int64_t b) {
  if (op == "<") return a < b;
  if (op == "<=") return a <= b;
  if (op == ">") return a > b;
  if (op == ">=") return a >= b;
  if (op[0] == '!') return a != b;
  return a == b;
}

int64_t clog2(int64_t n) {
  if (n <= 1) return 0;
  return 64 - std::countl_zero(static_cast<uint64_t>(n - 1));
}

uint64_t lowMask(int64_t width) {
  return width >= 64 ? ~uint64_t{0} : (uint64_t{1} << width) - 1;
}

// The low bit and width of x[i], x[i:j], x[i+:j] or x[i-:j].
void selectBits(const std::string& op, int64_t i, int64_t j, bool part, int64_t& low,
                int64_t& width) {
  low = i;
  width = 1;
  if (!part) return;
  if (op == "+:") {
    width = j;
  } else if (op == "-:") {
    width = j;
    low = i - j + 1;
  } else {
    low = std::min(i, j);
    width = (i > j ? i - j : j - i) + 1;
  }
}

Value unsignedValue(uint64_t bits, int64_t width) {
  int w = width >= 64 ? 64 : static_cast<int>(width);
  return Value::unsignedInteger(static_cast<int64_t>(bits & lowMask(w)), w);
}

// An operand's width in a Verilog expression: its own when unsigned, else an integer's.
int operandWidth(const Value& v) { return v.unsignedWidth() ? v.unsignedWidth() : 32; }

uint64_t unsignedPower(uint64_t base, uint64_t exponent) {
  uint64_t result = 1;
  for (; exponent; exponent >>= 1, base *= base)
    if (exponent & 1) result *= base;
  return result;
}

class NestingGuard {
 public:
  explicit NestingGuard(int& nesting) : m_Nesting(nesting) { ++m_Nesting; }
  ~NestingGuard() { --m_Nesting; }
  bool tooDeep() const { return m_Nesting > kMaxNesting; }

 private:
  int& m_Nesting;
};

}  // namespace

bool Evaluator::fail(std::string text) {
  if (m_Error.empty()) m_Error = std::move(text);
  return false;
}

bool Evaluator::failAt(Unresolved::Kind kind, const std::string& name, std::string text) {
  if (m_Error.empty()) m_Unresolved = {kind, name};
  return fail(std::move(text));
}

bool Evaluator::toInteger(const Value& value, int64_t& out) {
  if (value.isReal()) {
    double r = std::round(value.asReal());
    if (!(r >= -9.2e18 && r <= 9.2e18)) return fail("real value out of integer range");
    out = static_cast<int64_t>(r);
    return true;
  }
  if (std::optional<int64_t> v = value.toInteger()) {
    out = *v;
    return true;
  }
  return fail("a string is not a number");
}

bool Evaluator::evaluate(const Expr& expr, Scope& scope, Value& out) {
  m_Error.clear();
  m_Unresolved = {};
  m_Steps = 0;
  m_Depth = 0;
  m_Nesting = 0;
  return eval(expr, scope, nullptr, out);
}

bool Evaluator::integer(const Expr& expr, Scope& scope, int64_t& out) {
  Value value;
  return evaluate(expr, scope, value) && toInteger(value, out);
}

// Parameters and functions resolve alike: the scope itself, a named import, the packages of
// wildcard imports (without following their own imports), then the compilation unit.
template <typename Map>
typename Map::mapped_type* Evaluator::findInScopes(const std::string& name, Scope& scope,
                                                   Map Scope::*members, Scope*& owner,
                                                   int depth) {
  if (depth > 8) return nullptr;
  auto it = (scope.*members).find(name);
  if (it != (scope.*members).end()) {
    owner = &scope;
    return &it->second;
  }
  auto named = scope.namedImports.find(name);
  if (named != scope.namedImports.end())
    if (Scope* package = m_Scopes.package(named->second))
      if (auto* found = findInScopes(name, *package, members, owner, depth + 1)) return found;
  for (const std::string& packageName : scope.wildcardImports)
    if (Scope* package = m_Scopes.package(packageName)) {
      auto local = (package->*members).find(name);
      if (local != (package->*members).end()) {
        owner = package;
        return &local->second;
      }
    }
  if (!scope.isCompilationUnit)
    if (Scope* unit = m_Scopes.compilationUnit())
      return findInScopes(name, *unit, members, owner, depth + 1);
  return nullptr;
}

Parameter* Evaluator::findParameter(const std::string& name, Scope& scope, Scope*& owner) {
  return findInScopes(name, scope, &Scope::parameters, owner);
}

Function* Evaluator::findFunction(const std::string& name, Scope& scope, Scope*& owner) {
  std::shared_ptr<Function>* found = findInScopes(name, scope, &Scope::functions, owner);
  return found ? found->get() : nullptr;
}

const TypeSpec* Evaluator::findType(const std::string& package, const std::string& name,
                                    Scope& scope, Scope*& owner) {
  if (!package.empty()) {
    Scope* found = m_Scopes.package(package);
    if (!found) return nullptr;
    return findType("", name, *found, owner);
  }
  Scope* current = &scope;
  for (int depth = 0; current && depth < 8; ++depth) {
    auto it = current->typedefs.find(name);
    if (it != current->typedefs.end()) {
      owner = current;
      return it->second.get();
    }
    auto parameter = current->parameters.find(name);
    if (parameter != current->parameters.end() && parameter->second.isType &&
        parameter->second.typeValue) {
      owner = current;
      return parameter->second.typeValue.get();
    }
    auto named = current->namedImports.find(name);
    if (named != current->namedImports.end())
      if (Scope* imported = m_Scopes.package(named->second)) {
        auto local = imported->typedefs.find(name);
        if (local != imported->typedefs.end()) {
          owner = imported;
          return local->second.get();
        }
      }
    for (const std::string& packageName : current->wildcardImports)
      if (Scope* imported = m_Scopes.package(packageName)) {
        auto local = imported->typedefs.find(name);
        if (local != imported->typedefs.end()) {
          owner = imported;
          return local->second.get();
        }
      }
    current = current->isCompilationUnit ? nullptr : m_Scopes.compilationUnit();
  }
  return nullptr;
}

bool Evaluator::typeWidth(const TypeSpec& type, Scope& scope, int64_t& width) {
  if (++m_Depth > kMaxDepth) {
    --m_Depth;
    return fail("type definitions nested too deeply");
  }
  struct Leave {
    int& depth;
    ~Leave() { --depth; }
  } leave{m_Depth};
  int64_t element = 1;
  switch (type.base) {
    case TypeSpec::Base::Implicit:
    case TypeSpec::Base::Bit:
      break;
    case TypeSpec::Base::Atom:
      element = type.atomWidth;
      break;
    case TypeSpec::Base::Real:
      return fail("type '" + type.written + "' has no bit width");
    case TypeSpec::Base::Named: {
      Scope* owner = nullptr;
      const TypeSpec* found = findType(type.scope, type.name, scope, owner);
      if (!found) return fail("unknown type '" + type.name + "'");
      if (!typeWidth(*found, *owner, element)) return false;
      break;
    }
    case TypeSpec::Base::Struct:
      element = 0;
      for (const TypeSpec& member : type.members) {
        int64_t memberWidth = 0;
        if (!typeWidth(member, scope, memberWidth)) return false;
        if (type.isUnion)
          element = std::max(element, memberWidth);
        else if (!checkedAdd(element, memberWidth, element))
          return fail("type too wide");
      }
      break;
    case TypeSpec::Base::Enum:
      if (type.members.empty() || !typeWidth(type.members[0], scope, element)) return false;
      break;
  }
  for (const Dimension& dim : type.packed) {
    int64_t left = 0, right = 0, size = 0;
    Value value;
    if (!eval(*dim.left, scope, nullptr, value) || !toInteger(value, left)) return false;
    if (dim.right) {
      if (!eval(*dim.right, scope, nullptr, value) || !toInteger(value, right)) return false;
      if (!checkedSub(left, right, size)) return fail("dimension too large");
      size = (size < 0 ? -size : size) + 1;
    } else {
      size = left;
    }
    if (!checkedMul(element, size, element)) return fail("type too wide");
  }
  width = element;
  return true;
}

bool Evaluator::evalParameter(const std::string& name, Parameter& parameter, Scope& owner,
                              Value& out) {
  if (parameter.cached) {
    out = *parameter.cached;
    return true;
  }
  if (parameter.isType) return fail("'" + name + "' is a type, not a value");
  if (!parameter.value)
    return failAt(Unresolved::Kind::ParameterWithoutValue, name,
                  "parameter '" + name + "' has no value");
  if (parameter.busy) return fail("parameter '" + name + "' depends on itself");
  parameter.busy = true;
  bool ok = eval(*parameter.value, owner, nullptr, out);
  parameter.busy = false;
  if (!ok) return false;
  if (parameter.type && !convert(*parameter.type, owner, out)) return false;
  parameter.cached = out;
  return true;
}

// A declared type sets the value's width and signedness as Verilog assignment would:
// truncated, then sign-extended or kept unsigned.
bool Evaluator::convert(const TypeSpec& type, Scope& scope, Value& value) {
  if (!value.isInteger()) return true;
  int64_t width = 0;
  bool isSigned = false;
  switch (type.base) {
    case TypeSpec::Base::Atom:
      width = type.atomWidth;
      isSigned = type.signing >= 0 && type.written != "time";
      break;
    case TypeSpec::Base::Bit:
    case TypeSpec::Base::Implicit:
      if (type.packed.empty() && type.base == TypeSpec::Base::Implicit) return true;
      if (!typeWidth(type, scope, width)) return false;
      isSigned = type.signing > 0;
      break;
    default:
      return true;
  }
  if (width <= 0) return true;
  uint64_t bits = static_cast<uint64_t>(value.asInteger()) & lowMask(width);
  if (!isSigned) {
    value = unsignedValue(bits, width);
  } else {
    if (width < 64 && (bits >> (width - 1)) & 1) bits |= ~lowMask(width);
    value = Value::integer(static_cast<int64_t>(bits));
  }
  return true;
}

bool Evaluator::evalElement(const Expr& select, const std::string& name, Parameter& parameter,
                            Scope& owner, Scope& scope, Locals* locals, Value& out) {
  if (select.args.size() != 2) return fail("a slice of parameter array '" + name + "'");
  Value index;
  int64_t i = 0, left = 0, right = 0;
  if (!eval(*select.args[1], scope, locals, index) || !toInteger(index, i)) return false;
  const Dimension& dim = parameter.unpacked[0];
  Value bound;
  if (!eval(*dim.left, owner, nullptr, bound) || !toInteger(bound, left)) return false;
  if (dim.right) {
    if (!eval(*dim.right, owner, nullptr, bound) || !toInteger(bound, right)) return false;
  } else {
    right = left - 1;
    left = 0;
  }
  int64_t position = left <= right ? i - left : left - i;
  if (position < 0 || position > (left <= right ? right - left : left - right))
    return fail("index " + std::to_string(i) + " is outside parameter array '" + name + "'");
  const Expr* pattern = parameter.value.get();
  if (!pattern) return fail("parameter '" + name + "' has no value");
  if (pattern->kind != Expr::Kind::Pattern)
    return fail("parameter array '" + name + "' is not given an assignment pattern");
  const Expr* element = nullptr;
  size_t at = static_cast<size_t>(position);
  if (pattern->op == "{") {
    size_t items = pattern->args.size() - 1;
    if (items > 0) element = pattern->args[1 + at % items].get();
  } else if (pattern->op == ":") {
    for (size_t k = 0; k + 1 < pattern->args.size() && !element; k += 2) {
      Value key;
      int64_t keyIndex = 0;
      if (!pattern->args[k]) continue;
      if (!eval(*pattern->args[k], owner, nullptr, key) || !toInteger(key, keyIndex)) return false;
      if (keyIndex == i) element = pattern->args[k + 1].get();
    }
    for (size_t k = 0; k + 1 < pattern->args.size() && !element; k += 2)
      if (!pattern->args[k]) element = pattern->args[k + 1].get();
  } else if (at < pattern->args.size()) {
    element = pattern->args[at].get();
  }
  if (!element)
    return fail("the assignment pattern of '" + name + "' has no element " + std::to_string(i));
  if (!eval(*element, owner, nullptr, out)) return false;
  return !parameter.type || convert(*parameter.type, owner, out);
}

bool Evaluator::evalName(const Expr& expr, Scope& scope, Locals* locals, Value& out) {
  if (expr.scope.empty() && locals) {
    auto it = locals->find(expr.name);
    if (it != locals->end()) {
      out = it->second;
      return true;
    }
  }
  Scope* owner = nullptr;
  Parameter* parameter = nullptr;
  if (!expr.scope.empty()) {
    Scope* package = m_Scopes.package(expr.scope);
    if (!package)
      return failAt(Unresolved::Kind::UnknownPackage, expr.scope,
                    "unknown package '" + expr.scope + "'");
    auto it = package->parameters.find(expr.name);
    if (it != package->parameters.end()) {
      owner = package;
      parameter = &it->second;
    }
  } else {
    parameter = findParameter(expr.name, scope, owner);
  }
  if (!parameter)
    return failAt(Unresolved::Kind::UnknownName, expr.name,
                  "unknown name '" + (expr.scope.empty() ? "" : expr.scope + "::") + expr.name +
                      "'");
  return evalParameter(expr.name, *parameter, *owner, out);
}

bool Evaluator::sizedValue(const Expr& expr, Scope& scope, Locals* locals, int64_t& value,
                           int64_t& width) {
  if (expr.kind == Expr::Kind::Number && expr.width > 0 && !expr.unknown) {
    value = expr.integer;
    width = expr.width;
    return true;
  }
  if (expr.kind == Expr::Kind::Concat || expr.kind == Expr::Kind::Replicate) {
    int64_t count = 1;
    size_t first = 0;
    if (expr.kind == Expr::Kind::Replicate) {
      Value times;
      if (!eval(*expr.args[0], scope, locals, times) || !toInteger(times, count)) return false;
      if (count < 0 || count > 4096) return fail("replication count out of range");
      first = 1;
    }
    uint64_t acc = 0;
    int64_t total = 0;
    for (int64_t r = 0; r < count; ++r)
      for (size_t i = first; i < expr.args.size(); ++i) {
        int64_t v = 0, w = 0;
        if (!sizedValue(*expr.args[i], scope, locals, v, w)) return false;
        acc = (w >= 64 ? 0 : acc << w) | (static_cast<uint64_t>(v) & lowMask(w));
        total += w;
      }
    value = static_cast<int64_t>(acc);
    width = total;
    return true;
  }
  if (expr.kind == Expr::Kind::Name) {
    Scope* owner = nullptr;
    Parameter* parameter = expr.scope.empty() ? findParameter(expr.name, scope, owner) : nullptr;
    if (parameter && parameter->type && !locals) {
      Value v;
      if (!evalParameter(expr.name, *parameter, *owner, v) || !toInteger(v, value)) return false;
      return typeWidth(*parameter->type, *owner, width);
    }
  }
  return fail("a concatenation needs sized operands");
}

bool Evaluator::evalBits(const Expr& arg, Scope& scope, Locals* locals, int64_t& width) {
  if (arg.kind == Expr::Kind::TypeName) return typeWidth(*arg.type, scope, width);
  if (arg.kind == Expr::Kind::Name) {
    Scope* owner = nullptr;
    if (const TypeSpec* type = findType(arg.scope, arg.name, scope, owner))
      return typeWidth(*type, *owner, width);
    Parameter* parameter = arg.scope.empty() ? findParameter(arg.name, scope, owner) : nullptr;
    if (parameter && parameter->type) return typeWidth(*parameter->type, *owner, width);
    if (parameter && parameter->value) {
      int64_t value = 0;
      if (parameter->value->kind == Expr::Kind::Number && parameter->value->width > 0) {
        width = parameter->value->width;
        return true;
      }
      Value v;
      if (!evalParameter(arg.name, *parameter, *owner, v)) return false;
      (void)value;
      width = v.isString() ? static_cast<int64_t>(v.asString().size()) * 8 : 32;
      return true;
    }
  }
  int64_t value = 0;
  return sizedValue(arg, scope, locals, value, width);
}

bool Evaluator::evalSystem(const Expr& expr, Scope& scope, Locals* locals, Value& out) {
  const std::string& name = expr.name;
  if (name == "$bits") {
    int64_t width = 0;
    if (expr.args.size() != 1) return fail("$bits takes one argument");
    if (!evalBits(*expr.args[0], scope, locals, width)) return false;
    out = Value::integer(width);
    return true;
  }
  std::vector<Value> args;
  for (const ExprPtr& arg : expr.args) {
    if (arg->kind == Expr::Kind::TypeName) return fail(name + " does not take a type");
    Value v;
    if (!eval(*arg, scope, locals, v)) return false;
    args.push_back(std::move(v));
  }
  auto needs = [&](size_t count) {
    return args.size() == count || fail(name + " takes " + std::to_string(count) + " argument" +
                                        (count == 1 ? "" : "s"));
  };
  if (name == "$clog2") {
    int64_t n = 0;
    if (!needs(1) || !toInteger(args[0], n)) return false;
    out = Value::integer(clog2(n));
    return true;
  }
  if (name == "$signed" || name == "$unsigned") {
    if (!needs(1)) return false;
    out = args[0];
    if (!out.isInteger()) return true;
    uint64_t bits = static_cast<uint64_t>(out.asInteger());
    if (int w = out.unsignedWidth(); w && name == "$signed") {
      if (w < 64 && (bits >> (w - 1)) & 1) bits |= ~lowMask(w);
      out = Value::integer(static_cast<int64_t>(bits));
    } else if (!w && name == "$unsigned") {
      out = unsignedValue(bits, fitsBound(out.asInteger()) ? 32 : 64);
    }
    return true;
  }
  if (name == "$rtoi" || name == "$itor" || name == "$floor" || name == "$ceil" ||
      name == "$ln" || name == "$log10" || name == "$exp" || name == "$sqrt") {
    if (!needs(1)) return false;
    std::optional<double> x = args[0].toReal();
    if (!x) return fail(name + " needs a number");
    if (name == "$rtoi") {
      if (!(std::fabs(*x) < 9.2e18)) return fail("real value out of integer range");
      out = Value::integer(static_cast<int64_t>(*x));
      return true;
    }
    double r = name == "$itor"    ? *x
               : name == "$floor" ? std::floor(*x)
               : name == "$ceil"  ? std::ceil(*x)
               : name == "$ln"    ? std::log(*x)
               : name == "$log10" ? std::log10(*x)
               : name == "$exp"   ? std::exp(*x)
                                  : std::sqrt(*x);
    out = Value::real(r);
    return true;
  }
  if (name == "$pow") {
    if (!needs(2)) return false;
    std::optional<double> x = args[0].toReal(), y = args[1].toReal();
    if (!x || !y) return fail("$pow needs numbers");
    out = Value::real(std::pow(*x, *y));
    return true;
  }
  return fail("unsupported system function " + name);
}

bool Evaluator::evalCall(const Expr& expr, Scope& scope, Locals* locals, Value& out) {
  Scope* owner = nullptr;
  Function* function = nullptr;
  if (!expr.scope.empty()) {
    if (Scope* package = m_Scopes.package(expr.scope)) {
      auto it = package->functions.find(expr.name);
      if (it != package->functions.end()) {
        owner = package;
        function = it->second.get();
      }
    }
  } else {
    function = findFunction(expr.name, scope, owner);
  }
  if (!function) return fail("unknown function '" + expr.name + "'");
  if (!function->supported)
    return fail("function '" + expr.name + "' uses statements that cannot be evaluated");
  if (expr.args.size() != function->inputs.size())
    return fail("function '" + expr.name + "' takes " + std::to_string(function->inputs.size()) +
                " argument(s)");
  if (m_Depth >= kMaxDepth) return fail("function calls nested too deeply");
  Locals frame;
  for (size_t i = 0; i < expr.args.size(); ++i) {
    Value v;
    if (!eval(*expr.args[i], scope, locals, v)) return false;
    frame[function->inputs[i]] = v;
  }
  frame[function->name] = Value::integer(0);
  ++m_Depth;
  Flow flow = Flow::Normal;
  std::string savedReturn = std::move(m_ReturnName);
  m_ReturnName = function->name;
  bool ok = run(function->body, *owner, frame, flow);
  m_ReturnName = std::move(savedReturn);
  --m_Depth;
  if (!ok) return false;
  out = frame[function->name];
  return true;
}

bool Evaluator::assignSelect(const Stmt& stmt, const Value& v, Scope& scope, Locals& locals) {
  auto target = locals.find(stmt.target);
  if (target == locals.end()) return fail("unknown variable '" + stmt.target + "'");
  int64_t old = 0, value = 0, i = 0, j = 0;
  Value index;
  if (!toInteger(target->second, old) || !toInteger(v, value)) return false;
  if (!eval(*stmt.index, scope, &locals, index) || !toInteger(index, i)) return false;
  if (stmt.indexEnd && (!eval(*stmt.indexEnd, scope, &locals, index) || !toInteger(index, j)))
    return false;
  int64_t low = 0, width = 0;
  selectBits(stmt.selectOp, i, j, stmt.indexEnd != nullptr, low, width);
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
  if (++m_Steps > kMaxSteps)
    return fail("constant function did not finish within " + std::to_string(kMaxSteps) +
                " steps");
  NestingGuard nesting(m_Nesting);
  if (nesting.tooDeep()) return fail("evaluation is nested too deeply");
  auto truth = [&](const ExprPtr& condition, bool& result) {
    Value v;
    int64_t i = 0;
    if (!eval(*condition, scope, &locals, v)) return false;
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
      if (stmt.value && !eval(*stmt.value, scope, &locals, v)) return false;
      locals[stmt.target] = v;
      return true;
    }
    case Stmt::Kind::Assign: {
      Value v;
      if (!eval(*stmt.value, scope, &locals, v)) return false;
      if (stmt.index) return assignSelect(stmt, v, scope, locals);
      if (stmt.op != "=") {
        auto it = locals.find(stmt.target);
        if (it == locals.end()) return fail("unknown variable '" + stmt.target + "'");
        Expr current;
        current.kind = Expr::Kind::Binary;
        current.op = stmt.op.substr(0, stmt.op.size() - 1);
        auto left = std::make_shared<Expr>();
        left->kind = Expr::Kind::Name;
        left->name = stmt.target;
        current.args = {left, stmt.value};
        if (!eval(current, scope, &locals, v)) return false;
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
      if (!eval(*stmt.value, scope, &locals, v) || !toInteger(v, count)) return false;
      for (int64_t i = 0; i < count; ++i) {
        if (!runOne(stmt.body[0], scope, locals, flow)) return false;
        if (flow == Flow::Return) return true;
      }
      return true;
    }
    case Stmt::Kind::Return:
      if (stmt.value) {
        Value v;
        if (!eval(*stmt.value, scope, &locals, v)) return false;
        locals[m_ReturnName] = v;
      }
      flow = Flow::Return;
      return true;
    case Stmt::Kind::Case: {
      Value subject;
      int64_t key = 0;
      if (!eval(*stmt.value, scope, &locals, subject) || !toInteger(subject, key)) return false;
      for (size_t i = 0; i < stmt.body.size(); ++i) {
        for (const ExprPtr& label : stmt.labels[i]) {
          Value v;
          int64_t candidate = 0;
          if (!eval(*label, scope, &locals, v) || !toInteger(v, candidate)) return false;
          if (candidate == key) return runOne(stmt.body[i], scope, locals, flow);
        }
      }
      if (stmt.hasDefault) return runOne(stmt.body.back(), scope, locals, flow);
      return true;
    }
  }
  return true;
}

bool Evaluator::eval(const Expr& expr, Scope& scope, Locals* locals, Value& out) {
  if (++m_Steps > kMaxSteps) return fail("evaluation did not finish within the step limit");
  NestingGuard nesting(m_Nesting);
  if (nesting.tooDeep()) return fail("evaluation is nested too deeply");
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
      if (!eval(*expr.args[0], scope, locals, condition)) return false;
      bool yes = condition.isReal() ? condition.asReal() != 0 : false;
      if (!condition.isReal()) {
        int64_t i = 0;
        if (!toInteger(condition, i)) return false;
        yes = i != 0;
      }
      return eval(*expr.args[yes ? 1 : 2], scope, locals, out);
    }
    case Expr::Kind::Select: {
      if (const Expr& base = *expr.args[0]; base.kind == Expr::Kind::Name &&
                                            !(locals && base.scope.empty() &&
                                              locals->count(base.name))) {
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
      if (!eval(*expr.args[0], scope, locals, base) || !toInteger(base, b)) return false;
      if (!eval(*expr.args[1], scope, locals, index) || !toInteger(index, i)) return false;
      if (expr.args.size() == 3) {
        Value second;
        if (!eval(*expr.args[2], scope, locals, second) || !toInteger(second, j)) return false;
      }
      int64_t low = 0, width = 0;
      selectBits(expr.op, i, j, expr.args.size() == 3, low, width);
      if (low < 0 || low >= 64 || width <= 0) return fail("bit select out of range");
      out = unsignedValue(static_cast<uint64_t>(b) >> low, width);
      return true;
    }
    case Expr::Kind::Unary: {
      Value operand;
      if (!eval(*expr.args[0], scope, locals, operand)) return false;
      const std::string& op = expr.op;
      if (operand.isReal() && (op == "-" || op == "+")) {
        out = Value::real(op == "-" ? -operand.asReal() : operand.asReal());
        return true;
      }
      int64_t v = 0;
      if (!toInteger(operand, v)) return false;
      uint64_t u = static_cast<uint64_t>(v);
      if (int w = operand.unsignedWidth(); w && (op == "+" || op == "-" || op == "~")) {
        out = unsignedValue(op == "+" ? u : op == "-" ? uint64_t{0} - u : ~u, w);
        return true;
      }
      if (int w = operand.unsignedWidth(); w && (op == "&" || op == "~&")) {
        bool all = u == lowMask(w);
        out = Value::integer(op == "&" ? all : !all);
        return true;
      }
      int64_t r = 0;
      if (op == "+") r = v;
      else if (op == "-") {
        if (!checkedSub(0, v, r)) return fail("arithmetic overflow");
      } else if (op == "!") r = v == 0;
      else if (op == "~") r = ~v;
      else if (op == "&") r = u == ~uint64_t{0};
      else if (op == "~&") r = u != ~uint64_t{0};
      else if (op == "|") r = u != 0;
      else if (op == "~|") r = u == 0;
      else if (op == "^") r = std::popcount(u) & 1;
      else r = !(std::popcount(u) & 1);
      out = Value::integer(r);
      return true;
    }
    case Expr::Kind::Binary:
      break;
  }
  // A long left-associative chain (a + b + c + ...) is one deep left spine: walk it with a
  // loop and recurse only into the right operands, which the parser keeps shallow.
  std::vector<const Expr*> spine;
  const Expr* leftmost = &expr;
  while (leftmost->kind == Expr::Kind::Binary) {
    spine.push_back(leftmost);
    leftmost = leftmost->args[0].get();
  }
  Value acc;
  if (!eval(*leftmost, scope, locals, acc)) return false;
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
bool Evaluator::unsignedBinary(const std::string& op, const Value& a, const Value& b, int64_t x,
                               int64_t y, Value& out) {
  bool selfSized = op == "<<" || op == ">>" || op == "<<<" || op == ">>>" || op == "**";
  int width = selfSized ? a.unsignedWidth() : std::max(operandWidth(a), operandWidth(b));
  uint64_t mask = lowMask(width);
  uint64_t ux = static_cast<uint64_t>(x) & mask, uy = static_cast<uint64_t>(y) & mask;
  if (isComparison(op)) {
    bool result = op == "<"    ? ux < uy
                  : op == "<=" ? ux <= uy
                  : op == ">"  ? ux > uy
                  : op == ">=" ? ux >= uy
                  : op[0] == '!' ? ux != uy
                                 : ux == uy;
    out = Value::integer(result);
    return true;
  }
  uint64_t r = 0;
  if (op == "+") r = ux + uy;
  else if (op == "-") r = ux - uy;
  else if (op == "*") r = ux * uy;
  else if (op == "/" || op == "%") {
    if (uy == 0) return fail("division by zero");
    r = op == "/" ? ux / uy : ux % uy;
  } else if (op == "**") {
    if (y < 0 && !b.unsignedWidth()) r = ux == 1 ? 1 : 0;
    else r = unsignedPower(ux, static_cast<uint64_t>(y));
  } else if (op == "<<" || op == "<<<") r = y < 0 || y >= 64 ? 0 : ux << y;
  else if (op == ">>" || op == ">>>") r = y < 0 || y >= 64 ? 0 : ux >> y;
  else if (op == "&") r = ux & uy;
  else if (op == "|") r = ux | uy;
  else if (op == "^") r = ux ^ uy;
  else if (op == "~^" || op == "^~") r = ~(ux ^ uy);
  else return fail("unsupported operator '" + op + "'");
  out = unsignedValue(r, width);
  return true;
}

bool Evaluator::binary(const Expr& expr, const Value& a, Scope& scope, Locals* locals,
                       Value& out) {
  const std::string& op = expr.op;
  Value b;
  if (op == "&&" || op == "||") {  // short-circuit, as constant functions rely on it
    int64_t x = 0;
    bool left = a.isReal() ? a.asReal() != 0 : (toInteger(a, x) && x != 0);
    if (!m_Error.empty()) return false;
    if (op == "&&" ? !left : left) {
      out = Value::integer(left ? 1 : 0);
      return true;
    }
    if (!eval(*expr.args[1], scope, locals, b)) return false;
    bool right = b.isReal() ? b.asReal() != 0 : (toInteger(b, x) && x != 0);
    if (!m_Error.empty()) return false;
    out = Value::integer(right ? 1 : 0);
    return true;
  }
  if (!eval(*expr.args[1], scope, locals, b)) return false;
  if (a.isString() && b.isString() && isComparison(op)) {
    bool equal = a.asString() == b.asString();
    out = Value::integer(op[0] == '!' ? !equal : equal);
    return true;
  }
  if (a.isReal() || b.isReal()) {
    std::optional<double> x = a.toReal(), y = b.toReal();
    if (!x || !y) return fail("operator '" + op + "' needs numbers");
    if (isComparison(op)) {
      out = Value::integer(compare(op, *x, *y));
      return true;
    }
    if (op == "+") out = Value::real(*x + *y);
    else if (op == "-") out = Value::real(*x - *y);
    else if (op == "*") out = Value::real(*x * *y);
    else if (op == "/") {
      if (*y == 0) return fail("division by zero");
      out = Value::real(*x / *y);
    } else if (op == "**") out = Value::real(std::pow(*x, *y));
    else return fail("operator '" + op + "' needs integers");
    return true;
  }
  int64_t x = 0, y = 0, r = 0;
  if (!toInteger(a, x) || !toInteger(b, y)) return false;
  bool selfSized = op == "<<" || op == ">>" || op == "<<<" || op == ">>>" || op == "**";
  if (selfSized ? a.unsignedWidth() != 0 : a.unsignedWidth() || b.unsignedWidth())
    return unsignedBinary(op, a, b, x, y, out);
  if (isComparison(op)) {
    out = Value::integer(compare(op, x, y));
    return true;
  }
  uint64_t ux = static_cast<uint64_t>(x);
  bool ok = true;
  if (op == "+") ok = checkedAdd(x, y, r);
  else if (op == "-") ok = checkedSub(x, y, r);
  else if (op == "*") ok = checkedMul(x, y, r);
  else if (op == "/") {
    if (y == 0) return fail("division by zero");
    ok = checkedDiv(x, y, r);
  } else if (op == "%") {
    if (y == 0) return fail("division by zero");
    r = y == -1 ? 0 : x % y;
  } else if (op == "**") {
    if (y < 0) r = x == 1 ? 1 : x == -1 ? (y % 2 ? -1 : 1) : 0;
    else ok = checkedPow(x, y, r);
  } else if (op == "<<" || op == "<<<") r = y < 0 || y >= 64 ? 0 : static_cast<int64_t>(ux << y);
  else if (op == ">>") r = y < 0 || y >= 64 ? 0 : static_cast<int64_t>(ux >> y);
  else if (op == ">>>") r = y < 0 ? 0 : y >= 64 ? (x < 0 ? -1 : 0) : x >> y;
  else if (op == "&") r = x & y;
  else if (op == "|") r = x | y;
  else if (op == "^") r = x ^ y;
  else if (op == "~^" || op == "^~") r = ~(x ^ y);
  else return fail("unsupported operator '" + op + "'");
  if (!ok) return fail("arithmetic overflow in '" + op + "'");
  out = Value::integer(r);
  return true;
}

}  // namespace scan::verilog
