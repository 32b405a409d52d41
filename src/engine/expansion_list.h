// The single bits of one bus, worked out one at a time in a single reusable record, so that
// handing out a bus bit by bit needs the same small memory whatever its width.
#pragma once

#include <cstdint>

#include "data/port_record.h"

/// The bits of one bus from its left bound to its right bound, both included. Every bit is
/// the one record this list owns: name, direction and mapped name of the bus as they were when
/// the list was made, and both bounds set to the bit's index.
class ExpansionList {
 public:
  explicit ExpansionList(const PortRecord& bus);
  ExpansionList(const ExpansionList&) = delete;
  ExpansionList& operator=(const ExpansionList&) = delete;

  /// The left bit. The record stays valid, holding that bit, until the next call of first or
  /// next, and lives as long as the list.
  PortRecord* first();
  /// The bit after the one handed out last; null once the right bit has been passed, and from
  /// then on until first is called again.
  PortRecord* next();

 private:
  PortRecord m_Bit;
  int32_t m_Left;
  int32_t m_Right;
  int32_t m_Step;
};
