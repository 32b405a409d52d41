// Constant evaluation of VHDL bounds: expressions over generics, package constants (array
// and record ones too), types' attributes, predefined and math_real functions, and user
// functions run by a small interpreter with a step limit. Failures are values, with a reason
// for the message.
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "scan/vhdl/vhdl_design.h"

namespace scan::vhdl {

struct RangeValue {
  int64_t left = 0;
  int64_t right = 0;
  bool ascending = false;
  int64_t low() const { return ascending ? left : right; }
  int64_t high() const { return ascending ? right : left; }
  /// Number of elements; 0 for a null range.
  int64_t length() const;
};

/// The running state of one user function call.
struct Frame {
  const FunctionBody* function = nullptr;
  std::vector<Value> parameters;
  std::vector<Value> locals;
  std::vector<std::pair<std::string, Value>> loopVariables;
};

/// Where names are looked up: a unit's declarations and uses, and a call's frame.
struct EvalContext {
  UnitScope* unit = nullptr;
  Frame* frame = nullptr;
};

class Evaluator {
 public:
  /// Steps one top-level evaluation may take inside user functions.
  static constexpr uint64_t kStepLimit = 1000000;

  explicit Evaluator(Design& design) : m_Design(design) {}

  enum class Shape { Scalar, Array, Unconstrained, Unknown, Failed };
  /// What a port of this subtype is: a scalar, an array with `out` as its (first) index
  /// range, an unconstrained array, or of a type nobody declared. On Failed, `failed` is the
  /// range expression that could not be evaluated and reason() says why.
  Shape portShape(const EvalContext& context, const SubtypeIndication& subtype, RangeValue& out,
                  const Expr*& failed);

  /// Why the last evaluation failed.
  const std::string& reason() const { return m_Reason; }

  /// The value of generic or constant `decl` of `unit`, evaluated once and cached; false
  /// with reason() set when it has none.
  bool constant(UnitScope* unit, Decl& decl, Value& out);
  /// The value of expression `id` of `context.unit`; false with reason() set.
  bool evaluate(const EvalContext& context, ExprId id, Value& out);
  /// The declaration `typeMark` names as seen from `context`, and its unit; a null
  /// declaration for predefined and undeclared types.
  std::pair<UnitScope*, Decl*> declarationOf(const EvalContext& context,
                                             const std::vector<std::string_view>& typeMark);

 private:
  struct Found {
    UnitScope* unit = nullptr;
    Decl* decl = nullptr;
    Value* local = nullptr;
    const Decl* localDecl = nullptr;
    explicit operator bool() const { return decl != nullptr || local != nullptr; }
  };
  static constexpr size_t kAnyArity = static_cast<size_t>(-1);

  /// What an aggregate's target type tells about its elements and bounds.
  struct TargetType {
    const Decl* record = nullptr;  ///< a record type: its fields
    UnitScope* recordUnit = nullptr;
    bool constrained = false;  ///< an array with known bounds
    RangeValue bounds;
    bool indexed = false;  ///< an unconstrained array with a known index subtype
    RangeValue index;
    const SubtypeIndication* element = nullptr;  ///< array element subtype, when known
    UnitScope* elementUnit = nullptr;
  };

  bool failWith(std::string reason);
  /// Evaluates `id` as a value of `subtype` (written in `typeUnit`): aggregates take their
  /// bounds and field names from it. A null subtype evaluates without a target.
  bool evalAs(const EvalContext& c, ExprId id, UnitScope* typeUnit,
              const SubtypeIndication* subtype, Value& out);
  bool describeType(UnitScope* unit, const SubtypeIndication& subtype, TargetType& out, int depth);
  bool evalAggregate(const EvalContext& c, const Expr& e, const TargetType* type, Value& out);
  bool evalRecordAggregate(const EvalContext& c, const Expr& e, const TargetType& type, Value& out);
  bool evalElement(const EvalContext& c, ExprId id, const TargetType* type, Value& out);
  bool indexValue(const EvalContext& c, const Expr& call, const Value& array, Value& out);
  /// True when `prefix` names a value (an object, a call or a field of one) rather than a
  /// package, so `prefix.name` selects a record field.
  bool isValuePrefix(const EvalContext& c, const Expr& prefix);
  bool selectField(const EvalContext& c, const Expr& e, Value& out);
  bool evalImage(const EvalContext& c, const Expr& e, Value& out);
  bool eval(const EvalContext& c, ExprId id, Value& out);
  bool evalName(const EvalContext& c, const Expr& e, Value& out);
  bool evalCall(const EvalContext& c, const Expr& e, Value& out);
  bool evalAttribute(const EvalContext& c, const Expr& e, Value& out);
  bool evalUnary(const EvalContext& c, const Expr& e, Value& out);
  bool evalBinary(const EvalContext& c, const Expr& e, Value& out);
  /// `a op e.b` for the binary expression `e`, its left operand already evaluated to `a`.
  bool applyBinary(const EvalContext& c, const Expr& e, const Value& a, Value& out);
  bool evalRange(const EvalContext& c, ExprId id, RangeValue& out);
  bool constantValue(UnitScope* unit, Decl& decl, Value& out);
  bool foundValue(const Found& f, std::string_view name, Value& out);

  Found lookup(const EvalContext& c, const std::string& key, size_t arity);
  Found pick(UnitScope* unit, const std::string& key, size_t arity);
  Found resolve(const EvalContext& c, const Expr& nameExpr, size_t arity);
  Found followAlias(Found f, size_t arity);
  Found resolveMark(const EvalContext& c, const std::vector<std::string_view>& typeMark);

  bool typeRange(const EvalContext& c, const std::vector<std::string_view>& typeMark,
                 RangeValue& out);
  bool declRange(UnitScope* unit, Decl& decl, RangeValue& out);
  bool subtypeRange(const EvalContext& c, const SubtypeIndication& s, RangeValue& out);
  bool prefixRange(const EvalContext& c, const Expr& prefix, RangeValue& out);
  bool compositeRange(const Value& array, std::string_view name, RangeValue& out);
  Shape shapeOfDecl(UnitScope* unit, const Decl& decl, RangeValue& out, const Expr*& failed,
                    int depth);

  bool callBuiltin(std::string_view name, const std::vector<Value>& args, Value& out, bool& known);
  bool callFunction(UnitScope* unit, Decl& decl, const std::vector<Value>& args, Value& out);
  enum class Flow { Normal, Return, Exit, Next, Failed };
  Flow execute(const EvalContext& c, const std::vector<int32_t>& list, Value& result,
               std::string_view& label);
  Flow executeOne(const EvalContext& c, const Stmt& s, Value& result, std::string_view& label);
  Flow loopBody(const EvalContext& c, const Stmt& s, Value& result, std::string_view& label,
                bool& stop);
  bool step();

  Design& m_Design;
  std::string m_Reason;
  int m_Depth = 0;
  int m_Calls = 0;
  int m_AliasHops = 0;
  uint64_t m_Steps = 0;
};

}  // namespace scan::vhdl
