// The few trees the VHDL reader builds: expressions, subtype indications, interface and
// package declarations and subprogram bodies. Nodes live in per-unit arenas addressed by
// index, so deep or huge inputs never recurse on destruction.
#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <string>
#include <string_view>
#include <vector>

#include "scan/common/value.h"

namespace scan::vhdl {

using ExprId = int32_t;
constexpr ExprId kNoExpr = -1;

enum class ExprKind : uint8_t {
  Literal,    ///< value holds the number, string or character
  Name,       ///< text is the identifier
  Selected,   ///< a.text
  Call,       ///< a(args): call, conversion, index or slice
  Attribute,  ///< a'text, args holds an optional parameter
  Qualified,  ///< a'(b)
  Unary,      ///< op a
  Binary,     ///< a op b
  Range,      ///< a to|downto b
  Box,        ///< <> of an unconstrained index; a is the index subtype
  Open,       ///< open
  Others,     ///< others
  Aggregate,  ///< (args): the elements in order, each an expression or a Named
  Named,      ///< choices => a, the choices in args
};

enum class Op : uint8_t {
  None,
  Add,
  Sub,
  Mul,
  Div,
  Mod,
  Rem,
  Pow,
  Abs,
  Not,
  Neg,
  Plus,
  Concat,
  Eq,
  Ne,
  Lt,
  Le,
  Gt,
  Ge,
  And,
  Or,
  Nand,
  Nor,
  Xor,
  Xnor,
  To,
  Downto,
};

struct Expr;
/// Expressions of one unit; a deque so that references stay valid while functions are
/// parsed lazily into the same arena.
using ExprArena = std::deque<Expr>;

struct Expr {
  ExprKind kind = ExprKind::Literal;
  Op op = Op::None;
  uint16_t depth = 1;
  ExprId a = kNoExpr;
  ExprId b = kNoExpr;
  std::string_view text;
  std::string key;   ///< normalized text of names, selected suffixes and attributes
  size_t begin = 0;  ///< first byte of the expression's source text
  size_t end = 0;    ///< one past its last byte
  std::vector<ExprId> args;
  Value value;
};

/// `[resolution] type_mark [constraint]`.
struct SubtypeIndication {
  std::vector<std::string_view> typeMark;  ///< components of the (selected) type mark
  size_t offset = 0;
  ExprId rangeConstraint = kNoExpr;     ///< `range ...`
  std::vector<ExprId> indexConstraint;  ///< `(r1, r2, ...)`, first dimension first
  bool valid() const { return !typeMark.empty(); }
};

enum class Mode : uint8_t { In = 1, Out = 2, Inout = 3, Buffer = 4, Linkage = 5 };

enum class DeclKind : uint8_t {
  Constant,
  Generic,
  Port,
  Variable,
  Subtype,
  ArrayType,
  RangeType,
  EnumType,
  EnumLiteral,
  RecordType,
  OtherType,
  Function,
  Alias,
};

/// One named declaration of a package, entity header or subprogram.
struct Decl {
  DeclKind kind = DeclKind::Constant;
  std::string key;        ///< normalized name used for lookup
  std::string_view name;  ///< as written
  size_t offset = 0;
  Mode mode = Mode::In;
  SubtypeIndication subtype;           ///< objects, subtypes; element type of arrays
  ExprId init = kNoExpr;               ///< default or initial value; the aliased name of an alias
  std::vector<ExprId> indexRanges;     ///< array types: one discrete range per dimension
  ExprId range = kNoExpr;              ///< range types
  std::vector<std::string> fieldKeys;  ///< record types: normalized field names
  std::vector<SubtypeIndication> fieldTypes;  ///< record types: one per field
  int64_t position = 0;                       ///< enumeration literals; literal count of enum types
  size_t parameterCount = 0;                  ///< functions
  size_t bodyOffset = 0;                      ///< functions with a body: offset of `function`
  bool hasBody = false;
  // Evaluation cache for constants and generics.
  enum class State : uint8_t { Fresh, Busy, Done, Failed } state = State::Fresh;
  Value cached;
  std::string failure;  ///< why evaluation failed, when state is Failed
};

/// A sequential statement of a subprogram body.
enum class StmtKind : uint8_t { Assign, If, For, While, Loop, Exit, Next, Return, Null, Case };

struct Stmt {
  StmtKind kind = StmtKind::Null;
  size_t offset = 0;
  std::string_view name;                       ///< assignment target, loop variable
  std::string key;                             ///< normalized name
  std::string_view label;                      ///< loop label, exit/next target label
  ExprId expr = kNoExpr;                       ///< value, condition, range or selector
  std::vector<ExprId> conditions;              ///< if/elsif conditions, one per branch
  std::vector<std::vector<ExprId>> choices;    ///< case choices, one list per branch
  std::vector<std::vector<int32_t>> branches;  ///< statement lists; an else branch is last
};

/// A parsed subprogram: its parameters and variables are Decls, its statements Stmts.
struct FunctionBody {
  std::string_view name;
  std::vector<Decl> parameters;
  std::vector<Decl> locals;
  std::vector<Stmt> statements;
  std::vector<int32_t> top;  ///< the body's statement list
};

}  // namespace scan::vhdl
