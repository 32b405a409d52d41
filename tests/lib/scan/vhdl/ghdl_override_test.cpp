// -g held against GHDL: after the same overrides, the bounds the extractor reports for the
// fixture entities are the ones GHDL elaborates with -gNAME=VALUE.
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "platform/scan.h"
#include "support/diff_tools.h"
#include "vhdl_test_support.h"

namespace {

using Overrides = std::vector<std::pair<std::string, std::string>>;

struct Case {
  const char* unit;
  Overrides overrides;
  std::vector<std::string> ports;
};

const Case kCases[] = {
    {"describe_open", {{"WIDTH", "3"}}, {"d", "q"}},
    {"describe_open", {{"width", "0"}, {"DEPTH", "7"}}, {"d", "q"}},
    {"describe_top", {{"XLEN", "64"}, {"HALF", "5"}}, {"data", "wide", "lower", "bus_d"}},
};

// An architecture `probe` of `unit` that reports "name left right" for each port.
std::string probeArchitecture(const std::string& unit, const std::vector<std::string>& ports) {
  std::string text = "architecture probe of " + unit + " is\nbegin\n  process begin\n";
  for (const std::string& p : ports)
    text += "    report \"" + p + " \" & integer'image(" + p + "'left) & \" \" & integer'image(" +
            p + "'right);\n";
  return text + "    wait;\n  end process;\nend architecture;\n";
}

// "name left right" for each port, in the order given.
std::vector<std::string> ourBounds(const Case& c) {
  ScanExtractor extractor;
  ScanSettings settings;
  settings.genericOverrides = c.overrides;
  extractor.configure(settings);
  for (const char* file : {"describe_pkg.vhd", "describe_top.vhd"})
    extractor.addDesignFile("work", vhdl_test::fixture(file).c_str(), ScanExtractor::Vhdl);
  extractor.Parse(ScanExtractor::Vhdl);
  std::vector<std::string> bounds;
  if (!extractor.selectDesignUnit("work", c.unit, ScanExtractor::SearchAllLibraries)) return bounds;
  ScanPortList* list = extractor.getPorts();
  for (const std::string& name : c.ports)
    for (const ScanPort* p = list->firstPort(); p != nullptr; p = list->nextPort(p)) {
      if (name != p->name()) continue;
      int32_t left = 0;
      int32_t right = 0;
      p->getBounds(left, right);
      bounds.push_back(p->hasRange()
                           ? name + " " + std::to_string(left) + " " + std::to_string(right)
                           : name + " no range");
    }
  return bounds;
}

TEST(GhdlOverrides, BoundsFollowGenericsSetOnTheCommandLine) {
  const std::string ghdl = difftest::findTool("ghdl");
  DIFFTEST_REQUIRE_TOOL(ghdl, "ghdl");
  difftest::ScratchDir dir;
  ASSERT_FALSE(dir.path().empty());
  ASSERT_TRUE(dir.write("probe_open.vhd", probeArchitecture("describe_open", kCases[0].ports)));
  ASSERT_TRUE(dir.write("probe_top.vhd", probeArchitecture("describe_top", kCases[2].ports)));
  const difftest::ToolRun analysis =
      difftest::runTool({ghdl, "-a", "--std=08", vhdl_test::fixture("describe_pkg.vhd"),
                         vhdl_test::fixture("describe_top.vhd"), "probe_open.vhd", "probe_top.vhd"},
                        dir.path());
  ASSERT_EQ(analysis.status, 0) << analysis.output;
  for (const Case& c : kCases) {
    std::vector<std::string> argv{ghdl, "--elab-run", "--std=08", c.unit, "probe"};
    for (const auto& [name, value] : c.overrides) argv.push_back("-g" + name + "=" + value);
    const difftest::ToolRun run = difftest::runTool(argv, dir.path());
    ASSERT_EQ(run.status, 0) << run.output;
    std::vector<std::string> theirs;
    const std::string note = "(report note): ";
    for (size_t at = run.output.find(note); at != std::string::npos;
         at = run.output.find(note, at)) {
      at += note.size();
      theirs.push_back(run.output.substr(at, run.output.find('\n', at) - at));
    }
    EXPECT_EQ(ourBounds(c), theirs) << c.unit << " " << c.overrides[0].first;
  }
}

}  // namespace
