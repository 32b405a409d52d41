// Range evaluation walks a type down through its typedefs, collecting packed dimensions from
// the outside in, and only then decides how to report them.
#include "platform/scan/verilog/verilog_ports.h"

#include <algorithm>
#include <cstring>

#include "platform/scan/common/diagnostics.h"
#include "platform/scan/common/source_buffer.h"

namespace scan::verilog {
namespace {

struct Range {
  bool present = false;
  int64_t left = 0;
  int64_t right = 0;
};

struct Bounds {
  int64_t left = 0;
  int64_t right = 0;
  int64_t size() const { return (left > right ? left - right : right - left) + 1; }
};

class PortBuilder {
 public:
  PortBuilder(UnitModel& model, Evaluator& evaluator, const DesignIndex& index,
              Diagnostics& diagnostics, LineCounter& lines)
      : m_Model(model),
        m_Evaluator(evaluator),
        m_Index(index),
        m_Diagnostics(diagnostics),
        m_Lines(lines) {}

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
    if (!m_Evaluator.integer(*dim.left, scope, bounds.left)) return false;
    if (!dim.right) {  // [N] is [0:N-1]
      if (bounds.left <= 0) {
        m_Error = "dimension size must be positive";
        return false;
      }
      bounds.right = bounds.left - 1;
      bounds.left = 0;
      return true;
    }
    return m_Evaluator.integer(*dim.right, scope, bounds.right);
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
        if (scope == &m_Model.scope ? !dimension(dim, bounds) : !foreignDimension(dim, *scope, bounds))
          return false;
        dims.push_back(bounds);
      }
      if (current->base == TypeSpec::Base::Named) {
        Scope* owner = nullptr;
        const TypeSpec* found = m_Evaluator.findType(current->scope, current->name, *scope, owner);
        if (!found) return setError("unknown type '" + current->name + "'");
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
    if (!m_Evaluator.integer(*dim.left, scope, bounds.left)) return false;
    if (!dim.right) {
      bounds.right = bounds.left - 1;
      bounds.left = 0;
      return true;
    }
    return m_Evaluator.integer(*dim.right, scope, bounds.right);
  }

  bool setError(std::string text) {
    m_Error = std::move(text);
    return false;
  }

  std::string lastError() {
    std::string text = m_Error.empty() ? m_Evaluator.error() : m_Error;
    m_Error.clear();
    return text;
  }

  void emit(const std::string& name, const std::string& typeName, int direction,
            const SourceBuffer* source, size_t offset, const Range& range) {
    size_t line = source ? m_Lines.lineOf(*source, offset) : 0;
    ScanPort port(name, typeName, direction, static_cast<int>(line));
    if (range.present) {
      if (!fitsBound(range.left) || !fitsBound(range.right)) {
        warn(source, offset,
             "port '" + name + "': its bounds do not fit in 32 bits; no range reported");
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

  void rangeFailed(const std::string& name, const SourceBuffer* source, size_t offset) {
    warn(source, offset, "cannot evaluate the range of port '" + name + "': " + lastError());
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
    Range range;
    if (!port.type.isInterface && !typeRange(port.type, range)) {
      rangeFailed(port.name, port.source, port.offset);
      range = {};
    }
    emit(port.name, port.type.written, port.direction, port.source, port.offset, range);
  }

  // The declaration of a listed signal, merged with its net or variable declaration.
  const PortDeclaration* declaration(const std::string& signal, TypeSpec& type,
                                     const PortReference& ref) {
    auto found = m_Model.declared.find(signal);
    if (found == m_Model.declared.end()) {
      if (ref.source)
        m_Diagnostics.error(*ref.source, ref.offset,
                            "port '" + signal + "' has no input, output or inout declaration");
      return nullptr;
    }
    type = found->second.type;
    auto net = m_Model.netTypes.find(signal);
    if (net != m_Model.netTypes.end()) {
      const TypeSpec& other = net->second;
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
    return &found->second;
  }

  // Range of one member: its select when written, else its declared type.
  bool memberRange(const PortReference::Member& member, const TypeSpec& type, Range& range) {
    if (!member.left) return typeRange(type, range);
    Scope& scope = m_Model.scope;
    int64_t first = 0, second = 0;
    if (!m_Evaluator.integer(*member.left, scope, first)) return false;
    if (!member.right) return true;  // one bit
    if (!m_Evaluator.integer(*member.right, scope, second)) return false;
    if (member.op == ":") {
      range = {true, first, second};
    } else if (second <= 0) {
      return setError("part-select width must be positive");
    } else if (member.op == "+:") {
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
    const PortDeclaration* first = declaration(ref.members[0].signal, type, ref);
    if (!first) return;
    if (ref.members.size() == 1) {
      Range range;
      if (!memberRange(ref.members[0], type, range)) {
        rangeFailed(ref.name, first->source, first->offset);
        range = {};
      }
      emit(ref.name, type.written, first->direction, first->source, first->offset, range);
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
    if (!ok) rangeFailed(ref.name, first->source, first->offset);
    emit(ref.name, "", first->direction, first->source, first->offset, range);
  }

  UnitModel& m_Model;
  Evaluator& m_Evaluator;
  const DesignIndex& m_Index;
  Diagnostics& m_Diagnostics;
  LineCounter& m_Lines;
  std::vector<ScanPort> m_Ports;
  std::string m_Error;
};

}  // namespace

size_t LineCounter::lineOf(const SourceBuffer& source, size_t offset) {
  offset = std::min(offset, source.text().size());
  if (m_Source != &source || offset < m_Offset) {
    m_Source = &source;
    m_Offset = 0;
    m_Line = 1;
  }
  const char* p = source.begin() + m_Offset;
  const char* end = source.begin() + offset;
  while (p < end) {
    const void* nl = std::memchr(p, '\n', static_cast<size_t>(end - p));
    if (!nl) break;
    ++m_Line;
    p = static_cast<const char*>(nl) + 1;
  }
  m_Offset = offset;
  return m_Line;
}

std::vector<ScanPort> buildPorts(UnitModel& model, Evaluator& evaluator,
                                 const DesignIndex& index, Diagnostics& diagnostics,
                                 LineCounter& lines) {
  return PortBuilder(model, evaluator, index, diagnostics, lines).build();
}

}  // namespace scan::verilog
