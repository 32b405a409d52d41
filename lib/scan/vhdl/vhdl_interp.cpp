// The interpreter for user functions that size ports (log2ceil and friends): integer, real
// and boolean variables, if/case, the three loop forms, exit/next and return. Every
// statement and loop turn costs a step; a runaway loop ends at the step limit.
#include "scan/common/reader_limits.h"
#include "scan/vhdl/vhdl_eval.h"
#include "scan/vhdl/vhdl_parser.h"

namespace scan::vhdl {

bool Evaluator::callFunction(UnitScope* unit, Decl& decl, const std::vector<Value>& args,
                             Value& out) {
  UnitScope* bodyUnit = unit;
  Decl* bodyDecl = decl.hasBody ? &decl : nullptr;
  if (bodyDecl == nullptr && unit->record->kind == UnitKind::Package) {
    if (UnitScope* body = m_Design.bodyOf(*unit)) {
      if (const std::vector<size_t>* list = body->find(decl.key))
        for (size_t i : *list) {
          Decl& d = body->decls[i];
          if (d.kind == DeclKind::Function && d.hasBody &&
              d.parameterCount == decl.parameterCount) {
            bodyDecl = &d;
            bodyUnit = body;
            break;
          }
        }
    }
  }
  if (bodyDecl == nullptr) return failWith("function " + quoted(decl.name) + " has no body");
  if (m_Calls >= limits::kVhdlCallNesting) return failWith("function calls are nested too deeply");
  const FunctionBody* fn = m_Design.function(*bodyUnit, *bodyDecl);
  if (fn == nullptr) return failWith("function " + quoted(decl.name) + " cannot be evaluated");
  if (args.size() > fn->parameters.size())
    return failWith("too many arguments to " + quoted(decl.name));
  Frame frame;
  frame.function = fn;
  frame.parameters.resize(fn->parameters.size());
  frame.locals.resize(fn->locals.size());
  EvalContext outer{bodyUnit, nullptr};
  for (size_t i = 0; i < fn->parameters.size(); ++i) {
    if (i < args.size())
      frame.parameters[i] = args[i];
    else if (fn->parameters[i].init == kNoExpr)
      return failWith("missing argument " + quoted(fn->parameters[i].name) + " to " +
                      quoted(decl.name));
    else if (!evalAs(outer, fn->parameters[i].init, bodyUnit, &fn->parameters[i].subtype,
                     frame.parameters[i]))
      return false;
  }
  EvalContext c{bodyUnit, &frame};
  for (size_t i = 0; i < fn->locals.size(); ++i) {
    const Decl& local = fn->locals[i];
    if (local.kind == DeclKind::Alias) {
      // An alias of an object is read once, as a constant; one of a type has no value.
      std::string saved = m_Reason;
      if (!eval(c, local.init, frame.locals[i])) m_Reason = saved;
      continue;
    }
    if (local.kind != DeclKind::Variable && local.kind != DeclKind::Constant) continue;
    if (local.init != kNoExpr) {
      if (!evalAs(c, local.init, bodyUnit, &local.subtype, frame.locals[i])) return false;
      continue;
    }
    // Without an initial value a scalar variable starts at its type's left bound.
    RangeValue r;
    std::string saved = m_Reason;
    if (!local.subtype.typeMark.empty() && equalsWord(local.subtype.typeMark.back(), "boolean"))
      frame.locals[i] = Value::boolean(false);
    else if (subtypeRange(c, local.subtype, r))
      frame.locals[i] = Value::integer(r.left);
    m_Reason = saved;
  }
  ++m_Calls;
  Value result;
  std::string_view label;
  Flow flow = execute(c, fn->top, result, label);
  --m_Calls;
  if (flow == Flow::Failed) return false;
  if (flow != Flow::Return || result.isNone())
    return failWith("function " + quoted(decl.name) + " ended without returning a value");
  out = result;
  return true;
}

Evaluator::Flow Evaluator::execute(const EvalContext& c, const std::vector<int32_t>& list,
                                   Value& result, std::string_view& label) {
  for (int32_t index : list) {
    Flow flow =
        executeOne(c, c.frame->function->statements[static_cast<size_t>(index)], result, label);
    if (flow != Flow::Normal) return flow;
  }
  return Flow::Normal;
}

Evaluator::Flow Evaluator::loopBody(const EvalContext& c, const Stmt& s, Value& result,
                                    std::string_view& label, bool& stop) {
  Flow flow = execute(c, s.branches[0], result, label);
  if (flow == Flow::Exit || flow == Flow::Next) {
    bool mine =
        label.empty() || (!s.label.empty() && normalizeName(label) == normalizeName(s.label));
    if (mine) {
      label = {};
      stop = flow == Flow::Exit;
      return Flow::Normal;
    }
  }
  stop = flow != Flow::Normal;
  return flow;
}

Evaluator::Flow Evaluator::executeOne(const EvalContext& c, const Stmt& s, Value& result,
                                      std::string_view& label) {
  if (!step()) return Flow::Failed;
  Frame& frame = *c.frame;
  auto condition = [&](ExprId id, bool& out) {
    Value v;
    if (!eval(c, id, v)) return false;
    if (!v.isBoolean()) return failWith("a condition is not a boolean");
    out = v.asBoolean();
    return true;
  };
  switch (s.kind) {
    case StmtKind::Null:
      return Flow::Normal;
    case StmtKind::Return:
      if (s.expr != kNoExpr && !eval(c, s.expr, result)) return Flow::Failed;
      return Flow::Return;
    case StmtKind::Exit:
    case StmtKind::Next: {
      bool taken = true;
      if (s.expr != kNoExpr && !condition(s.expr, taken)) return Flow::Failed;
      if (!taken) return Flow::Normal;
      label = s.label;
      return s.kind == StmtKind::Exit ? Flow::Exit : Flow::Next;
    }
    case StmtKind::Assign: {
      const std::string& key = s.key;
      Value* target = nullptr;
      const FunctionBody& fn = *frame.function;
      for (size_t i = 0; i < fn.locals.size() && target == nullptr; ++i)
        if (fn.locals[i].key == key && fn.locals[i].kind == DeclKind::Variable)
          target = &frame.locals[i];
      for (size_t i = 0; i < fn.parameters.size() && target == nullptr; ++i)
        if (fn.parameters[i].key == key) target = &frame.parameters[i];
      if (target == nullptr) {
        failWith("cannot assign to " + quoted(s.name));
        return Flow::Failed;
      }
      Value v;
      if (!eval(c, s.expr, v)) return Flow::Failed;
      *target = v;
      return Flow::Normal;
    }
    case StmtKind::If:
      for (size_t i = 0; i < s.conditions.size(); ++i) {
        bool taken = false;
        if (!condition(s.conditions[i], taken)) return Flow::Failed;
        if (taken) return execute(c, s.branches[i], result, label);
      }
      if (s.branches.size() > s.conditions.size())
        return execute(c, s.branches.back(), result, label);
      return Flow::Normal;
    case StmtKind::Case: {
      Value selector;
      if (!eval(c, s.expr, selector)) return Flow::Failed;
      for (size_t i = 0; i < s.choices.size(); ++i) {
        for (ExprId choice : s.choices[i]) {
          const Expr& e = c.unit->arena[static_cast<size_t>(choice)];
          bool match = e.kind == ExprKind::Others;
          if (!match && e.kind == ExprKind::Range) {
            RangeValue r;
            if (!evalRange(c, choice, r)) return Flow::Failed;
            match = selector.isInteger() && selector.asInteger() >= r.low() &&
                    selector.asInteger() <= r.high();
          } else if (!match) {
            Value v;
            if (!eval(c, choice, v)) return Flow::Failed;
            match =
                (v.isInteger() && selector.isInteger() && v.asInteger() == selector.asInteger()) ||
                (v.isString() && selector.isString() && v.asString() == selector.asString()) ||
                (v.isBoolean() && selector.isBoolean() && v.asBoolean() == selector.asBoolean());
          }
          if (match) return execute(c, s.branches[i], result, label);
        }
      }
      return Flow::Normal;
    }
    case StmtKind::For: {
      RangeValue r;
      if (!evalRange(c, s.expr, r)) return Flow::Failed;
      frame.loopVariables.emplace_back(s.key, Value());
      size_t slot = frame.loopVariables.size() - 1;
      Flow flow = Flow::Normal;
      for (int64_t i = r.left, n = r.length(); n > 0; --n, r.ascending ? ++i : --i) {
        if (!step()) {
          flow = Flow::Failed;
          break;
        }
        frame.loopVariables[slot].second = Value::integer(i);
        bool stop = false;
        flow = loopBody(c, s, result, label, stop);
        if (stop) break;
      }
      frame.loopVariables.pop_back();
      return flow;
    }
    case StmtKind::While:
    case StmtKind::Loop:
      for (;;) {
        if (!step()) return Flow::Failed;
        bool go = true;
        if (s.kind == StmtKind::While && !condition(s.expr, go)) return Flow::Failed;
        if (!go) return Flow::Normal;
        bool stop = false;
        Flow flow = loopBody(c, s, result, label, stop);
        if (stop) return flow;
      }
  }
  return Flow::Failed;
}

}  // namespace scan::vhdl
