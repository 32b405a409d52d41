// libFuzzer entry for the VHDL reader: index arbitrary bytes, then read the ports of every
// entity found, so the index, the header parser, the evaluator and the interpreter all see
// the input.
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "scan/common/diagnostics.h"
#include "scan/common/source_buffer.h"
#include "scan/vhdl/vhdl_reader.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  scan::Diagnostics diagnostics(nullptr);
  scan::vhdl::VhdlReader reader(diagnostics);
  std::string text(reinterpret_cast<const char*>(data), size);
  reader.indexSource(scan::SourceBuffer::fromText("fuzz.vhd", std::move(text)), "work");
  std::vector<std::string> entities;
  for (const scan::vhdl::UnitRecord& unit : reader.index().units())
    if (unit.kind == scan::vhdl::UnitKind::Entity) entities.push_back(unit.name);
  for (const std::string& name : entities) {
    if (!reader.selectUnit("work", name)) continue;
    scan::UnitDescription unit;
    reader.readUnit(unit);
    ScanPortList ports(std::move(unit.ports));
    for (const ScanPort* p = ports.firstPort(); p != nullptr; p = ports.nextPort(p))
      if (p->name() == nullptr || p->typeName() == nullptr) __builtin_trap();
  }
  return 0;
}
