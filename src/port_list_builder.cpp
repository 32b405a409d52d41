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
#include "run_context.h"

namespace {

constexpr int32_t kRangeNone = 0;
constexpr int32_t kRangeTo = 1;
constexpr int32_t kRangeDownto = 2;

void resetScratch(RunContext& context) {
  context.m_CurrentPortName.Empty();
  context.m_CurrentPortType.Empty();
  context.m_CurrentPortDir = -1;
  context.m_CurrentLeft = -1;
  context.m_CurrentRangeKind = kRangeNone;
  context.m_CurrentRight = -1;
}

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

/// Replaces the scratch bounds of an integer range by the bits its largest value needs,
/// written from the high bit down to 0 when the range falls.
void applyIntegerRule(RunContext& context, const ScanPort& port) {
  const int32_t largest = std::max(context.m_CurrentLeft, context.m_CurrentRight);
  context.m_CurrentLeft = 0;
  context.m_CurrentRight = largest > 0 ? floorLog2(largest) : 0;
  if (port.isAscending() == 0) std::swap(context.m_CurrentLeft, context.m_CurrentRight);

  std::string text = "WARNING: Module ";
  text += context.m_ModuleName.view();
  text += "(Line ";
  text += std::to_string(port.sourceLine());
  text += "): INTEGER RANGE is only supported for schematic symbol generation.";
  context.reportMessage(text, RunContext::Severity::Warning);
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

void printDebugLine(const RunContext& context, int direction) {
  std::string line = context.m_CurrentPortName.str();
  line += ": ";
  line += directionWord(direction, context.m_Verilog != 0);
  line += ' ';
  line += context.m_CurrentPortType.view();
  if (context.m_CurrentRangeKind != kRangeNone) {
    line += " (" + std::to_string(context.m_CurrentLeft);
    line += context.m_CurrentRangeKind == kRangeTo ? " TO " : " DOWNTO ";
    line += std::to_string(context.m_CurrentRight) + ")";
  }
  line += ";\n";
  std::fwrite(line.data(), 1, line.size(), stdout);
}

}  // namespace

bool buildPortList(RunContext& context) {
  resetScratch(context);
  const ScanPortList* ports = context.m_Extractor.getPorts();
  for (const ScanPort* port = ports != nullptr ? ports->firstPort() : nullptr; port != nullptr;
       port = ports->nextPort(port)) {
    context.m_CurrentPortName = std::string_view(port->name());
    context.m_CurrentPortType = std::string_view(port->typeName());
    const char letter = directionLetter(port->direction());
    context.m_CurrentPortDir = letter;
    if (port->hasRange()) {
      port->getBounds(context.m_CurrentLeft, context.m_CurrentRight);
      if (isIntegerType(context.m_CurrentPortType)) applyIntegerRule(context, *port);
      context.m_CurrentRangeKind = port->isAscending() != 0 ? kRangeTo : kRangeDownto;
    }
    // A range the reader could not evaluate has no bounds; the record carries its problem.
    if (port->rangeUnknown()) context.m_CurrentLeft = context.m_CurrentRight = -1;
    auto record = std::make_unique<PortRecord>(
        context.m_CurrentPortName.view(), context.m_CurrentLeft, context.m_CurrentRight, letter);
    record->m_DeclaredType = port->declaredType();
    record->m_Kind = kindOf(*port);
    record->m_Mode = modeOf(port->direction());
    if (port->rangeUnknown()) record->setRangeUnknown(port->rangeProblem());
    context.m_DesignData->appendOwned(record.release());
    if (context.m_Debug) printDebugLine(context, port->direction());
    resetScratch(context);
  }
  return !context.hasErrors();
}

void buildUnitData(RunContext& context) {
  StbDataList& data = *context.m_DesignData;
  const bool verilog = context.m_Verilog != 0;
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
