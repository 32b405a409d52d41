// Turns a parsed unit into the extractor's ports: evaluates every range, flattens packed
// dimensions and applies the reporting rules below.
//
// Reporting rules:
// - One packed dimension over single bits is reported as written: [0:7] ascending, [7:0]
//   descending; equal bounds ([0:0], [3:3]) count as descending.
// - Several packed dimensions, packed structs, enums and typedefs of them are flattened to
//   [total-1:0]; atom types (int, byte, ...) report [width-1:0], except `integer`, which
//   reports no range (its callers read an integer range as a value range).
// - Unpacked dimensions are ignored: `logic [7:0] m [4]` reports [7:0].
// - Each port keeps its declared type as written; a non-ANSI port takes it from its direction
//   declaration, or from its net or variable declaration when the direction declaration
//   names no data type. Selects and concatenations have no written type: theirs is the
//   evaluated range ("[5:2]"), or empty.
// - A range that cannot be evaluated is a warning, and the port carries the reason and the fix.
// - Non-ANSI headers keep the header's order. `.p(x)` is port p with x's declaration;
//   `.p(x[3:0])` has x's direction and the range of the select; `.p({a, b})` is one port p as
//   wide as its members together, with the first member's direction. An unnamed
//   concatenation `{a, b}` reports each member as a port of its own.
#pragma once

#include <string>
#include <vector>

#include "platform/scan.h"
#include "scan/verilog/verilog_eval.h"
#include "scan/verilog/verilog_index.h"
#include "scan/verilog/verilog_unit.h"

namespace scan {
class Diagnostics;
class LineCounter;
}  // namespace scan

namespace scan::verilog {

/// What the fix in a range problem depends on.
struct RangeHints {
  std::vector<std::string> generics;         ///< the names `-g` can set
  std::vector<std::string> missingPackages;  ///< imported, but in no design file
};

std::vector<ScanPort> buildPorts(UnitModel& model, Evaluator& evaluator, const DesignIndex& index,
                                 Diagnostics& diagnostics, LineCounter& lines,
                                 const RangeHints& hints);

}  // namespace scan::verilog
