// @VHDL_TYPEDEC@: the VHDL type of the current port of an iteration pass, the net type for a
// single bit and the bus type with its index range for a bus; a port of any other type keeps
// the type the design declares, since no bit type could stand in for a record or an enum.
#include <string>

#include "engine/forge.h"

namespace {

bool keepsDeclaredType(const PortRecord& port) {
  if (port.m_DeclaredType.empty()) return false;
  switch (port.m_Kind) {
    case PortTypeKind::Bit:
    case PortTypeKind::BitVector:
    case PortTypeKind::Integer:
      return false;
    default:
      return true;
  }
}

}  // namespace

bool Forge::doVhdlTypeDec(const PortRecord& port) {
  if (keepsDeclaredType(port)) return writeText(port.m_DeclaredType, false);
  if (port.isRangeUnknown()) {
    reportRangeError(port);
    return true;
  }
  if (!port.isBus()) return writeText(m_VhdlNetType, false);
  // Each piece goes through the writer on its own, so a piece equal to the signal delimiter
  // wraps like any other delimiter write.
  const std::string pieces[] = {
      m_VhdlBusType,
      "(",
      std::to_string(port.m_Left),
      port.m_Left <= port.m_Right ? " to " : " downto ",
      std::to_string(port.m_Right),
      ")",
  };
  for (const std::string& piece : pieces) {
    if (writeText(piece, false)) return true;
  }
  return false;
}
