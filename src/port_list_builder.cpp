// Turns the found unit's ports into the run's port records: direction letters, bounds, the
// bit width of integer ranges (with a warning, since only symbols can use it), declared types
// and, in debug mode, one line per port on standard output; and copies the unit's generics
// and context into the design data.
#include <algorithm>
#include <bit>
#include <cstdint>
#include <cstdio>
#include <memory>
#include <string>
#include <string_view>
#include <utility>

#include "design_flow.h"
#include "message_lines.h"
#include "run_context.h"

namespace {

/// How a port's range runs, as the debug line shows it.
enum class RangeKind { None, To, Downto };

/// The bounds of one port as its record and the debug line show them: -1 when it has none.
struct Bounds {
  int32_t left = -1;
  int32_t right = -1;
  RangeKind kind = RangeKind::None;
};

char directionLetter(int code) {
  switch (code) {
    case ScanPort::Input:
      return 'I';
    // An interface port carries signals both ways.
    case ScanPort::Inout:
    case ScanPort::InterfacePort:
      return 'B';
    default:
      return 'O';
  }
}

PortTypeKind kindOf(const ScanPort& port) {
  switch (port.direction() == ScanPort::InterfacePort ? ScanPort::Kind::Interface : port.kind()) {
    case ScanPort::Kind::Bit:
      return PortTypeKind::Bit;
    case ScanPort::Kind::BitVector:
      return PortTypeKind::BitVector;
    case ScanPort::Kind::Integer:
      return PortTypeKind::Integer;
    case ScanPort::Kind::Record:
      return PortTypeKind::Record;
    case ScanPort::Kind::Array:
      return PortTypeKind::Array;
    case ScanPort::Kind::Enum:
      return PortTypeKind::Enum;
    case ScanPort::Kind::Interface:
      return PortTypeKind::Interface;
    case ScanPort::Kind::Other:
      break;
  }
  return PortTypeKind::Other;
}

PortMode modeOf(int direction) {
  switch (direction) {
    case ScanPort::Buffer:
      return PortMode::Buffer;
    case ScanPort::Linkage:
      return PortMode::Linkage;
    case ScanPort::Ref:
      return PortMode::Ref;
    default:
      return PortMode::FromLetter;
  }
}

/// VHDL names ignore case, Verilog names do not.
bool sameName(std::string_view a, std::string_view b, bool verilog) {
  return verilog ? a == b : Host::StringBase(a).Compare(b, 1) == 0;
}

/// Integer-like types whose range gives a value span rather than a bit range.
bool isIntegerType(const Host::StringBase& type) {
  for (std::string_view name : {"integer", "natural", "positive"})
    if (type.Compare(name, 1) == 0) return true;
  return false;
}

/// floor(log2(value)) for a positive value, exactly.
int32_t floorLog2(int32_t value) {
  return static_cast<int32_t>(std::bit_width(static_cast<uint32_t>(value))) - 1;
}

/// Replaces the bounds of an integer range by the bits its largest value needs, written from
/// the high bit down to 0 when the range falls.
void applyIntegerRule(RunContext& context, const ScanPort& port, Bounds& bounds) {
  const int32_t largest = std::max(bounds.left, bounds.right);
  bounds.left = 0;
  bounds.right = largest > 0 ? floorLog2(largest) : 0;
  if (port.isAscending() == 0) std::swap(bounds.left, bounds.right);

  std::string text = "WARNING: Module ";
  text += context.m_ModuleName.view();
  text += "(Line ";
  text += std::to_string(port.sourceLine());
  text += "): INTEGER RANGE is only supported for schematic symbol generation.";
  context.reportMessage(text, RunContext::Severity::Warning);
}

/// The bounds the port's record gets; an integer range gives the bits it needs instead.
Bounds boundsOf(RunContext& context, const ScanPort& port) {
  Bounds bounds;
  if (port.hasRange()) {
    port.getBounds(bounds.left, bounds.right);
    if (isIntegerType(port.typeName())) applyIntegerRule(context, port, bounds);
    bounds.kind = port.isAscending() != 0 ? RangeKind::To : RangeKind::Downto;
  }
  // A range the reader could not evaluate has no bounds; the record carries its problem.
  if (port.rangeUnknown()) bounds.left = bounds.right = -1;
  return bounds;
}

/// The direction as the design's language writes it.
std::string_view directionWord(int code, bool verilog) {
  switch (code) {
    case ScanPort::Input:
      return verilog ? "input" : "in";
    case ScanPort::Output:
      return verilog ? "output" : "out";
    case ScanPort::Inout:
      return "inout";
    case ScanPort::Buffer:
      return "buffer";
    case ScanPort::Linkage:
      return "linkage";
    case ScanPort::Ref:
      return "ref";
    case ScanPort::InterfacePort:
      return "interface";
    default:
      return "?";
  }
}

void printDebugLine(const ScanPort& port, const Bounds& bounds, bool verilog) {
  std::string line = port.name();
  line += ": ";
  line += directionWord(port.direction(), verilog);
  line += ' ';
  line += port.typeName();
  if (bounds.kind != RangeKind::None) {
    line += " (" + std::to_string(bounds.left);
    line += bounds.kind == RangeKind::To ? " TO " : " DOWNTO ";
    line += std::to_string(bounds.right) + ")";
  }
  line += ';';
  writeLine(stdout, line);
}

}  // namespace

bool buildPortList(RunContext& context) {
  const ScanPortList* ports = context.m_Extractor.getPorts();
  for (const ScanPort* port = ports != nullptr ? ports->firstPort() : nullptr; port != nullptr;
       port = ports->nextPort(port)) {
    const Bounds bounds = boundsOf(context, *port);
    auto record = std::make_unique<PortRecord>(port->name(), bounds.left, bounds.right,
                                               directionLetter(port->direction()));
    record->m_DeclaredType = port->declaredType();
    record->m_Kind = kindOf(*port);
    record->m_Mode = modeOf(port->direction());
    if (port->rangeUnknown()) record->setRangeUnknown(port->rangeProblem());
    context.m_DesignData->appendOwned(record.release());
    if (context.m_Debug) printDebugLine(*port, bounds, context.isVerilog());
  }
  return !context.hasErrors();
}

void buildUnitData(RunContext& context) {
  StbDataList& data = *context.m_DesignData;
  const bool verilog = context.isVerilog();
  data.m_Language = verilog ? DesignLanguage::Verilog : DesignLanguage::Vhdl;
  data.m_Context = context.m_Extractor.getContext();
  data.m_Generics.clear();
  for (const ScanGeneric& generic : context.m_Extractor.getGenerics()) {
    GenericRecord record{generic.name, generic.typeText, generic.defaultText,
                         generic.value.value_or(generic.defaultText)};
    // A name given twice takes its last -g.
    for (const auto& [name, value] : context.m_ScanSettings.genericOverrides)
      if (sameName(name, generic.name, verilog)) record.m_Value = value;
    data.m_Generics.push_back(std::move(record));
  }
}
