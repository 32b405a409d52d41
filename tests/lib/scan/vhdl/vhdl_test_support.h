// Reads VHDL for a test through the VHDL reader, from fixture files or texts, and keeps what
// the tests compare: the selected unit's description, every unit listed and each message.
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

/// Design files as (library, file).
using Files = std::vector<std::pair<std::string, std::string>>;
using Overrides = std::vector<std::pair<std::string, std::string>>;

/// tests/fixtures/vhdl/<name> in the source tree.
inline std::string fixture(const std::string& name) {
  const char* root = std::getenv("PINFORGE_SOURCE_DIR");
  const std::string here = __FILE__;
  return (root ? std::string(root) + "/tests" : here.substr(0, here.rfind("/tests/") + 6)) +
         "/fixtures/vhdl/" + name;
}

/// Names a row of a parameterised table after its `label`.
struct ByLabel {
  template <class Row>
  std::string operator()(const testing::TestParamInfo<Row>& row) const {
    return row.param.label;
  }
};

/// "left to right", "left downto right", "unknown: why" or "-".
inline std::string rangeOf(const ScanPort& port) {
  if (port.rangeUnknown()) return "unknown: " + port.rangeProblem();
  if (!port.hasRange()) return "-";
  int32_t left = 0;
  int32_t right = 0;
  port.getBounds(left, right);
  return std::to_string(left) + (port.isAscending() ? " to " : " downto ") + std::to_string(right);
}

struct Read {
  bool found = false;
  bool headerSound = false;  ///< what readUnit returned
  scan::UnitDescription unit;
  std::vector<ScanUnitInfo> units;
  std::string messages;
  size_t errors = 0;
  size_t warnings = 0;

  /// "name(range)" per port, or "name" for one without a range, joined by blanks.
  std::string ranges() const {
    std::string out;
    for (const ScanPort& p : unit.ports)
      out += (out.empty() ? "" : " ") + std::string(p.name()) +
             (p.hasRange() ? "(" + rangeOf(p) + ")" : "");
    return out;
  }
};

/// Reads `files` in order; a file ending in ".vhd" is one of tests/fixtures/vhdl, anything
/// else is the text of a file named "f<i>.vhd". Then selects `unit` in work or else in the
/// first library that has it, in first-use order, and describes it with `overrides`.
inline Read read(const Files& files, const std::string& unit, const Overrides& overrides = {}) {
  pinforge_test::FilePtr log(std::tmpfile());
  Read out;
  {
    scan::Diagnostics diagnostics(log.get());
    ScanSettings settings;
    settings.genericOverrides = overrides;
    scan::vhdl::VhdlReader reader(diagnostics, settings);
    std::vector<std::string> libraries{"work"};
    for (size_t i = 0; i < files.size(); ++i) {
      const auto& [library, file] = files[i];
      if (file.ends_with(".vhd"))
        reader.indexFiles({{library, fixture(file)}});
      else
        reader.indexSource(scan::SourceBuffer::fromText("f" + std::to_string(i) + ".vhd", file),
                           library);
      libraries.push_back(library);
    }
    for (const std::string& library : libraries)
      if (!out.found) out.found = reader.selectUnit(library, unit);
    if (out.found) out.headerSound = reader.readUnit(out.unit);
    out.units = reader.listUnits();
    out.errors = diagnostics.errorCount();
    out.warnings = diagnostics.warningCount();
  }
  out.messages = pinforge_test::readBack(log.get());
  return out;
}

}  // namespace vhdl_test
