// Runs the extractor over fixture files and flattens the reported ports for comparison, or
// the VHDL reader over in-memory texts for the description of one unit.
#pragma once

#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <string>
#include <utility>
#include <vector>

#include "platform/scan.h"
#include "scan/common/diagnostics.h"
#include "scan/common/source_buffer.h"
#include "scan/vhdl/vhdl_reader.h"
#include "support/scratch_dir.h"

namespace vhdl_test {

/// tests/fixtures/vhdl/<name>, from the source tree.
inline std::string fixture(const std::string& name) {
  const char* root = std::getenv("PINFORGE_SOURCE_DIR");
  std::string here = __FILE__;
  std::string base =
      root ? std::string(root) + "/tests" : here.substr(0, here.rfind("/tests/") + 6);
  return base + "/fixtures/vhdl/" + name;
}

struct Port {
  std::string name;
  std::string type;
  int direction = 0;
  int line = 0;
  bool hasRange = false;
  int32_t left = 0;
  int32_t right = 0;
  bool ascending = false;

  bool operator==(const Port& o) const {
    return name == o.name && type == o.type && direction == o.direction && line == o.line &&
           hasRange == o.hasRange &&
           (!hasRange || (left == o.left && right == o.right && ascending == o.ascending));
  }
};

inline std::ostream& operator<<(std::ostream& os, const Port& p) {
  os << p.name << " : " << p.type << " dir " << p.direction << " line " << p.line;
  if (p.hasRange) os << " (" << p.left << (p.ascending ? " to " : " downto ") << p.right << ")";
  return os;
}

struct Run {
  bool found = false;
  std::vector<Port> ports;
  std::string messages;  ///< everything written to standard error
  int errors = 0;
};

/// Registers `files` (library, fixture name) in order, parses, looks `unit` up in "work"
/// with search mode 1 and collects its ports.
inline Run extract(const std::vector<std::pair<std::string, std::string>>& files,
                   const std::string& unit, bool fixtures = true) {
  Run run;
  testing::internal::CaptureStderr();
  {
    ScanExtractor extractor;
    for (const auto& [library, file] : files)
      extractor.addDesignFile(library.c_str(), (fixtures ? fixture(file) : file).c_str(),
                              ScanExtractor::Vhdl);
    run.errors = extractor.Parse(ScanExtractor::Vhdl);
    run.found = extractor.selectDesignUnit("work", unit.c_str(), ScanExtractor::SearchAllLibraries);
    ScanPortList* list = extractor.getPorts();
    for (const ScanPort* p = list->firstPort(); p != nullptr; p = list->nextPort(p)) {
      Port port{p->name(), p->typeName(), p->direction(), p->sourceLine(), p->hasRange()};
      if (p->hasRange()) {
        p->getBounds(port.left, port.right);
        port.ascending = p->isAscending() != 0;
      }
      run.ports.push_back(port);
    }
  }
  run.messages = testing::internal::GetCapturedStderr();
  return run;
}

/// A port without a range.
inline Port scalar(const char* name, const char* type, int direction, int line) {
  return Port{name, type, direction, line, false};
}

/// A port with a range.
inline Port ranged(const char* name, const char* type, int direction, int line, int32_t left,
                   const char* dir, int32_t right) {
  return Port{name, type, direction, line, true, left, right, std::string(dir) == "to"};
}

using Overrides = std::vector<std::pair<std::string, std::string>>;

struct Described {
  bool found = false;
  bool headerSound = false;  ///< what readUnit returned
  scan::UnitDescription unit;
  std::vector<ScanUnitInfo> units;
  std::string messages;
  size_t errors = 0;
  size_t warnings = 0;
};

/// Reads `texts` (file i is "f<i>.vhd" in library `libraries[i]`, work when not given) and
/// describes `unit` of work with `overrides` applied.
inline Described describe(const std::vector<std::string>& texts, const char* unit,
                          const Overrides& overrides = {},
                          const std::vector<std::string>& libraries = {}) {
  pinforge_test::FilePtr log(std::tmpfile());
  Described out;
  {
    scan::Diagnostics diagnostics(log.get());
    ScanSettings settings;
    settings.genericOverrides = overrides;
    scan::vhdl::VhdlReader reader(diagnostics, settings);
    for (size_t i = 0; i < texts.size(); ++i)
      reader.indexSource(scan::SourceBuffer::fromText("f" + std::to_string(i) + ".vhd", texts[i]),
                         i < libraries.size() ? libraries[i] : std::string("work"));
    out.found = reader.selectUnit("work", unit);
    if (out.found) out.headerSound = reader.readUnit(out.unit);
    out.units = reader.listUnits();
    out.errors = diagnostics.errorCount();
    out.warnings = diagnostics.warningCount();
  }
  out.messages = pinforge_test::readBack(log.get());
  return out;
}

}  // namespace vhdl_test
