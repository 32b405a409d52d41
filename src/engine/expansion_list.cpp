// Walking the bits of one bus through one record.
#include "engine/expansion_list.h"

ExpansionList::ExpansionList(const PortRecord& bus)
    : m_Bit(bus),
      m_Left(bus.m_Left),
      m_Right(bus.m_Right),
      m_Step(bus.m_Left < bus.m_Right ? 1 : -1) {
  m_Bit.m_Right = m_Left;
}

PortRecord* ExpansionList::first() {
  m_Bit.m_Left = m_Left;
  m_Bit.m_Right = m_Left;
  return &m_Bit;
}

PortRecord* ExpansionList::next() {
  // Test before stepping so that a bound at the edge of the 32-bit range cannot overflow; the
  // record stays on the right bit, so later calls keep answering null.
  if (m_Bit.m_Left == m_Right) return nullptr;
  m_Bit.m_Left += m_Step;
  m_Bit.m_Right = m_Bit.m_Left;
  return &m_Bit;
}
