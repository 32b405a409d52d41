// The port records every reader fills; defined here, below both readers, so the reader
// libraries link without the extractor.
#include "platform/scan.h"

ScanPort::ScanPort(std::string name, std::string typeName, int direction, int sourceLine)
    : m_Name(std::move(name)),
      m_TypeName(std::move(typeName)),
      m_Direction(direction),
      m_SourceLine(sourceLine) {}

void ScanPort::setRange(int32_t left, int32_t right, bool ascending) {
  m_HasRange = true;
  m_Left = left;
  m_Right = right;
  m_Ascending = ascending;
}

const ScanPort* ScanPortList::firstPort() const {
  return m_Ports.empty() ? nullptr : m_Ports.data();
}

const ScanPort* ScanPortList::nextPort(const ScanPort* port) const {
  if (port == nullptr) return nullptr;
  const ScanPort* next = port + 1;
  return next < m_Ports.data() + m_Ports.size() ? next : nullptr;
}
