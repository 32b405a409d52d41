// Constant expressions, data types and constant functions of the Verilog reader. Expression
// nodes live in the arena of the scope that declares them and refer to each other by index,
// so they outlive the token stream they were read from.
#pragma once

#include <cstdint>
#include <deque>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace scan {
class SourceBuffer;
}

namespace scan::verilog {

/// An operator, fixed when the expression is read. The two spellings of xnor stay apart so
/// that messages quote the operator as it was written.
enum class Op : uint8_t {
  None,
  Plus,
  Minus,
  Times,
  Divide,
  Modulo,
  Power,
  LogicalAnd,
  LogicalOr,
  LogicalNot,
  BitAnd,
  BitOr,
  BitXor,
  BitXnor,
  BitXnorAlt,
  BitNot,
  BitNand,
  BitNor,
  Equal,
  NotEqual,
  CaseEqual,
  CaseNotEqual,
  WildEqual,
  WildNotEqual,
  Less,
  LessEqual,
  Greater,
  GreaterEqual,
  ShiftLeft,
  ShiftRight,
  ArithShiftLeft,
  ArithShiftRight,
  RangeSelect,       ///< x[i:j]
  PlusSelect,        ///< x[i+:j]
  MinusSelect,       ///< x[i-:j]
  PatternReplicate,  ///< '{n{items}}
  PatternKeyed,      ///< '{key: value, default: value}
};

/// The operator spelled `text` (a select's ":" is RangeSelect); Op::None when none is.
Op operatorOf(std::string_view text);
/// How `op` is written.
std::string_view operatorText(Op op);

/// A node's place in its arena; children, dimensions, statements and parameters refer to
/// nodes this way.
using ExprId = int32_t;
constexpr ExprId kNoExpr = -1;

struct Expr {
  enum class Kind {
    Number,  ///< integer literal; `unknown` when it holds x or z bits
    Real,
    String,
    Name,       ///< `name`, or `scope::name` when `scope` is set
    Unary,      ///< op args[0]
    Binary,     ///< args[0] op args[1]
    Ternary,    ///< args[0] ? args[1] : args[2]
    Call,       ///< name(args), a constant function
    System,     ///< $name(args)
    Concat,     ///< {args}
    Replicate,  ///< {args[0]{args[1..]}}
    Select,     ///< args[0][args[1]] or args[0][args[1]:args[2]]
    TypeName,   ///< a data type used as an argument ($bits(logic [3:0]))
    Pattern,    ///< '{args}; PatternReplicate: '{args[0]{args[1..]}}; PatternKeyed: key,
                ///< value pairs (kNoExpr key: default)
  };
  Kind kind = Kind::Number;
  Op op = Op::None;   ///< operator, or the kind of a part select or pattern
  std::string name;   ///< names, functions, system functions
  std::string scope;  ///< package of a scoped name
  int64_t integer = 0;
  double real = 0;
  int width = 0;          ///< literal size in bits; 0 when unsized
  bool isSigned = false;  ///< a sized literal written with 's
  bool unknown = false;
  bool tooWide = false;  ///< an integer literal whose value does not fit in 64 bits
  std::vector<ExprId> args;
  std::shared_ptr<const struct TypeSpec> type;  ///< for TypeName
};

/// The expressions of one scope (a unit, a package or the compilation unit): its parameters,
/// types, functions and ports refer to them by id, and an expression is always evaluated in
/// the scope that holds it, so the scope's arena is the one to look in. Nodes are freed with
/// the scope, all at once, however deep the trees; a deque, so growing never moves them.
using ExprArena = std::deque<Expr>;

struct Dimension {
  ExprId left = kNoExpr;
  ExprId right = kNoExpr;  ///< kNoExpr for a size-only dimension [N]
};

struct TypeSpec {
  enum class Base {
    Implicit,  ///< no data type: a single bit (wire, input a)
    Bit,       ///< logic, reg, bit
    Atom,      ///< integer, int, byte, ... (atomWidth bits)
    Real,      ///< real, string, event, ... : no bits to speak of
    Named,     ///< a typedef, type parameter or interface: `name` (`scope`::name)
    Struct,    ///< packed struct or union of `members`
    Enum,      ///< enum over `members[0]` (or int)
  };
  Base base = Base::Implicit;
  std::string written;  ///< the type name as written, for reporting
  std::string name;
  std::string scope;
  std::string modport;  ///< set for an interface port (`intf.modport` or `interface`)
  bool isInterface = false;
  int atomWidth = 0;
  int signing = 0;  ///< 1 when written `signed`, -1 when `unsigned`, 0 when left to the type
  bool isUnion = false;
  std::vector<Dimension> packed;
  std::vector<TypeSpec> members;
};

/// One statement of a constant function.
struct Stmt {
  enum class Kind { Block, Assign, If, For, While, Repeat, Return, Case, Declare, Nothing };
  Kind kind = Kind::Nothing;
  std::string target;      ///< assigned or declared variable
  ExprId value = kNoExpr;  ///< right-hand side, condition, count or returned value
  std::vector<Stmt> body;  ///< block statements; If: then, else; loops: init, step, body
  std::vector<std::vector<ExprId>> labels;  ///< Case: one label list per body statement
  bool hasDefault = false;                  ///< Case: the last body statement is the default
  /// Assign to a bit or part select, target[index], target[index selectOp indexEnd].
  ExprId index = kNoExpr;
  ExprId indexEnd = kNoExpr;
  Op selectOp = Op::None;
  /// Assign with an operator (`+=`, `<<=`, `++`, ...): the expression `target op value`
  /// whose value is assigned; kNoExpr for `=`.
  ExprId update = kNoExpr;
};

struct Function {
  std::string name;
  std::vector<std::string> inputs;
  std::vector<Stmt> body;
  bool supported = true;  ///< false when the body uses a construct the interpreter lacks
  const SourceBuffer* source = nullptr;
  size_t offset = 0;
};

}  // namespace scan::verilog
