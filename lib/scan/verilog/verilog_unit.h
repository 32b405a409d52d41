// The header parse of one unit: its parameter and port lists, and the body declarations the
// index noted (parameters, types, functions, imports and, for non-ANSI headers, the port
// declarations). Packages and the compilation-unit scope are read the same way.
#pragma once

#include <string>
#include <unordered_map>
#include <unordered_set>
#include <vector>

#include "scan/verilog/verilog_index.h"
#include "scan/verilog/verilog_scope.h"

namespace scan {
class Diagnostics;
}

namespace scan::verilog {

class SourceStore;

struct PortDeclaration {
  std::string name;
  TypeSpec type;
  std::string typeText;   ///< the data type as written, normalised; empty when none is
  bool unpacked = false;  ///< unpacked dimensions follow the name
  int direction = 0;
  /// No direction was written and the type may name an interface; decided once types are
  /// known.
  bool maybeInterface = false;
  const SourceBuffer* source = nullptr;
  size_t offset = 0;
};

/// One entry of a non-ANSI header list: `a`, `a[3:0]`, `.p(a)`, `.p({a, b})`.
struct PortReference {
  struct Member {
    std::string signal;
    ExprId left = kNoExpr;   ///< select, when written
    ExprId right = kNoExpr;  ///< second bound of a part select
    Op op = Op::None;        ///< the kind of part select
  };
  std::string name;  ///< empty for an unnamed concatenation
  std::vector<Member> members;
  std::string text;  ///< the entry as written, normalised
  const SourceBuffer* source = nullptr;
  size_t offset = 0;
};

/// A net or variable declaration of a non-ANSI port's signal.
struct NetDeclaration {
  TypeSpec type;
  std::string typeText;
  bool unpacked = false;
};

/// A parameter a user may override: one of the `#(...)` list, or of the body of a unit
/// without that list. `localparam`s are not recorded.
struct ParameterDeclaration {
  std::string name;
  bool isType = false;
  std::string typeText;     ///< "type" for a type parameter; empty when untyped
  std::string defaultText;  ///< empty when there is no default
  const SourceBuffer* source = nullptr;
  size_t offset = 0;
};

struct UnitModel {
  Scope scope;
  bool ansi = true;
  bool parameterList = false;                    ///< the header has a `#(...)` list
  std::vector<ParameterDeclaration> parameters;  ///< in declaration order
  /// Package imports of the header and, for non-ANSI units, of the body: "import p::*;".
  std::vector<std::string> imports;
  std::vector<PortDeclaration> ports;                         ///< ANSI ports, in order
  std::vector<PortReference> headerList;                      ///< non-ANSI header, in order
  std::unordered_map<std::string, PortDeclaration> declared;  ///< non-ANSI direction declarations
  std::unordered_map<std::string, NetDeclaration> netTypes;   ///< net/variable declarations
  /// Errors met in the header (and, for a non-ANSI header, the port declarations).
  size_t headerErrors = 0;
};

/// Reads units, packages and the compilation-unit scope from their recorded places.
class UnitReader {
 public:
  UnitReader(Diagnostics& diagnostics, const MacroTable& macros, SourceStore& sources);

  /// Parses the unit's header and noted body declarations into `model`.
  void readUnit(const UnitRecord& unit, UnitModel& model);
  /// Reads the declarations at `places` into `scope` (packages, compilation unit).
  void readScope(const std::vector<Place>& places, Scope& scope);
  /// The package imports among the first `count` of `places`, one "import p::*;" each.
  std::vector<std::string> readImports(const std::vector<Place>& places, size_t count);

  /// Reads `text` (held by `buffer`) as one constant expression into `arena`, or as a data
  /// type when `isType`; the whole text must be used. On failure reports the error and
  /// returns false.
  bool readValue(const SourceBuffer& buffer, bool isType, ExprArena& arena, ExprId& value,
                 std::shared_ptr<TypeSpec>& type);

 private:
  class Session;
  Diagnostics& m_Diagnostics;
  const MacroTable& m_Macros;
  SourceStore& m_Sources;
};

}  // namespace scan::verilog
