// How one port is written (its name under map, its bit suffix or range, and the case mode) and
// how a bus is handed out as single bits while expandbus is on.
#include <string>

#include "engine/forge.h"

std::unique_ptr<ExpansionList> Forge::expandBus(const PortRecord& port) const {
  return std::make_unique<ExpansionList>(port);
}

std::string Forge::formatPort(const PortRecord& port) const {
  const std::string& name = displayName(port);
  std::string text;
  // Built by appending: gcc 12 at -O3 misreports the prepending string operators.
  if (m_ExpandBus && port.isBus() && port.m_Left == port.m_Right) {
    text = name;
    text += m_BusLeft;
    text += std::to_string(port.m_Left);
    text += m_BusRight;
  } else if (m_ShowRange && port.isBus()) {
    std::string range = "[";
    range += std::to_string(port.m_Left);
    range += ':';
    range += std::to_string(port.m_Right);
    range += ']';
    if (m_RangePosition == AsPostfix) {
      text = name;
      text += range;
    } else {
      text = range;
      text += ' ';
      text += name;
    }
  } else {
    text = name;
  }
  return applyCase(text);
}

bool Forge::rangeNeeded(const PortRecord& port) {
  if (!port.isRangeUnknown() || (!m_ShowRange && !m_ExpandBus)) return false;
  reportRangeError(port);
  return true;
}
