// The one way the Verilog reader tests read a design: fixtures and in-memory texts indexed as
// one compilation unit, one unit selected and described, and the first line of every message;
// and the loader of the case files (reader_cases.txt, description_cases.txt) they run over.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <optional>
#include <ostream>
#include <string>
#include <utility>
#include <vector>

#include "scan/common/diagnostics.h"
#include "scan/verilog/verilog_reader.h"
#include "support/case_file.h"
#include "support/scratch_dir.h"

namespace verilog_test {

/// Names a parameterised test after its parameter's `label`.
struct Label {
  template <class Param>
  std::string operator()(const testing::TestParamInfo<Param>& test) const {
    return test.param.label;
  }
};

/// The path of `relative` in the source tree.
inline std::string sourcePath(const std::string& relative) {
  const char* root = std::getenv("PINFORGE_SOURCE_DIR");
  return std::string(root ? root : ".") + "/" + relative;
}

/// The path of `name` under tests/fixtures/verilog.
inline std::string fixture(const std::string& name) {
  return sourcePath("tests/fixtures/verilog/" + name);
}

struct Input {
  std::vector<std::string> texts;  ///< indexed after the files as "t.v", "t1.v", ...
  const char* unit = "m";
  ScanSettings settings = {};
  std::vector<std::string> files = {};  ///< paths, indexed first
};

struct Read {
  bool found = false;
  bool ok = false;  ///< readUnit's verdict
  scan::UnitDescription unit;
  std::vector<std::string> units;     ///< "library kind name file:line" of the listing
  std::vector<std::string> messages;  ///< first line of every message
};

/// Reads `input` with every message kept; the unit is described only when it is found.
inline Read read(const Input& input) {
  Read result;
  pinforge_test::FilePtr sink(std::tmpfile());
  if (!sink) {
    ADD_FAILURE() << "no temporary file for the reader's messages";
    return result;
  }
  {
    scan::Diagnostics diagnostics(sink.get(), 1000);
    scan::verilog::VerilogReader reader(diagnostics, input.settings);
    std::vector<scan::DesignFileEntry> files;
    for (const std::string& path : input.files) files.push_back({"work", path});
    if (!files.empty()) reader.indexFiles(files);
    for (size_t i = 0; i < input.texts.size(); ++i)
      reader.indexText(i == 0 ? "t.v" : "t" + std::to_string(i) + ".v", input.texts[i], "work");
    result.found = reader.selectUnit("work", input.unit);
    if (result.found) result.ok = reader.readUnit(result.unit);
    for (const ScanUnitInfo& info : reader.listUnits())
      result.units.push_back(info.library + " " + info.kind + " " + info.name + " " +
                             info.file.substr(info.file.rfind('/') + 1) + ":" +
                             std::to_string(info.line));
  }
  result.messages = pinforge_test::messageHeads(pinforge_test::readBack(sink.get()));
  return result;
}

/// "[left:right]", or "" for a port without a range.
inline std::string bounds(const ScanPort& port) {
  if (!port.hasRange()) return "";
  int32_t left = 0;
  int32_t right = 0;
  port.getBounds(left, right);
  return "[" + std::to_string(left) + ":" + std::to_string(right) + "]";
}

/// "in", "out", "inout", "buffer", "linkage", "ref" or "interface"; "?" for anything else.
inline const char* directionName(int direction) {
  static const char* const names[] = {"?",      "in",      "out", "inout",
                                      "buffer", "linkage", "ref", "interface"};
  return direction >= 1 && direction <= 7 ? names[direction] : names[0];
}

/// "in byte a[7:0]": direction, type name when there is one, name and bounds, then " asc" for
/// ascending bounds and " ?" with the reason for a range that cannot be evaluated.
inline std::string portText(const ScanPort& port) {
  std::string text = directionName(port.direction()) + std::string(" ") + port.typeName();
  text += (text.back() == ' ' ? "" : " ") + std::string(port.name()) + bounds(port);
  if (port.hasRange() && port.isAscending()) text += " asc";
  if (port.rangeUnknown()) text += " ? " + port.rangeProblem();
  return text;
}

/// One design read and what it must give; "outcome" is in the form of the suite it is in.
struct Case {
  std::string label;
  std::vector<std::string> texts;
  std::string outcome;
  ScanSettings settings = {};
  std::vector<std::string> files = {};
  std::string unit = "m";

  Input input() const { return {texts, unit.c_str(), settings, files}; }
};

/// A failing case is named by its label, not dumped byte by byte.
inline void PrintTo(const Case& c, std::ostream* out) { *out << c.label; }

/// The cases of `name` in this folder, a file whose first lines describe its format; one
/// failing case when the file cannot be read.
inline std::vector<Case> casesFromFile(const std::string& name) {
  std::vector<pinforge_test::CaseBlock> blocks;
  if (!pinforge_test::readCaseFile("tests/lib/scan/verilog/" + name, blocks))
    return {{"CaseFile", {}, name + " cannot be read"}};
  std::vector<Case> cases;
  std::vector<Case> faults;
  for (const pinforge_test::CaseBlock& block : blocks) {
    Case& c = cases.emplace_back(Case{block.label, {""}, ""});
    std::string* into = &c.texts.back();
    for (const pinforge_test::CaseSection& section : block.sections) {
      const std::string& option = section.directive;
      const size_t equals = option.find('=');
      if (option == "next file") {
        into = &c.texts.emplace_back();
      } else if (option == "outcome") {
        into = &c.outcome;
      } else if (option.rfind("unit ", 0) == 0) {
        c.unit = option.substr(5);
      } else if (option.rfind("fixture ", 0) == 0) {
        c.files.push_back(fixture(option.substr(8)));
      } else if (option.rfind("-g ", 0) == 0) {
        c.settings.genericOverrides.emplace_back(option.substr(3, equals - 3),
                                                 option.substr(equals + 1));
      } else if (option.rfind("-D ", 0) == 0) {
        c.settings.macros.emplace_back(option.substr(3, equals - 3),
                                       equals == std::string::npos
                                           ? std::nullopt
                                           : std::optional<std::string>(option.substr(equals + 1)));
      } else if (!option.empty()) {
        faults.push_back({"CaseFileLine" + std::to_string(section.line),
                          {},
                          "--- " + option + ": not understood"});
      }
      // Option lines come before the text they qualify, which goes on where it was.
      *into += section.text;
    }
    // The outcome's lines are joined, not ended, by line breaks.
    if (!c.outcome.empty() && c.outcome.back() == '\n') c.outcome.pop_back();
    if (c.texts == std::vector<std::string>{""}) c.texts.clear();
  }
  cases.insert(cases.end(), faults.begin(), faults.end());
  return cases;
}

/// "ok" or "bad" (readUnit's verdict), each port's text after "; ", then each message on a
/// line of its own.
inline std::string outcome(const Read& result) {
  std::string out = result.ok ? "ok" : "bad";
  for (const ScanPort& port : result.unit.ports) out += "; " + portText(port);
  for (const std::string& message : result.messages) out += "\n" + message;
  return out;
}

}  // namespace verilog_test
