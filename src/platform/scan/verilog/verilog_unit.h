// The header parse of one unit: its parameter and port lists, and the body declarations the
// index noted (parameters, types, functions, imports and, for non-ANSI headers, the port
// declarations). Packages and the compilation-unit scope are read the same way.
#pragma once

#include <string>
#include <unordered_map>
#include <unordered_set>
#include <vector>

#include "platform/scan/verilog/verilog_index.h"
#include "platform/scan/verilog/verilog_scope.h"

namespace scan {
class Diagnostics;
}

namespace scan::verilog {

class SourceStore;

struct PortDeclaration {
  std::string name;
  TypeSpec type;
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
    ExprPtr left;   ///< select, when written
    ExprPtr right;  ///< second bound of a part select
    std::string op;
  };
  std::string name;  ///< empty for an unnamed concatenation
  std::vector<Member> members;
  const SourceBuffer* source = nullptr;
  size_t offset = 0;
};

struct UnitModel {
  Scope scope;
  bool ansi = true;
  std::vector<PortDeclaration> ports;           ///< ANSI ports, in order
  std::vector<PortReference> headerList;        ///< non-ANSI header, in order
  std::unordered_map<std::string, PortDeclaration> declared;  ///< non-ANSI direction declarations
  std::unordered_map<std::string, TypeSpec> netTypes;         ///< net/variable declarations
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

 private:
  class Session;
  Diagnostics& m_Diagnostics;
  const MacroTable& m_Macros;
  SourceStore& m_Sources;
};

}  // namespace scan::verilog
