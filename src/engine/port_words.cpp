// The words that describe the current port of an iteration in the design's own terms: its
// declared type and its direction word.
#include <string_view>

#include "engine/forge.h"

namespace {

std::string_view modeWord(const PortRecord& port, DesignLanguage language) {
  const bool vhdl = language == DesignLanguage::Vhdl;
  if (port.m_Kind == PortTypeKind::Interface) return {};
  switch (port.m_Mode) {
    case PortMode::Buffer:
      return vhdl ? "buffer" : "output";
    case PortMode::Linkage:
      return vhdl ? "linkage" : "inout";
    case PortMode::Ref:
      return vhdl ? "inout" : "ref";
    case PortMode::FromLetter:
      break;
  }
  switch (port.m_Dir) {
    case 'I':
      return vhdl ? "in" : "input";
    case 'O':
      return vhdl ? "out" : "output";
    case 'B':
      return "inout";
    default:
      return {};
  }
}

}  // namespace

bool Forge::writePortType(const PortRecord& port) { return writeText(port.m_DeclaredType, false); }

bool Forge::writePortMode(const PortRecord& port) {
  return writeText(modeWord(port, m_DataList->m_Language), false);
}
