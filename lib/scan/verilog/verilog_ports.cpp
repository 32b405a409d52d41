// Range evaluation walks a type down through its typedefs, collecting packed dimensions from
// the outside in, and only then decides how to report them.
#include "scan/verilog/verilog_ports.h"

#include <algorithm>

#include "scan/common/diagnostics.h"
#include "scan/common/source_buffer.h"

namespace scan::verilog {
namespace {

struct Range {
  bool present = false;
  int64_t left = 0;
  int64_t right = 0;
};

/// What a port is reported with besides its name, direction and range.
struct Written {
  std::string type;  ///< declared type, normalised
  ScanPort::Kind kind = ScanPort::Kind::Other;
  std::string expression;  ///< the text a range problem names
};

std::string rangeText(const Range& range) {
  if (!range.present) return {};
  return "[" + std::to_string(range.left) + ":" + std::to_string(range.right) + "]";
}

// The packed dimensions of a declared type ("[W-1:0]" of "logic [W-1:0]"), or the whole
// type when it has none written.
std::string dimensionsText(const std::string& type) {
  size_t bracket = type.find('[');
  return bracket == std::string::npos ? type : type.substr(bracket);
}

std::string quotedList(const std::vector<std::string>& names) {
  std::string text;
  for (size_t i = 0; i < names.size(); ++i)
    text += (i == 0 ? "'" : i + 1 == names.size() ? " and '" : ", '") + names[i] + "'";
  return text;
}

struct Bounds {
  int64_t left = 0;
  int64_t right = 0;
  int64_t size() const { return (left > right ? left - right : right - left) + 1; }
};

class PortBuilder {
 public:
  PortBuilder(UnitModel& model, Evaluator& evaluator, const DesignIndex& index,
              Diagnostics& diagnostics, LineCounter& lines, const RangeHints& hints)
      : m_Model(model),
        m_Evaluator(evaluator),
        m_Index(index),
        m_Diagnostics(diagnostics),
        m_Lines(lines),
        m_Hints(hints) {}

  std::vector<ScanPort> build() {
    if (m_Model.ansi) {
      for (PortDeclaration& port : m_Model.ports) ansiPort(port);
    } else {
      for (const PortReference& ref : m_Model.headerList) listedPort(ref);
    }
    return std::move(m_Ports);
  }

 private:
  bool dimension(const Dimension& dim, Bounds& bounds) {
    Scope& scope = m_Model.scope;
    if (!m_Evaluator.integer(dim.left, scope, bounds.left)) return false;
    if (dim.right == kNoExpr) {  // [N] is [0:N-1]
      if (bounds.left <= 0) {
        m_Error = "dimension size must be positive";
        return false;
      }
      bounds.right = bounds.left - 1;
      bounds.left = 0;
      return true;
    }
    return m_Evaluator.integer(dim.right, scope, bounds.right);
  }

  bool typeRange(const TypeSpec& type, Range& range) {
    std::vector<Bounds> dims;
    int64_t element = 1;
    bool noBits = false;
    const TypeSpec* current = &type;
    Scope* scope = &m_Model.scope;
    for (int depth = 0;; ++depth) {
      if (depth > 32) return setError("type definitions nested too deeply");
      for (const Dimension& dim : current->packed) {
        Bounds bounds;
        m_OwnDimension = depth == 0;
        if (scope == &m_Model.scope ? !dimension(dim, bounds)
                                    : !foreignDimension(dim, *scope, bounds))
          return false;
        dims.push_back(bounds);
      }
      m_OwnDimension = false;
      if (current->base == TypeSpec::Base::Named) {
        Scope* owner = nullptr;
        const TypeSpec* found = m_Evaluator.findType(current->scope, current->name, *scope, owner);
        if (!found) return unknownType(*current);
        current = found;
        scope = owner;
        continue;
      }
      if (current->base == TypeSpec::Base::Real) {
        noBits = true;
      } else if (current->base == TypeSpec::Base::Atom) {
        element = current->atomWidth;
      } else if (current->base == TypeSpec::Base::Struct || current->base == TypeSpec::Base::Enum) {
        TypeSpec bare = *current;
        bare.packed.clear();
        if (!m_Evaluator.typeWidth(bare, *scope, element)) return setError(m_Evaluator.error());
      }
      break;
    }
    if (noBits || (type.written == "integer" && type.packed.empty())) return true;
    if (dims.empty()) {
      if (element > 1) {
        range = {true, element - 1, 0};
      }
      return true;
    }
    if (dims.size() == 1 && element == 1) {
      range = {true, dims[0].left, dims[0].right};
      return true;
    }
    int64_t total = element;
    for (const Bounds& bounds : dims)
      if (!checkedMul(total, bounds.size(), total)) return setError("range too wide");
    range = {true, total - 1, 0};
    return true;
  }

  bool foreignDimension(const Dimension& dim, Scope& scope, Bounds& bounds) {
    if (!m_Evaluator.integer(dim.left, scope, bounds.left)) return false;
    if (dim.right == kNoExpr) {
      bounds.right = bounds.left - 1;
      bounds.left = 0;
      return true;
    }
    return m_Evaluator.integer(dim.right, scope, bounds.right);
  }

  bool setError(std::string text) {
    m_Error = std::move(text);
    return false;
  }

  bool unknownType(const TypeSpec& type) {
    m_Error = "unknown type '" + type.name + "'";
    if (!type.scope.empty() && !m_Index.findPackage(type.scope))
      m_Reason = missingPackageText(type.scope);
    else if (!m_Hints.missingPackages.empty())
      m_Reason = m_Error + "; " + missingPackagesText();
    return false;
  }

  static std::string missingPackageText(const std::string& name) {
    return "package '" + name + "' is not in any design file; add the file that declares it";
  }

  std::string missingPackagesText() const {
    const std::vector<std::string>& names = m_Hints.missingPackages;
    if (names.size() == 1) return missingPackageText(names[0]);
    return "packages " + quotedList(names) +
           " are not in any design file; add the files that declare them";
  }

  // The reason a range failed, with the fix when one is known. The evaluator's record of the
  // name it stopped at is only current when the evaluator itself failed last.
  std::string reason() {
    if (!m_Error.empty()) {
      std::string text = m_Reason.empty() ? m_Error : m_Reason;
      m_Reason.clear();
      m_Error.clear();
      return text;
    }
    std::string text = m_Evaluator.error();
    const Evaluator::Unresolved& at = m_Evaluator.unresolved();
    using Kind = Evaluator::Unresolved::Kind;
    if (at.kind == Kind::ParameterWithoutValue &&
        std::find(m_Hints.generics.begin(), m_Hints.generics.end(), at.name) !=
            m_Hints.generics.end())
      text += "; give one with -g " + at.name + "=VALUE";
    if (at.kind == Kind::UnknownPackage && !m_Index.findPackage(at.name))
      return missingPackageText(at.name);
    if (at.kind == Kind::UnknownName && !m_Hints.missingPackages.empty())
      text += "; " + missingPackagesText();
    return text;
  }

  void emit(const std::string& name, const std::string& typeName, int direction,
            const SourceBuffer* source, size_t offset, const Range& range, const Written& written,
            const std::string& problem) {
    size_t line = source ? m_Lines.lineOf(*source, offset) : 0;
    ScanPort port(name, typeName, direction, static_cast<int>(line));
    port.setDeclaredType(written.type);
    port.setKind(written.kind);
    if (!problem.empty()) port.setRangeUnknown(problem);
    if (range.present) {
      if (!fitsBound(range.left) || !fitsBound(range.right)) {
        warn(source, offset,
             "port '" + name + "': its bounds do not fit in 32 bits; no range reported");
        port.setRangeUnknown("port '" + name + "': " + rangeText(range) +
                             " does not fit 32-bit bounds");
      } else {
        port.setRange(static_cast<int32_t>(range.left), static_cast<int32_t>(range.right),
                      range.left < range.right);
      }
    }
    m_Ports.push_back(std::move(port));
  }

  void warn(const SourceBuffer* source, size_t offset, const std::string& text) {
    if (source) m_Diagnostics.warning(*source, offset, text);
  }

  // Warns as before, and returns the problem the port carries. `expression` is the declared
  // type when `isType`, else the header entry.
  std::string rangeFailed(const std::string& name, const std::string& expression, bool isType,
                          const SourceBuffer* source, size_t offset) {
    bool own = isType && m_OwnDimension;
    m_OwnDimension = false;
    std::string plain = m_Error.empty() ? m_Evaluator.error() : m_Error;
    std::string why = reason();
    warn(source, offset, "cannot evaluate the range of port '" + name + "': " + plain);
    std::string what = own ? dimensionsText(expression) : expression;
    return "port '" + name + "': cannot evaluate " + (what.empty() ? "its range" : what) + ": " +
           why;
  }

  ScanPort::Kind kindOf(const TypeSpec& type, bool unpacked) {
    using Kind = ScanPort::Kind;
    // An array of interfaces is still connected by name, as an interface.
    if (type.isInterface) return Kind::Interface;
    if (unpacked) return Kind::Array;
    size_t dims = 0;
    const TypeSpec* current = &type;
    Scope* scope = &m_Model.scope;
    for (int depth = 0; current->base == TypeSpec::Base::Named; ++depth) {
      dims += current->packed.size();
      Scope* owner = nullptr;
      const TypeSpec* found =
          depth > 32 ? nullptr : m_Evaluator.findType(current->scope, current->name, *scope, owner);
      if (!found) return Kind::Other;
      if (owner->unpackedTypedefs.count(current->name)) return Kind::Array;
      current = found;
      scope = owner;
    }
    dims += current->packed.size();
    switch (current->base) {
      case TypeSpec::Base::Implicit:
      case TypeSpec::Base::Bit:
        return dims == 0 ? Kind::Bit : Kind::BitVector;
      case TypeSpec::Base::Atom:
        return dims == 0 ? Kind::Integer : Kind::Array;
      case TypeSpec::Base::Struct:
        return dims == 0 ? Kind::Record : Kind::Array;
      case TypeSpec::Base::Enum:
        return dims == 0 ? Kind::Enum : Kind::Array;
      default:
        return Kind::Other;
    }
  }

  void ansiPort(PortDeclaration& port) {
    if (port.maybeInterface) {
      Scope* owner = nullptr;
      bool isType = m_Evaluator.findType("", port.type.name, m_Model.scope, owner) != nullptr;
      if (!isType) {
        const UnitRecord* unit = m_Index.find(port.type.name);
        if (unit == nullptr || unit->kind == UnitKind::Interface) {
          port.direction = ScanPort::InterfacePort;
          port.type.isInterface = true;
        }
      }
    }
    Written written{port.typeText, kindOf(port.type, port.unpacked), port.typeText};
    Range range;
    std::string problem;
    if (!port.type.isInterface && !typeRange(port.type, range)) {
      problem = rangeFailed(port.name, written.expression, true, port.source, port.offset);
      range = {};
    }
    emit(port.name, port.type.written, port.direction, port.source, port.offset, range, written,
         problem);
  }

  // The declaration of a listed signal, merged with its net or variable declaration.
  const PortDeclaration* declaration(const std::string& signal, TypeSpec& type,
                                     const PortReference& ref, Written* written = nullptr) {
    auto found = m_Model.declared.find(signal);
    if (found == m_Model.declared.end()) {
      if (ref.source)
        m_Diagnostics.error(*ref.source, ref.offset,
                            "port '" + signal + "' has no input, output or inout declaration");
      return nullptr;
    }
    type = found->second.type;
    std::string text = found->second.typeText;
    bool unpacked = found->second.unpacked;
    auto net = m_Model.netTypes.find(signal);
    if (net != m_Model.netTypes.end()) {
      // `output [7:0] q; reg [7:0] q;` is declared `reg [7:0]`, and `output [7:0] q; reg q;`
      // too; a direction declaration that names a data type keeps it.
      bool directionTyped = type.base != TypeSpec::Base::Implicit || !type.written.empty();
      if (!directionTyped) {
        const std::string& netText = net->second.typeText;
        if (text.empty() || netText.find('[') != std::string::npos)
          text = netText;
        else if (!netText.empty())
          text = netText + " " + text;
      }
      unpacked = unpacked || net->second.unpacked;
      const TypeSpec& other = net->second.type;
      if (type.written.empty()) type.written = other.written;
      if (type.base == TypeSpec::Base::Implicit && other.base != TypeSpec::Base::Implicit) {
        type.base = other.base;
        type.name = other.name;
        type.scope = other.scope;
        type.atomWidth = other.atomWidth;
        type.members = other.members;
        type.isUnion = other.isUnion;
      }
      if (type.packed.empty()) type.packed = other.packed;
    }
    if (written) *written = {text, kindOf(type, unpacked), text};
    return &found->second;
  }

  // Range of one member: its select when written, else its declared type.
  bool memberRange(const PortReference::Member& member, const TypeSpec& type, Range& range) {
    if (member.left == kNoExpr) return typeRange(type, range);
    Scope& scope = m_Model.scope;
    int64_t first = 0, second = 0;
    if (!m_Evaluator.integer(member.left, scope, first)) return false;
    if (member.right == kNoExpr) return true;  // one bit
    if (!m_Evaluator.integer(member.right, scope, second)) return false;
    if (member.op == Op::RangeSelect) {
      range = {true, first, second};
    } else if (second <= 0) {
      return setError("part-select width must be positive");
    } else if (member.op == Op::PlusSelect) {
      range = {true, first + second - 1, first};
    } else {
      range = {true, first, first - second + 1};
    }
    if (range.left == range.right) range = {};
    return true;
  }

  void listedPort(const PortReference& ref) {
    if (ref.name.empty()) {
      for (const PortReference::Member& member : ref.members) {
        PortReference single = ref;
        single.name = member.signal;
        single.members = {member};
        listedPort(single);
      }
      return;
    }
    if (ref.members.empty()) {
      if (ref.source)
        m_Diagnostics.warning(*ref.source, ref.offset,
                              "port '" + ref.name + "' is not connected inside the module");
      return;
    }
    TypeSpec type;
    Written written;
    const PortDeclaration* first = declaration(ref.members[0].signal, type, ref, &written);
    if (!first) return;
    if (ref.members.size() == 1) {
      const PortReference::Member& member = ref.members[0];
      bool selected = member.left != kNoExpr;
      if (selected) written.expression = ref.text;
      Range range;
      std::string problem;
      if (!memberRange(member, type, range)) {
        problem =
            rangeFailed(ref.name, written.expression, !selected, first->source, first->offset);
        range = {};
      }
      if (selected) {
        written.type = rangeText(range);
        written.kind = range.present ? ScanPort::Kind::BitVector : ScanPort::Kind::Bit;
      }
      emit(ref.name, type.written, first->direction, first->source, first->offset, range, written,
           problem);
      return;
    }
    int64_t total = 0;
    bool ok = true;
    for (const PortReference::Member& member : ref.members) {
      TypeSpec memberType;
      if (!declaration(member.signal, memberType, ref)) return;
      Range range;
      if (!memberRange(member, memberType, range)) {
        ok = false;
        break;
      }
      int64_t width = range.present ? Bounds{range.left, range.right}.size() : 1;
      if (!checkedAdd(total, width, total)) {
        ok = setError("range too wide");
        break;
      }
    }
    Range range;
    if (ok && total > 1) range = {true, total - 1, 0};
    std::string problem;
    if (!ok) problem = rangeFailed(ref.name, ref.text, false, first->source, first->offset);
    Written whole{rangeText(range), range.present ? ScanPort::Kind::BitVector : ScanPort::Kind::Bit,
                  ref.text};
    emit(ref.name, "", first->direction, first->source, first->offset, range, whole, problem);
  }

  UnitModel& m_Model;
  Evaluator& m_Evaluator;
  const DesignIndex& m_Index;
  Diagnostics& m_Diagnostics;
  LineCounter& m_Lines;
  const RangeHints& m_Hints;
  std::vector<ScanPort> m_Ports;
  std::string m_Error;
  std::string m_Reason;         ///< m_Error with its fix, when one is known
  bool m_OwnDimension = false;  ///< the failed dimension is one written on the port itself
};

}  // namespace

std::vector<ScanPort> buildPorts(UnitModel& model, Evaluator& evaluator, const DesignIndex& index,
                                 Diagnostics& diagnostics, LineCounter& lines,
                                 const RangeHints& hints) {
  return PortBuilder(model, evaluator, index, diagnostics, lines, hints).build();
}

}  // namespace scan::verilog
