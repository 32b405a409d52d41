// @VHDL_TYPEDEC@: the VHDL type of the current port of an iteration pass, the net type for a
// single bit and the bus type with its index range for a bus.
#include <string>

#include "engine/forge.h"

bool Forge::doVhdlTypeDec(const PortRecord& port) {
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
